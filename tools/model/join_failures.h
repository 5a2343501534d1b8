// Why networks are not joined.
#ifndef MERO_TOOLS_JOIN_FAILURES_H
#define MERO_TOOLS_JOIN_FAILURES_H

#include <string>

#include "base/failure.h"
#include "model/library.h"
#include "work/program.h"
#include "work/supplicant.h"

// The library can join no network that is protected so.
Failure Unsupported(const std::string& name);

// The same of an access point in range, with how it is protected, where the listing tool tells.
Failure Unsupported(const Program& program, const Network& accessPoint);

// Fails when an access point, or a network as it was saved, cannot be joined whatever its secret.
void RequireJoinable(const Program& program, const Network& network);

// Why an attempt of the library failed, by its reports and by what the supplicant said.
Failure JoinFailed(const std::string& name, Verdict verdict);

// Something of a connection has stayed.
Failure NotEnded();

#endif  // MERO_TOOLS_JOIN_FAILURES_H
