// What has become of a call that has met a fault, beside what its contract says.
#ifndef MERO_TESTS_FAULT_JUDGE_H
#define MERO_TESTS_FAULT_JUDGE_H

#include <map>
#include <set>
#include <string>
#include <vector>

#include "tests/fault/fault.h"
#include "tests/fault/faults.h"

class Judge {
 public:
  Judge(const Contract& contract, Tally& tally) : contract_(contract), tally_(tally) {}

  // The state that each call meets.
  void Begin(const MachineState& base);
  // A state that the machine is in at some time of a call without a fault.
  void Note(const MachineState& now);
  // What a call without a fault has come to.
  void Learn(const Seen& good);

  void JudgeCall(const Fault& fault, const Seen& seen);

  // What the next call comes to, in the state that a fault has left.
  struct Next {
    std::vector<std::string> losses;
    bool refused = false;  // it was refused, or did less, and the one behind it not
    bool missed = false;   // it left a file as it was
    bool stays = false;    // it left what the fault had left over
  };
  bool IsMarkerThere(const MachineState& state, Exception exception) const;
  void JudgeMarked(const Seen& marked, Exception exception, Answer answer, Next& next);
  void JudgeNext(const Seen& seen, Next& next);
  void Count(const std::string& fault, const Next& next);

  // The exceptions that no fault has needed.
  void LoseUnneeded();

  void Lose(const std::string& fault, const std::string& what) { tally_.losses.push_back(fault + ": " + what); }

 private:
  void JudgeUndisturbed(const Seen& good);
  void JudgeHung(const Fault& fault, const Seen& seen);
  void JudgeSuccess(const Fault& fault, const Seen& seen);
  void CheckReported(const Fault& fault, const Seen& seen);
  void CheckOwnReport(const Fault& fault, const Seen& seen);
  void CheckNothingHeld(const Fault& fault, const Seen& seen);
  void CheckFiles(const Fault& fault, const Seen& seen);
  void CheckFile(const Fault& fault, const Seen& seen, const std::string& path, const std::string& described);

  bool IsNothingTried(const Seen& seen);
  bool HasCause(const Seen& seen);
  bool IsLeftOut(const Seen& seen, const std::string& path);
  bool IsExcusedFile(const Fault& fault, const Seen& seen, const std::string& path);
  // The commands that were not run as without a fault, and are not excused.
  std::vector<std::string> WrongCommands(const Seen& seen);
  bool IsKept(const Fault& fault, const Seen& seen, const std::string& path) const;
  bool IsLeft(const Fault& fault, const Seen& seen, const std::string& path);
  bool IsLeftOver(const std::string& path) const;
  bool IsKnown(const std::string& path, const std::string& described) const;
  bool IsBeginningOfKnown(const std::string& path, const std::string& content) const;
  bool IsOfAnother(const std::string& path, const MachineState& state);
  bool IsNarrower(const std::string& path, const MachineState& state);
  bool Excused(Exception exception, const std::string& path = {});

  const Contract& contract_;
  Tally& tally_;
  MachineState base_;
  Seen good_;
  std::map<std::string, std::set<std::string>> contents_;  // of each file, at any time; "" for none
  MachineState before_;
  bool noted_ = false;
  std::set<const Excuse*> needed_;
};

// What was reported, for a loss.
std::string ReportsOf(const Seen& seen);

#endif  // MERO_TESTS_FAULT_JUDGE_H
