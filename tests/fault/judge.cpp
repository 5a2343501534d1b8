// What has become of a call that has met a fault.
#include "tests/fault/judge.h"

#include <algorithm>
#include <filesystem>
#include <regex>
#include <utility>

namespace fs = std::filesystem;

namespace {

bool IsLock(const std::string& path) {
  const std::string name = fs::path(path).filename();
  return name.starts_with('.') && name.ends_with(".lock");
}

bool IsUnfinished(const std::string& path) {
  const std::string name = fs::path(path).filename();
  return name.starts_with('.') && name.ends_with(".new");
}

// The path of a file, without the link in it that every system has.
std::string Plain(const std::string& path) {
  constexpr std::string_view kLink = "/var/run/";
  return path.starts_with(kLink) ? "/run/" + path.substr(kLink.size()) : path;
}

// A text in which all numbers are the same. The first network has no address to be pinned.
std::string WithoutNumbers(const std::string& text) {
  static const std::regex pinned("\tbssid=[0-9:]+\n");
  static const std::regex number("[0-9]+");
  return std::regex_replace(std::regex_replace(text, pinned, ""), number, "#");
}

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

// The differences between two states, less what may be left over until the next call.
std::vector<std::string> Changed(const MachineState& state, const MachineState& than) {
  std::vector<std::string> paths = Differences(state, than);
  std::erase_if(paths, [](const std::string& path) { return IsLock(path) || IsUnfinished(path); });
  return paths;
}

// The lines of `a` that `b` has not, or not as often.
std::vector<std::string> Missing(std::vector<std::string> a, std::vector<std::string> b) {
  std::ranges::sort(a);
  std::ranges::sort(b);
  std::vector<std::string> missing;
  std::ranges::set_difference(a, b, std::back_inserter(missing));
  return missing;
}

std::string CommandIn(const std::string& line) {
  return line.substr(0, line.find(' '));
}

std::string TextOf(const MachineState& state, const std::string& path) {
  const auto found = state.find(path);
  return found != state.end() ? "'" + found->second.substr(0, 300) + "'" : "gone";
}

// How many files are renamed before what was written to them was flushed, or without a flush behind it.
int CountUnflushed(const std::vector<SystemCall>& calls) {
  int unflushed = 0;
  bool written = false;
  bool renamed = false;
  for (const SystemCall& call : calls) {
    if (call.name == "write") written = true;
    if (call.name == "fsync") written = renamed = false;
    if (call.name != "rename") continue;
    if (written || renamed) ++unflushed;
    renamed = !written;
    written = false;
  }
  return unflushed + (renamed ? 1 : 0);
}

}  // namespace

std::string ReportsOf(const Seen& seen) {
  std::string text;
  for (const std::string& report : seen.outcome.reports) text += "\n    " + report;
  return text;
}

// ---- Without a fault ----

void Judge::Begin(const MachineState& base) {
  base_ = base;
}

void Judge::Note(const MachineState& now) {
  for (const auto& [path, described] : now) contents_[path].insert(described);
  // Those that were not there yet, or are not any more.
  for (auto& [path, all] : contents_) {
    if (!now.contains(path)) all.insert("");
  }
  for (const auto& [path, described] : now) {
    if (noted_ && !before_.contains(path)) contents_[path].insert("");
  }
  before_ = now;
  noted_ = true;
}

void Judge::Learn(const Seen& good) {
  good_ = good;
  JudgeUndisturbed(good);
}

void Judge::JudgeUndisturbed(const Seen& good) {
  const Fault none{"without a fault"};
  if (good.answer != Answer::kDone) Lose(none.text, "it has not done its work" + ReportsOf(good));
  for (const auto& [path, described] : good.state) {
    if (IsLeftOver(path)) Lose(none.text, path + " was left over");
  }
  for (const std::string& command : contract_.commands) {
    const bool notes = ContentIn(base_, command).find(kCommandRecord) != std::string::npos;
    if (notes && std::ranges::count(good.commands, command, CommandIn) == 0) Lose(none.text, command + " was not run");
  }
  CheckNothingHeld(none, good);
  const int unflushed = CountUnflushed(good.outcome.before);
  if (unflushed > 1 || (unflushed == 1 && !Excused(Exception::kUnflushed))) {
    Lose(none.text, "a file was put into its place, and it or its directory was not flushed");
  }
}

