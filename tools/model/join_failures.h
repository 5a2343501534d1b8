// Why networks are not joined.
#ifndef MERO_TOOLS_JOIN_FAILURES_H
#define MERO_TOOLS_JOIN_FAILURES_H

#include <algorithm>
#include <string>
#include <vector>

#include "base/failure.h"
#include "base/text.h"
#include "model/library.h"
#include "work/program.h"
#include "work/supplicant.h"

// The library can join no network that is protected so.
Failure Unsupported(const std::string& name);

// The same of an access point in range, with how it is protected, where the listing tool tells.
Failure Unsupported(const Program& program, const Network& accessPoint);

// Fails when an access point, or a network as it was saved, cannot be joined whatever its secret.
void RequireJoinable(const Program& program, const Network& network);

// Fails when the supplicant cannot be told of a network: in its settings a '#' behind an odd number of '"' begins a
// comment, and the text before it, which is left, is another network's name or secret.
void RequireTellable(const Program& program, const KnownNetwork& config);

// Why an attempt of the library failed, by its reports and by what the supplicant said.
Failure JoinFailed(const std::string& name, Verdict verdict);

// A join that has failed since an access point refused the secret, or did not answer in time.
class NotLetIn : public Failure {
 public:
  NotLetIn(const Failure& failure, const std::vector<Address>& by) : Failure(failure), by_(by) {}

  // Whether it was another one than these, or one of those that did not answer. The supplicant may not have told.
  bool IsByStranger(const std::vector<Network>& known) const {
    return std::ranges::any_of(by_, [&](const Address& by) {
      return std::ranges::none_of(
          known, [&](const Network& accessPoint) { return std::ranges::equal(by, accessPoint.bssid); });
    });
  }

 private:
  std::vector<Address> by_;
};

// Something of a connection has stayed.
Failure NotEnded();

#endif  // MERO_TOOLS_JOIN_FAILURES_H
