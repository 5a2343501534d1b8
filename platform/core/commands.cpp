// Running a program.
#include "platform/base/failure.h"
#include "platform/base/program.h"

int PLIBCExec(const char* szPath, const char* szArg1, const char* szArg2, const char* szArg3, const char* szArg4) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  const char* argv[] = {szPath, szArg1, szArg2, szArg3, szArg4, nullptr};

  Result<int> exitStatus = RunProgram(argv, Standard::kInherited);
  if (!exitStatus.ok()) {
    FAIL(exitStatus.error(), "Failed to run %s", szPath);
    return PLIBCErrSet(ERR_COMMAND_FAILED), -1;
  }
  return *exitStatus;
}
