// How the program ends.
#ifndef MERO_TOOLS_FAILURE_H
#define MERO_TOOLS_FAILURE_H

#include <stdexcept>
#include <string>

// Exit codes are part of the interface: scripts depend on them.
enum class Exit : int {
  kDone = 0,
  kFailed = 1,
  kUsage = 2,
  kNoAdapter = 3,
  kOutOfRange = 4,  // no such network, or not in range
  kSecretRefused = 5,
  kRadioOff = 6,
  kNoLease = 7,  // joined; the appliance goes on asking for an address
  kBusy = 8,     // the adapter is used otherwise
  kTimedOut = 9,
  kUnsupported = 10,  // protected in a way that cannot be joined
  kInterrupted = 130,
};

// A failure that the user is told about: what happened, and what to do next.
class Failure : public std::runtime_error {
 public:
  Failure(Exit exit, const std::string& what, std::string advice)
      : std::runtime_error(what), exit_(exit), advice_(std::move(advice)) {}

  Exit exit() const { return exit_; }
  const std::string& advice() const { return advice_; }

 private:
  Exit exit_;
  std::string advice_;
};

// A failure of the command line: the arguments ask for something impossible.
inline Failure Wrong(const std::string& what, const std::string& advice) {
  return {Exit::kUsage, what, advice};
}

// Thrown when a signal ends the program while it waits.
struct Interrupted {};

#endif  // MERO_TOOLS_FAILURE_H
