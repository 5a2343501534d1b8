// Failures of operations. Here, and only here, an errno becomes the error code and a line in the system log.
#ifndef MERO_PLATFORM_FAILURE_H
#define MERO_PLATFORM_FAILURE_H

#include <cerrno>

#include "common/log.h"
#include "platform.h"

// Sets the error code of a failure, and gives its reason.
const char* NoteFailure(int error);

// Reports `format` with its values and, behind them, the reason of the failure, whose error code it sets. An expression
// without a value, as is the next one.
#define FAIL(error, format, ...) LOG(format ": %s" __VA_OPT__(, ) __VA_ARGS__, NoteFailure(error))

// Refuses a null argument: sets the error code, and reports.
#define REFUSE_NULL() RefuseNull(TextOfUnit<__FILE_NAME__>(), __LINE__)
void RefuseNull(const char* szUnit, int line);

#endif  // MERO_PLATFORM_FAILURE_H
