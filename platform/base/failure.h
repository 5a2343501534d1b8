// Where an errno becomes the error code and a line in the system log: at the boundary of an operation, and only there.
#ifndef MERO_PLATFORM_FAILURE_H
#define MERO_PLATFORM_FAILURE_H

#include <cerrno>

#include "common/log.h"
#include "platform.h"

// The error code of an errno.
int CodeOfError(int error);

// Where in the source something is reported.
struct SourcePlace {
  const char* szUnit;
  int line;
};
#define HERE (SourcePlace{TextOfUnit<__FILE_NAME__>(), __LINE__})

// Functions, since there are many places to report from.
void ReportFailure(SourcePlace place, int error, const char* szVerb, const char* szSubject);
void ReportNull(SourcePlace place);

// Sets the error code and reports "Failed to VERB SUBJECT: reason"; both are texts. An expression without a value.
#define FAIL(error, verb, subject) ReportFailure(HERE, error, verb, subject)

// Refuses a null argument.
#define REFUSE_NULL() ReportNull(HERE)

#endif  // MERO_PLATFORM_FAILURE_H
