// How the program ends.
#ifndef MERO_TOOLS_FAILURE_H
#define MERO_TOOLS_FAILURE_H

#include <algorithm>
#include <iterator>
#include <stdexcept>
#include <string>
#include <string_view>

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

// What an exit status means: as a word for machines, and in the help.
struct ExitMeaning {
  std::string_view word;
  std::string_view text;
  Exit exit;
};

// Each status has a row here, one in docs/json.md and one in the manual.
inline constexpr ExitMeaning kExitMeanings[] = {
    {"done", "done", Exit::kDone},
    {"failed", "failed", Exit::kFailed},
    {"wrong-usage", "wrong usage", Exit::kUsage},
    {"no-adapter", "no adapter", Exit::kNoAdapter},
    {"out-of-range", "no such network or out of range", Exit::kOutOfRange},
    {"secret-refused", "secret refused", Exit::kSecretRefused},
    {"radio-off", "radio switched off", Exit::kRadioOff},
    {"no-address", "no address yet", Exit::kNoLease},
    {"busy", "busy", Exit::kBusy},
    {"timed-out", "timed out", Exit::kTimedOut},
    {"unsupported", "protected in a way that cannot be joined", Exit::kUnsupported},
    {"interrupted", "interrupted", Exit::kInterrupted},
};

inline std::string_view WordOf(Exit exit) {
  const auto* found = std::ranges::find(kExitMeanings, exit, &ExitMeaning::exit);
  return found != std::end(kExitMeanings) ? found->word : "failed";
}

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
