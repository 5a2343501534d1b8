// Tells whether the user has switched the radio off in the access-point settings.
#include <cstring>

#include "common/paths.h"
#include "holders.h"
#include "platform.h"
#include "wireless.h"

namespace {

enum Answer : int { kUnknown = -1, kBlocked = 0, kUsable = 1 };

Answer AnswerOfSection(PPLIBSZHASH pshSection) {
  const char* szUnblock = PLIBCSzHashGetValue(pshSection, "unblock");
  if (szUnblock == nullptr) return kUnknown;
  return std::strcmp(szUnblock, "no") == 0 ? kBlocked : kUsable;
}

}  // namespace

int MEROWirelessCheckBlock(void) {
  if (PLIBCFileExist(kApSettingsPath) == 0) return kUsable;

  char szProduct[1024] = {};
  if (PLIBCFileGetKeyValue(kAdapterInfoPath, kProductKey, szProduct, sizeof szProduct, 0) <= 0) {
    return PLIBCErrSet(ERR_FILE_NOT_FOUND), kUnknown;
  }
  Hash section;
  if (!section) return kUnknown;
  if (PLIBCFileGetSection(kApSettingsPath, szProduct, section.address()) <= 0) return kUsable;
  return AnswerOfSection(section.get());
}
