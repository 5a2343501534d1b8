// The error code of the process.
#include "platform.h"

namespace {

int g_code = ERR_NONE;

}  // namespace

void PLIBCErrSet(int code) {
  g_code = code;
}

int PLIBCErrGet(void) {
  return g_code;
}
