// The appliance's media service.
#include <iterator>

#include "platform/base/failure.h"

namespace {

constexpr char kScript[] = "/etc/rc.mediaservice";
constexpr const char* kVerbs[] = {"stop", "start", "restart"};

}  // namespace

int MEROMediaService(int action) {
  if (action < 0 || action >= static_cast<int>(std::size(kVerbs))) {
    return LOG("There is no action %d of the media service", action), PLIBCErrSet(ERR_BAD_PARAMETERS), -1;
  }
  if (PLIBCFileExist(kScript) == 0) return FAIL(ENOENT, "Failed to find the media service %s", kScript), -1;
  const int exitStatus = PLIBCExec(kScript, kVerbs[action], nullptr, nullptr, nullptr);
  if (exitStatus <= 0) return exitStatus;
  LOG("%s %s ended with status %d", kScript, kVerbs[action], exitStatus);
  return PLIBCErrSet(ERR_COMMAND_FAILED), -1;
}
