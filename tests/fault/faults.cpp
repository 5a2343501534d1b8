// Every fault that a call can meet.
#include "tests/fault/faults.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>

#include "tests/fault/commands.h"
#include "tests/fault/judge.h"
#include "tests/fault/scene.h"
#include "tests/support/files.h"

namespace {

// In memory that a child has in common with this process.
struct Shared {
  MemoryOutcome memory;
  char szTold[4096];  // what the driver was told, a line each
};

Shared* SharedMemory() {
  static void* const shared =
      ::mmap(nullptr, sizeof(Shared), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
  return static_cast<Shared*>(shared);
}

// Nothing is said on standard error for as long as the holder lives, by shells without their commands above all.
class Silence {
 public:
  Silence() : stderr_(::fcntl(STDERR_FILENO, F_DUPFD_CLOEXEC, 0)) {
    const int nowhere = ::open("/dev/null", O_WRONLY | O_CLOEXEC);
    ::dup2(nowhere, STDERR_FILENO);
    ::close(nowhere);
  }
  Silence(const Silence&) = delete;
  Silence& operator=(const Silence&) = delete;
  ~Silence() {
    ::dup2(stderr_, STDERR_FILENO);
    ::close(stderr_);
  }

 private:
  int stderr_;
};

// A call's machine, and the faults that the call meets on it.
class Trial {
 public:
  Trial(const Subject& subject, const Share& share)
      : subject_(subject), share_(share), scene_(subject.prepare), judge_(subject.contract, tally_) {
    for (const std::string& command : subject_.contract.commands) {
      EXPECT_TRUE(KeepProgram(command)) << command << " is not there";
    }
    base_ = StateOfMachine();
    Watch();
  }

  Tally Run() {
    FailAllocations();
    FailCalls();
    FailCommands();
    Kill();
    if (share_.most == 0) judge_.LoseUnneeded();
    LoseUnmet();
    return std::move(tally_);
  }

 private:
  // ---- One call ----

  Seen Call(const Fault& fault) {
    if (subject_.renew) subject_.renew();
    TakeCommands();
    Seen seen;
    Shared* const shared = SharedMemory();
    *shared = {};
    seen.outcome = RunSupervised(fault.plan, [&] {
      shared->memory = RunWithoutMemory(
          fault.allocation, [&] { return static_cast<int>(subject_.call()); }, fault.allocationsBehind);
      NoteTold(*shared);
      return shared->memory.result;
    });
    seen.answer = static_cast<Answer>(seen.outcome.result);
    seen.memory = shared->memory;
    seen.commands = TakeCommands();
    AddTold(*shared, seen.commands);
    return seen;
  }

  // In the child, in which the driver is.
  void NoteTold(Shared& shared) const {
    size_t size = 0;
    for (const std::string& told : scene_.told()) {
      const int more = std::snprintf(shared.szTold + size, sizeof shared.szTold - size, "driver %s\n", told.c_str());
      size = std::min(size + static_cast<size_t>(more), sizeof shared.szTold - 1);
    }
  }

  static void AddTold(const Shared& shared, std::vector<std::string>& commands) {
    std::string_view rest = shared.szTold;
    for (size_t feed; (feed = rest.find('\n')) != std::string_view::npos; rest.remove_prefix(feed + 1)) {
      commands.emplace_back(rest.substr(0, feed));
    }
  }

  Seen CallUndisturbed() {
    Fault none;
    none.plan.withoutSleeps = true;
    none.plan.all = true;
    Seen seen = Call(none);
    seen.state = Comparable(StateOfMachine());
    return seen;
  }

  // Looks at the files before each system call of a call without a fault, and behind it.
  void Watch() {
    judge_.Begin(base_);
    Fault watched;
    watched.plan = {.interference = Interference::kWatch,
                    .meanwhile = [this] { judge_.Note(Comparable(StateOfMachine())); },
                    .withoutSleeps = true,
                    .all = true};
    Seen seen = Call(watched);
    seen.state = Comparable(StateOfMachine());
    judge_.Note(seen.state);
    judge_.Learn(seen);
    calls_ = seen.outcome.before;
    allocations_ = seen.memory.made;
    for (const SystemCall& call : calls_) tally_.names.insert(call.name);
  }

  // ---- All faults ----

  // Every so many of `count` faults of a kind are tried.
  size_t StepOf(size_t count) const {
    const auto most = static_cast<size_t>(share_.most);
    return most == 0 ? 1 : std::max<size_t>((count + most - 1) / most, 1);
  }

  void FailAllocations() {
    const auto count = static_cast<size_t>(allocations_);
    for (size_t n = 1; n <= count; n += StepOf(count)) {
      for (const bool behind : {false, true}) {
        Fault fault{"allocation " + std::to_string(n) + " fails" + (behind ? ", and all behind it" : "")};
        fault.allocation = static_cast<int>(n);
        fault.allocationsBehind = behind;
        Try(fault, tally_.allocations);
      }
    }
  }

  std::string Tell(size_t i) const { return "call " + std::to_string(i + 1) + " (" + calls_[i].name + ")"; }

  void FailCalls() {
    for (size_t i = 0; i < calls_.size(); i += StepOf(calls_.size())) {
      const std::vector<int>& errors = ErrorsOf(calls_[i].name);
      if (share_.most == 0) {
        FailCallInEveryWay(i, errors);
      } else if (!errors.empty()) {
        FailCall(i, errors[i % errors.size()], false);
      }
    }
  }

  void FailCallInEveryWay(size_t i, const std::vector<int>& errors) {
    for (const int error : errors) {
      FailCall(i, error, false);
      FailCall(i, error, true);
    }
    if (calls_[i].number != SYS_read && calls_[i].number != SYS_write) return;
    Fault fault{Tell(i) + " is short"};
    fault.plan = {.interference = Interference::kShorten, .call = static_cast<int>(i) + 1};
    Try(fault, tally_.calls);
  }

  void FailCall(size_t i, int error, bool onwards) {
    if (onwards && error == EINTR) return;  // nobody is interrupted for ever
    Fault fault{Tell(i) + " fails: " + std::strerror(error) + (onwards ? ", and all behind it" : "")};
    fault.plan = {.interference = Interference::kFail, .call = static_cast<int>(i) + 1, .error = error};
    fault.plan.onwards = onwards;
    Try(fault, tally_.calls);
  }

  void FailCommands() {
    constexpr CommandFault kKinds[] = {CommandFault::kFails, CommandFault::kTakesLong, CommandFault::kIsMissing,
                                       CommandFault::kNeverEnds};
    size_t number = 0;
    for (const std::string& command : subject_.contract.commands) {
      for (size_t i = 0; i < std::size(kKinds); ++i) {
        if (share_.most == 0 || i == number % std::size(kKinds)) FailCommand(command, kKinds[i]);
      }
      ++number;
    }
  }

  void FailCommand(const std::string& command, CommandFault kind) {
    constexpr const char* kTexts[] = {"", " fails", " takes long", " never ends", " is missing"};
    const bool waits = subject_.contract.Find(Exception::kWaits, command) != nullptr;
    if (kind == CommandFault::kNeverEnds && !waits && share_.most != 0) return;  // it takes as long as its limit
    Fault fault{command + kTexts[static_cast<int>(kind)]};
    fault.command = command;
    fault.commandFault = kind;
    // Without a call for so long, a call is taken to wait for ever where its contract says that it may. Elsewhere it
    // has all the time that its own limits may take.
    if (kind == CommandFault::kNeverEnds && waits) fault.plan.patience = 2000;
    Try(fault, tally_.commands);
  }

  void Kill() {
    for (size_t i = 0; i < calls_.size(); i += StepOf(calls_.size())) {
      Fault fault{"killed at " + Tell(i)};
      fault.plan = {.interference = Interference::kKill, .call = static_cast<int>(i) + 1};
      Try(fault, tally_.kills);
      if (calls_[i].name != "write") continue;
      fault.text = "killed in the middle of " + Tell(i);
      fault.plan.interference = Interference::kTearWrite;
      Try(fault, tally_.kills);
    }
  }

  // Calls that wait make another number of system calls each time, so that some faults come too late. Those that are
  // not met for any other reason would be tried, and lost, by nobody.
  void LoseUnmet() {
    constexpr int kMostOfThem = 5;  // as a part of all
    if (tally_.unmet * kMostOfThem <= tally_.faults()) return;
    tally_.losses.push_back(std::to_string(tally_.unmet) + " faults were not met, beside " +
                            std::to_string(tally_.faults()) + " that were");
  }

  // ---- One fault ----

  void Try(Fault fault, int& count) {
    fault.plan.withoutSleeps = true;
    fault.plan.all = true;
    if (fault.plan.call != 0) fault.plan.expected = calls_[static_cast<size_t>(fault.plan.call) - 1].name;
    // A call that a signal interrupts is made once more, so that those behind it have other numbers.
    for (int tries = 3; tries > 0; --tries) {
      if (TryOnce(fault, count)) return;
    }
    ++tally_.unmet;
  }

  // False when the call took a way on which there is no such system call.
  bool TryOnce(const Fault& fault, int& count) {
    Restore(base_);
    Seen seen = CallBroken(fault);
    const bool met = fault.plan.call != 0 ? seen.outcome.reached : fault.allocation == 0 || seen.memory.failed;
    if (!met) return false;
    seen.state = Comparable(StateOfMachine());
    ++count;
    judge_.JudgeCall(fault, seen);
    CheckNextCalls(fault, seen);
    return true;
  }

  Seen CallBroken(const Fault& fault) {
    const BrokenCommand broken(fault);
    return Call(fault);
  }

  // ---- The next call ----

  // What the next call comes to follows from the state that it finds: it is made once for each.
  void CheckNextCalls(const Fault& fault, const Seen& seen) {
    const auto [known, isNew] = next_.try_emplace(HashOf(seen.state));
    if (isNew) known->second = MakeNextCalls(seen.state);
    judge_.Count(fault.text, known->second);
  }

  Judge::Next MakeNextCalls(const MachineState& state) {
    Judge::Next next;
    const std::pair<Exception, Answer> markers[] = {{Exception::kRefused, Answer::kFailed},
                                                    {Exception::kPassedOver, Answer::kDone}};
    for (const auto& [exception, answer] : markers) {
      if (!judge_.IsMarkerThere(state, exception)) continue;
      judge_.JudgeMarked(CallUndisturbed(), exception, answer, next);
    }
    judge_.JudgeNext(CallUndisturbed(), next);
    return next;
  }

  static size_t HashOf(const MachineState& state) {
    std::string all;
    for (const auto& [path, described] : state) all += path + '\0' + described + '\0';
    return std::hash<std::string>()(all);
  }

  const Subject& subject_;
  const Share share_;
  const Scene scene_;
  const Silence silence_;
  Tally tally_;
  Judge judge_;
  MachineState base_;
  std::map<size_t, Judge::Next> next_;  // behind each state
  std::vector<SystemCall> calls_;
  int allocations_ = 0;
};

}  // namespace

Tally TryFaults(const Subject& subject, const Share& share) {
  return Trial(subject, share).Run();
}
