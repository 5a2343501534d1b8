// Names the settings section of the adapter that is plugged in.
#include "common/log.h"
#include "common/paths.h"
#include "platform.h"
#include "wireless.h"

BOOL MEROWirelessApConfigSecNameGet(char* szSecName, size_t cbSize) {
  if (szSecName == nullptr) return LOG("Bad parameter."), FALSE;
  if (PLIBCFileExist(kAdapterInfoPath) == 0) return LOG("File[%s] does not exist.", kAdapterInfoPath), FALSE;
  return PLIBCFileGetKeyValue(kAdapterInfoPath, kProductKey, szSecName, cbSize, 0) > 0 ? TRUE : FALSE;
}
