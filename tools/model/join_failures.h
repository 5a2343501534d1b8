// Why networks are not joined.
#ifndef MERO_TOOLS_JOIN_FAILURES_H
#define MERO_TOOLS_JOIN_FAILURES_H

#include <string>

#include "base/failure.h"
#include "work/supplicant.h"

// The library can join no network that is protected so.
Failure Unsupported(const std::string& name);

// Why an attempt of the library failed, by its reports and by what the supplicant said.
Failure JoinFailed(const std::string& name, Verdict verdict);

// Something of a connection has stayed.
Failure NotEnded();

#endif  // MERO_TOOLS_JOIN_FAILURES_H
