// Every fault that an exported function can meet, and what becomes of it.
#include "tests/fault/faults.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <regex>

#include "tests/fault/contracts.h"
#include "tests/fault/failing_memory.h"
#include "tests/fault/machine_state.h"
#include "tests/support/files.h"

namespace fs = std::filesystem;

namespace {

enum class CommandFault { kNone, kFails, kHangs, kIsMissing };

// One fault, by what brings it about.
struct Fault {
  std::string text;
  Plan plan = {};
  int allocation = 0;
  bool allocationsBehind = false;
  std::string command = {};
  CommandFault commandFault = CommandFault::kNone;
};

// What has become of a call.
struct Seen {
  Outcome outcome;
  Answer answer = Answer::kWrong;
  MemoryOutcome memory;
  MachineState state;
};

// In memory that a child has in common with this process.
MemoryOutcome* SharedMemoryOutcome() {
  static void* const shared =
      ::mmap(nullptr, sizeof(MemoryOutcome), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
  return static_cast<MemoryOutcome*>(shared);
}

bool IsLock(const std::string& path) {
  const std::string name = fs::path(path).filename();
  return name.starts_with('.') && name.ends_with(".lock");
}

bool IsUnfinished(const std::string& path) {
  const std::string name = fs::path(path).filename();
  return name.starts_with('.') && name.ends_with(".new");
}

// A text in which all numbers are the same. The first network has no address to be pinned.
std::string WithoutNumbers(const std::string& text) {
  static const std::regex pinned("\tbssid=[0-9:]+\n");
  static const std::regex number("[0-9]+");
  return std::regex_replace(std::regex_replace(text, pinned, ""), number, "#");
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

// The files of which one has what the other has not, or otherwise.
std::vector<std::string> Differences(const MachineState& a, const MachineState& b) {
  std::vector<std::string> paths;
  for (const auto& [path, described] : a) {
    const auto other = b.find(path);
    if (other == b.end() || other->second != described) paths.push_back(path);
  }
  for (const auto& [path, described] : b) {
    if (!a.contains(path)) paths.push_back(path);
  }
  return paths;
}

// A function's machine, and the faults that the function meets on it.
class Trial {
 public:
  Trial(const Exported& function, const Share& share)
      : function_(function), contract_(ContractOf(function.szName)), share_(share), scene_(function) {
    for (const std::string& command : contract_.commands) {
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
    Restore(base_);
    return std::move(tally_);
  }

 private:
  // ---- One call ----

  Seen Call(const Fault& fault) {
    Seen seen;
    MemoryOutcome* const shared = SharedMemoryOutcome();
    *shared = {};
    seen.outcome = RunSupervised(fault.plan, [&] {
      *shared = RunWithoutMemory(
          fault.allocation, [&] { return static_cast<int>(function_.call()); }, fault.allocationsBehind);
      return shared->result;
    });
    seen.answer = static_cast<Answer>(seen.outcome.result);
    seen.memory = *shared;
    return seen;
  }

  Seen CallUndisturbed() {
    Fault none;
    none.plan.withoutSleeps = true;
    none.plan.all = true;
    Seen seen = Call(none);
    seen.state = WithoutTimes(StateOfMachine());
    return seen;
  }

  // Looks at the files before each system call of a call without a fault, and behind it.
  void Watch() {
    Fault watched;
    watched.plan = {.interference = Interference::kWatch,
                    .meanwhile = [this] { NoteContents(); },
                    .withoutSleeps = true,
                    .all = true};
    const Seen seen = Call(watched);
    NoteContents();
    good_ = WithoutTimes(StateOfMachine());
    calls_ = seen.outcome.before;
    allocations_ = seen.memory.made;
    for (const SystemCall& call : calls_) tally_.names.insert(call.name);
    if (seen.answer != Answer::kDone) Lose("without a fault", "it has not done its work" + ReportsOf(seen));
    CheckNothingHeld("without a fault", seen);
    if (CountUnflushed() > (Excused(Exception::kUnflushed) ? 1 : 0)) {
      Lose("without a fault", "a file was put into its place, and it or its directory was not flushed");
    }
  }

  // How many files are renamed before what was written to them was flushed, or without a flush behind it.
  int CountUnflushed() const {
    int unflushed = 0;
    bool written = false;
    bool renamed = false;
    for (const SystemCall& call : calls_) {
      if (call.name == "write") written = true;
      if (call.name == "fsync") written = renamed = false;
      if (call.name != "rename") continue;
      if (written || renamed) ++unflushed;
      renamed = !written;
      written = false;
    }
    return unflushed + (renamed ? 1 : 0);
  }

  void NoteContents() {
    const MachineState now = WithoutTimes(StateOfMachine());
    for (const auto& [path, described] : now) contents_[path].insert(described);
    // Those that were not there yet, or are not any more.
    for (auto& [path, all] : contents_) {
      if (!now.contains(path)) all.insert("");
    }
    for (const auto& [path, described] : now) {
      if (looked_ && !before_.contains(path)) contents_[path].insert("");
    }
    before_ = now;
    looked_ = true;
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
    const struct {
      CommandFault fault;
      const char* szText;
    } kinds[] = {{CommandFault::kFails, " fails"},
                 {CommandFault::kHangs, " hangs for a while"},
                 {CommandFault::kIsMissing, " is missing"}};
    size_t number = 0;
    for (const std::string& command : contract_.commands) {
      for (const auto& kind : kinds) {
        if (number++ % StepOf(contract_.commands.size() * 3) != 0) continue;
        Fault fault{command + kind.szText};
        fault.command = command;
        fault.commandFault = kind.fault;
        Try(fault, tally_.commands);
      }
    }
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

  // ---- One fault ----

  void Try(Fault fault, int& count) {
    fault.plan.withoutSleeps = true;
    fault.plan.all = true;
    if (fault.plan.call != 0) fault.plan.expected = calls_[static_cast<size_t>(fault.plan.call) - 1].name;
    // A call that a signal interrupts is made once more, so that those behind it have other numbers.
    for (int tries = 3; tries > 0 && !TryOnce(fault, count); --tries) Mend(fault);
  }

  // False when the function took a way on which there is no such call.
  bool TryOnce(const Fault& fault, int& count) {
    Restore(base_);
    Break(fault);
    Seen seen = Call(fault);
    const bool met = fault.plan.call != 0 ? seen.outcome.reached : fault.allocation == 0 || seen.memory.failed;
    if (!met) return false;
    Mend(fault);
    seen.state = WithoutTimes(StateOfMachine());
    ++count;
    Judge(fault, seen);
    CheckNextCalls(fault, seen);
    return true;
  }

  void Break(const Fault& fault) {
    // Not for the shell by its common name, which may be the program that is broken.
    if (fault.commandFault == CommandFault::kFails) WriteText(fault.command, "#!/bin/dash\nexit 1\n", 0755);
    if (fault.commandFault == CommandFault::kHangs) {
      fs::copy_file(fault.command, kSlowCommand);
      WriteText(fault.command, std::string("#!/bin/dash\nsleep 0.3\nexec ") + kSlowCommand + " \"$@\"\n", 0755);
    }
    if (fault.commandFault == CommandFault::kIsMissing) fs::remove(fault.command);
  }

  void Mend(const Fault& fault) {
    if (fault.commandFault == CommandFault::kNone) return;
    fs::remove(kSlowCommand);
    const std::string& described = base_.at(fault.command);
    WriteText(fault.command, ContentIn(base_, fault.command), static_cast<mode_t>(std::stoul(described, nullptr, 8)));
  }

  // ---- Judging ----

  void Judge(const Fault& fault, const Seen& seen) {
    CheckFiles(fault, seen);
    if (seen.outcome.hung) return Lose(fault.text, "it came to no end");
    if (seen.outcome.killed) {
      if (fault.plan.interference != Interference::kKill && fault.plan.interference != Interference::kTearWrite) {
        Lose(fault.text, "it crashed");
      }
      ++tally_.cutShort;
      return;
    }
    CheckNothingHeld(fault.text, seen);
    switch (seen.answer) {
      case Answer::kDone:
        return JudgeSuccess(fault, seen);
      case Answer::kLess:
        ++tally_.less;
        if (!Excused(Exception::kLess)) Lose(fault.text, "it succeeded with less" + ReportsOf(seen));
        return;
      case Answer::kFailed:
        ++tally_.failed;
        return CheckReported(fault, seen);
      case Answer::kWrong:
        return Lose(fault.text, "a wrong result" + ReportsOf(seen));
    }
  }

  void JudgeSuccess(const Fault& fault, const Seen& seen) {
    const std::vector<std::string> different = Changed(seen.state, good_);
    if (different.empty()) {
      ++tally_.done;
      return;
    }
    ++tally_.less;
    if (Changed(seen.state, WithoutTimes(base_)).empty() && Excused(Exception::kNothingTried)) return;
    for (const std::string& path : different) {
      if (IsOfAnother(path, seen.state) || IsNarrower(path, seen.state) || IsLeft(fault, path)) continue;
      if (Excused(Exception::kUnnoticed, path)) continue;
      if (!seen.outcome.reports.empty() && Excused(Exception::kTolerates, path)) continue;
      Lose(fault.text, "it succeeded, and " + path + " is " + TextOf(seen.state, path) + ReportsOf(seen));
    }
  }

  // The differences between two states, less what may be left over until the next call.
  static std::vector<std::string> Changed(const MachineState& state, const MachineState& than) {
    std::vector<std::string> paths = Differences(state, than);
    std::erase_if(paths, [](const std::string& path) { return IsLock(path) || IsUnfinished(path); });
    return paths;
  }

  void CheckReported(const Fault& fault, const Seen& seen) {
    if (seen.outcome.reports.empty()) {
      if (!Excused(Exception::kSilent)) Lose(fault.text, "it failed without a report");
      return;
    }
    const std::string unit = std::string(contract_.szUnit) + ":";
    const auto own = std::find_if(seen.outcome.reports.rbegin(), seen.outcome.reports.rend(),
                                  [&](const std::string& report) { return report.starts_with(unit); });
    if (own == seen.outcome.reports.rend()) {
      if (!Excused(Exception::kBelow) && !Excused(Exception::kSilent)) {
        Lose(fault.text, "nobody has reported that it failed" + ReportsOf(seen));
      }
      return;
    }
    const std::string text = own->substr(own->find(' ') + 1);
    const auto begins = [&](const std::string& beginning) { return text.starts_with(beginning); };
    if (!std::ranges::any_of(contract_.failures, begins) && !Excused(Exception::kSilent)) {
      Lose(fault.text, "a failure that is not documented" + ReportsOf(seen));
    }
  }

  void CheckNothingHeld(const std::string& fault, const Seen& seen) {
    const Outcome& outcome = seen.outcome;
    if (seen.memory.blocksLeft != 0) Lose(fault, std::to_string(seen.memory.blocksLeft) + " blocks of memory leaked");
    if (outcome.descriptorsLeft > outcome.closesFailed || outcome.descriptorsLeft < 0) {
      Lose(fault, std::to_string(outcome.descriptorsLeft) + " descriptors leaked");
    }
    if (outcome.childrenLeft != 0) Lose(fault, "a process was not waited for");
    if (outcome.processesLeft != 0) Lose(fault, "a process stayed");
  }

  // Every file is as it is at some time without a fault, and nothing is left over.
  void CheckFiles(const Fault& fault, const Seen& seen) {
    for (const auto& [path, described] : seen.state) CheckFile(fault, seen, path, described);
    for (const auto& [path, described] : base_) {
      if (seen.state.contains(path) || contents_[path].contains("")) continue;
      if (!Excused(Exception::kInPlace, path)) Lose(fault.text, path + " is gone");
    }
  }

  void CheckFile(const Fault& fault, const Seen& seen, const std::string& path, const std::string& described) {
    const auto known = contents_.find(path);
    const bool stays = base_.contains(path) || good_.contains(path);
    if (known != contents_.end() && known->second.contains(described) && stays) return;
    if (IsLeft(fault, path) || IsOfAnother(path, seen.state) || IsNarrower(path, seen.state)) return;
    if (Excused(Exception::kOtherwise, path)) return;
    const std::string is = ContentIn(seen.state, path);
    if (contract_.Find(Exception::kInPlace, path) != nullptr && IsBeginningOfKnown(path, is)) {
      Excused(Exception::kInPlace, path);
      return;
    }
    if (known == contents_.end() || !stays) return Lose(fault.text, path + " was left over");
    Lose(fault.text, path + " is neither old nor new: " + TextOf(seen.state, path));
  }

  // Whether the file is what a call that was killed leaves to the next one, or a call that could not remove it: the
  // next one has no use of it, or it is excused.
  bool IsLeft(const Fault& fault, const std::string& path) {
    if (!MayLeave(fault)) return false;
    if (IsLock(path) || IsUnfinished(path) || Excused(Exception::kStays, path)) return true;
    return Excused(Exception::kRefused, path) || Excused(Exception::kPassedOver, path);
  }

  // A lock that was not taken is left too.
  bool MayLeave(const Fault& fault) const {
    const Interference interference = fault.plan.interference;
    if (interference == Interference::kNone || interference == Interference::kShorten) return false;
    if (interference != Interference::kFail || fault.plan.onwards) return true;
    const std::string& name = calls_[static_cast<size_t>(fault.plan.call) - 1].name;
    return name == "unlink" || name == "flock" || name == "stat";
  }

  bool IsBeginningOfKnown(const std::string& path, const std::string& content) {
    return std::ranges::any_of(contents_[path], [&](const std::string& known) {
      return known.size() > 5 && known.substr(5).starts_with(content);
    });
  }

  // Whether the file has what it has without a fault, but for numbers.
  bool IsOfAnother(const std::string& path, const MachineState& state) {
    if (contract_.Find(Exception::kAnother, path) == nullptr || !state.contains(path)) return false;
    const std::string is = WithoutNumbers(ContentIn(state, path));
    const bool same = std::ranges::any_of(contents_[path], [&](const std::string& known) {
      return known.size() > 5 && WithoutNumbers(known.substr(5)) == is;
    });
    return same && Excused(Exception::kAnother, path);
  }

  // Whether only the rights to the file are others than without a fault.
  bool IsNarrower(const std::string& path, const MachineState& state) {
    if (contract_.Find(Exception::kNarrower, path) == nullptr || !state.contains(path)) return false;
    const bool same = ContentIn(state, path) == ContentIn(good_, path) && state.at(path).starts_with("0600");
    return same && Excused(Exception::kNarrower, path);
  }

  // ---- The next call ----

  struct Next {
    std::vector<std::string> losses;
    bool refused = false;
    bool missed = false;
  };

  // What the next call comes to follows from the state that it finds: it is made once for each.
  void CheckNextCalls(const Fault& fault, const Seen& seen) {
    const auto [known, isNew] = next_.try_emplace(HashOf(seen.state));
    if (isNew) known->second = MakeNextCalls(seen.state);
    for (const std::string& loss : known->second.losses) Lose(fault.text, loss);
    tally_.refused += known->second.refused ? 1 : 0;
    tally_.missed += known->second.missed ? 1 : 0;
  }

  Next MakeNextCalls(const MachineState& state) {
    Next next;
    const std::pair<Exception, Answer> markers[] = {{Exception::kRefused, Answer::kFailed},
                                                    {Exception::kPassedOver, Answer::kDone}};
    for (const auto& [exception, answer] : markers) {
      if (!IsMarkerThere(exception, state)) continue;
      next.refused = true;
      const Seen because = CallUndisturbed();
      if (because.answer != answer) next.losses.emplace_back("the marker had another effect on the next call");
      if (IsMarkerThere(exception, because.state)) next.losses.emplace_back("the next call left the marker");
    }
    const Seen good = CallUndisturbed();
    if (good.answer != Answer::kDone) {
      next.losses.push_back("the next call did not do its work" + ReportsOf(good));
      return next;
    }
    for (const std::string& path : Differences(good.state, good_)) {
      if (Excused(Exception::kStays, path) || Excused(Exception::kOtherwise, path)) continue;
      if (Excused(Exception::kMissed, path)) {
        next.missed = true;
        continue;
      }
      next.losses.push_back("behind the next call " + path + " is " + TextOf(good.state, path));
    }
    return next;
  }

  static size_t HashOf(const MachineState& state) {
    std::string all;
    for (const auto& [path, described] : state) all += path + '\0' + described + '\0';
    return std::hash<std::string>()(all);
  }

  bool IsMarkerThere(Exception exception, const MachineState& state) {
    return std::ranges::any_of(contract_.excuses, [&](const Excuse& excuse) {
      const bool there = excuse.exception == exception && state.contains(excuse.path);
      return there && Excused(exception, excuse.path);
    });
  }

  // ---- Words ----

  bool Excused(Exception exception, const std::string& path = {}) {
    const Excuse* excuse = contract_.Find(exception, path);
    if (excuse != nullptr) ++tally_.reasons[excuse->szReason];
    return excuse != nullptr;
  }

  static std::string TextOf(const MachineState& state, const std::string& path) {
    const auto found = state.find(path);
    return found != state.end() ? "'" + found->second.substr(0, 300) + "'" : "gone";
  }

  static std::string ReportsOf(const Seen& seen) {
    std::string text;
    for (const std::string& report : seen.outcome.reports) text += "\n    " + report;
    return text;
  }

  void Lose(const std::string& fault, const std::string& what) { tally_.losses.push_back(fault + ": " + what); }

  static constexpr char kSlowCommand[] = "/tmp/slow-command";

  const Exported& function_;
  const Contract& contract_;
  const Share share_;
  const Scene scene_;
  const Silence silence_;
  MachineState base_;
  MachineState good_;
  std::map<std::string, std::set<std::string>> contents_;  // of each file, at any time; "" for none
  MachineState before_;
  bool looked_ = false;
  std::map<size_t, Next> next_;  // behind each state
  std::vector<SystemCall> calls_;
  int allocations_ = 0;
  Tally tally_;
};

}  // namespace

Tally TryFaults(const Exported& function, const Share& share) {
  return Trial(function, share).Run();
}