// ---- A call with a fault ----

void Judge::JudgeCall(const Fault& fault, const Seen& seen) {
  CheckFiles(fault, seen);
  if (seen.outcome.hung) return JudgeHung(fault, seen);
  if (seen.outcome.killed) {
    if (!fault.kills()) Lose(fault.text, "it crashed");
    ++tally_.cutShort;
    return;
  }
  CheckNothingHeld(fault, seen);
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

// Whoever waits for a command that never ends waits until it is killed.
void Judge::JudgeHung(const Fault& fault, const Seen&) {
  if (fault.commandFault != CommandFault::kNeverEnds || !Excused(Exception::kWaits, fault.command)) {
    return Lose(fault.text, "it came to no end");
  }
  ++tally_.waiting;
}

void Judge::JudgeSuccess(const Fault& fault, const Seen& seen) {
  const std::vector<std::string> different = Changed(seen.state, good_.state);
  const bool hasRunAll = Missing(good_.commands, seen.commands).empty();
  ++(different.empty() && hasRunAll ? tally_.done : tally_.less);
  if (IsNothingTried(seen)) return;
  for (const std::string& path : different) {
    if (IsExcusedFile(fault, seen, path)) continue;
    Lose(fault.text, "it succeeded, and " + path + " is " + TextOf(seen.state, path) + ReportsOf(seen));
  }
  for (const std::string& wrong : WrongCommands(seen)) Lose(fault.text, "it succeeded, and " + wrong + ReportsOf(seen));
}

bool Judge::IsNothingTried(const Seen& seen) {
  return Changed(seen.state, Comparable(base_)).empty() && seen.commands.empty() && HasCause(seen);
}

// Whether a file could not be looked into because of which nothing is tried.
bool Judge::HasCause(const Seen& seen) {
  return std::ranges::any_of(seen.outcome.failed,
                             [&](const FailedCall& call) { return Excused(Exception::kNothingTried, call.path); });
}

bool Judge::IsLeftOut(const Seen& seen, const std::string& path) {
  return contract_.Find(Exception::kLeftOut, path) != nullptr && HasCause(seen) && Excused(Exception::kLeftOut, path);
}

bool Judge::IsExcusedFile(const Fault& fault, const Seen& seen, const std::string& path) {
  if (IsLeftOut(seen, path)) return true;
  if (IsOfAnother(path, seen.state) || IsNarrower(path, seen.state) || IsLeft(fault, seen, path)) return true;
  if (Excused(Exception::kUnnoticed, path)) return true;
  return !seen.outcome.reports.empty() && Excused(Exception::kTolerates, path);
}

std::vector<std::string> Judge::WrongCommands(const Seen& seen) {
  const std::vector<std::string> missing = Missing(good_.commands, seen.commands);
  const std::vector<std::string> surplus = Missing(seen.commands, good_.commands);
  const auto isOf = [](const std::vector<std::string>& lines, const std::string& command) {
    return std::ranges::count(lines, command, CommandIn) > 0;
  };
  std::vector<std::string> wrong;
  for (const std::string& line : missing) {
    const std::string command = CommandIn(line);
    if (isOf(surplus, command) && Excused(Exception::kOtherWords, command)) continue;
    if (!IsLeftOut(seen, command) && !Excused(Exception::kIgnores, command))
      wrong.push_back("'" + line + "' was not run");
  }
  for (const std::string& line : surplus) {
    const std::string command = CommandIn(line);
    if (isOf(missing, command) && Excused(Exception::kOtherWords, command)) continue;
    if (!Excused(Exception::kRepeats, command)) wrong.push_back("'" + line + "' was run");
  }
  const bool inOrder = std::ranges::count(contract_.excuses, Exception::kRunsOn, &Excuse::exception) == 0;
  if (inOrder && missing.empty() && surplus.empty() && seen.commands != good_.commands) {
    wrong.emplace_back("its commands were run in another order");
  }
  return wrong;
}

void Judge::CheckReported(const Fault& fault, const Seen& seen) {
  if (contract_.setsCode && seen.outcome.code == 0) Lose(fault.text, "it failed without an error code");
  if (!seen.outcome.reports.empty()) return CheckOwnReport(fault, seen);
  if (!Excused(Exception::kSilent)) Lose(fault.text, "it failed without a report");
}

void Judge::CheckOwnReport(const Fault& fault, const Seen& seen) {
  const std::string unit = *contract_.szUnit != '\0' ? std::string(contract_.szUnit) + ":" : "";
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

void Judge::CheckNothingHeld(const Fault& fault, const Seen& seen) {
  const Outcome& outcome = seen.outcome;
  if (seen.memory.blocksLeft != 0) {
    Lose(fault.text, std::to_string(seen.memory.blocksLeft) + " blocks of memory leaked");
  }
  if (outcome.descriptorsLeft > outcome.closesFailed || outcome.descriptorsLeft < 0) {
    Lose(fault.text, std::to_string(outcome.descriptorsLeft) + " descriptors leaked");
  }
  if (outcome.childrenLeft != 0) Lose(fault.text, "a process was not waited for");
  const bool runsOn = fault.commandFault == CommandFault::kNeverEnds && outcome.processesLeft > 0;
  if (outcome.processesLeft != 0 && !(runsOn && Excused(Exception::kRunsOn, fault.command))) {
    Lose(fault.text, "a process stayed");
  }
}

// ---- Files ----

// Every file is as it is at some time without a fault, and nothing is left over.
void Judge::CheckFiles(const Fault& fault, const Seen& seen) {
  for (const auto& [path, described] : seen.state) CheckFile(fault, seen, path, described);
  for (const auto& [path, described] : base_) {
    if (seen.state.contains(path) || IsKnown(path, "")) continue;
    if (!Excused(Exception::kInPlace, path)) Lose(fault.text, path + " is gone");
  }
  const auto isLeftOver = [&](const auto& entry) { return IsLeftOver(entry.first); };
  if (std::ranges::any_of(seen.state, isLeftOver)) ++tally_.left;
}

void Judge::CheckFile(const Fault& fault, const Seen& seen, const std::string& path, const std::string& described) {
  if (!IsLeftOver(path) && IsKnown(path, described)) return;
  if (IsLeft(fault, seen, path) || IsOfAnother(path, seen.state) || IsNarrower(path, seen.state)) return;
  const std::string is = ContentIn(seen.state, path);
  if (IsBeginningOfKnown(path, is) && Excused(Exception::kInPlace, path)) return;
  if (IsLeftOver(path)) return Lose(fault.text, path + " was left over");
  Lose(fault.text, path + " is neither old nor new: " + TextOf(seen.state, path));
}

// Whether a call leaves no such file by itself: a lock, a new file that is not in its place yet, a marker.
bool Judge::IsLeftOver(const std::string& path) const {
  if (IsLock(path) || IsUnfinished(path)) return !base_.contains(path);
  return !base_.contains(path) && !good_.state.contains(path);
}

bool Judge::IsKnown(const std::string& path, const std::string& described) const {
  const auto known = contents_.find(path);
  return known != contents_.end() && known->second.contains(described);
}

// Whether the file is what a call that was killed leaves to the next one, or a call that could not remove it: the next
// one has no use of it, or it is excused.
bool Judge::IsLeft(const Fault& fault, const Seen& seen, const std::string& path) {
  if (!IsLeftOver(path) || !IsKept(fault, seen, path)) return false;
  if (IsLock(path) || IsUnfinished(path) || Excused(Exception::kStays, path)) return true;
  return Excused(Exception::kRefused, path) || Excused(Exception::kPassedOver, path);
}

// Whether a call had no chance to remove the file: it was killed, or its removal failed. A lock that could not be taken
// is not removed, since it may be another's.
bool Judge::IsKept(const Fault& fault, const Seen& seen, const std::string& path) const {
  if (fault.kills() || seen.outcome.hung) return true;
  return std::ranges::any_of(seen.outcome.failed, [&](const FailedCall& call) {
    if (Plain(call.path) != path) return false;
    return call.name == "unlink" || (IsLock(path) && (call.name == "flock" || call.name == "stat"));
  });
}

bool Judge::IsBeginningOfKnown(const std::string& path, const std::string& content) const {
  const auto known = contents_.find(path);
  return known != contents_.end() && std::ranges::any_of(known->second, [&](const std::string& described) {
           return described.size() > 5 && described.substr(5).starts_with(content);
         });
}

// Whether the file has what it has without a fault, but for numbers.
bool Judge::IsOfAnother(const std::string& path, const MachineState& state) {
  if (contract_.Find(Exception::kAnother, path) == nullptr || !state.contains(path)) return false;
  if (ContentIn(state, path) == ContentIn(good_.state, path)) return false;
  const std::string is = WithoutNumbers(ContentIn(state, path));
  const bool same = std::ranges::any_of(contents_[path], [&](const std::string& known) {
    return known.size() > 5 && WithoutNumbers(known.substr(5)) == is;
  });
  return same && Excused(Exception::kAnother, path);
}

// Whether only the rights to the file are others than without a fault.
bool Judge::IsNarrower(const std::string& path, const MachineState& state) {
  if (contract_.Find(Exception::kNarrower, path) == nullptr || !state.contains(path)) return false;
  const bool same = ContentIn(state, path) == ContentIn(good_.state, path) && state.at(path).starts_with("0600");
  return same && Excused(Exception::kNarrower, path);
}

// ---- The next call ----

bool Judge::IsMarkerThere(const MachineState& state, Exception exception) const {
  return std::ranges::any_of(contract_.excuses, [&](const Excuse& excuse) {
    return excuse.exception == exception && state.contains(excuse.path);
  });
}

void Judge::JudgeMarked(const Seen& marked, Exception exception, Answer answer, Next& next) {
  next.refused = true;
  if (marked.answer != answer) next.losses.emplace_back("the marker had another effect on the next call");
  if (IsMarkerThere(marked.state, exception)) next.losses.emplace_back("the next call left the marker");
}

void Judge::JudgeNext(const Seen& seen, Next& next) {
  if (seen.answer != Answer::kDone) {
    next.losses.push_back("the next call did not do its work" + ReportsOf(seen));
    return;
  }
  for (const std::string& path : Differences(seen.state, good_.state)) {
    if (IsLeftOver(path) && Excused(Exception::kStays, path)) {
      next.stays = true;
    } else if (Excused(Exception::kMissed, path)) {
      next.missed = true;
    } else {
      next.losses.push_back("behind the next call " + path + " is " + TextOf(seen.state, path));
    }
  }
  for (const std::string& wrong : WrongCommands(seen)) next.losses.push_back("in the next call, " + wrong);
}

void Judge::Count(const std::string& fault, const Next& next) {
  for (const std::string& loss : next.losses) Lose(fault, loss);
  tally_.refused += next.refused ? 1 : 0;
  tally_.missed += next.missed ? 1 : 0;
  tally_.staying += next.stays ? 1 : 0;
}

// ---- Exceptions ----

bool Judge::Excused(Exception exception, const std::string& path) {
  const Excuse* excuse = contract_.Find(exception, path);
  if (excuse == nullptr) return false;
  ++tally_.reasons[excuse->szReason];
  needed_.insert(excuse);
  return true;
}

void Judge::LoseUnneeded() {
  for (const Excuse& excuse : contract_.excuses) {
    if (needed_.contains(&excuse)) continue;
    Lose("all faults", std::string("none has needed ") + NameOf(excuse.exception) + " '" + excuse.szReason + "'" +
                           (excuse.path.empty() ? "" : ", for " + excuse.path));
  }
}
