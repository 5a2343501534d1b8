// Where an errno becomes the error code and a line in the system log: at the boundary of an operation, and only there.
#ifndef MERO_PLATFORM_ERROR_H
#define MERO_PLATFORM_ERROR_H

#include <cerrno>

#include "common/log.h"
#include "platform.h"

// The error code of an errno.
int CodeOfError(int error);

// Sets the error code and reports "Failed to VERB SUBJECT: reason"; both are texts. An expression without a value.
#define FAIL(error, verb, subject) \
  (PLIBCErrSet(CodeOfError(error)), errno = (error), LOG("Failed to %s %s: %m", verb, subject))

// Refuses a null argument.
#define REFUSE_NULL() (PLIBCErrSet(ERR_BAD_PARAMETERS), LOG("Bad parameters"))

#endif  // MERO_PLATFORM_ERROR_H
