// fault-table [FUNCTION...]: tries every fault of the exported functions, or of those that are named, and prints a
// table of what came of it. Exits with 1 when something was lost.
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "private_machine.h"
#include "tests/fault/faults.h"

namespace {

constexpr int kShown = 40;  // losses of a function

// The reasons that the table's rows lead to, each with the number that it has there.
class Notes {
 public:
  std::string NumbersOf(const Tally& tally) {
    std::string numbers;
    for (const auto& [reason, times] : tally.reasons) {
      const auto known = std::ranges::find(reasons_, reason);
      const auto number = known - reasons_.begin() + 1;
      if (known == reasons_.end()) reasons_.push_back(reason);
      numbers += (numbers.empty() ? "" : ", ") + std::to_string(number);
    }
    return numbers.empty() ? "-" : numbers;
  }

  void Print() const {
    std::printf("\n");
    for (size_t i = 0; i < reasons_.size(); ++i) std::printf("%zu. %s\n", i + 1, reasons_[i].c_str());
  }

 private:
  std::vector<std::string> reasons_;
};

void PrintRow(const std::string& name, const Tally& tally, const std::string& notes) {
  std::printf("| %s | %d | %d | %d | %d | %d | %d | %d | %d | %d | %d | %d | %zu | %s |\n", name.c_str(),
              tally.allocations, tally.calls, tally.commands, tally.kills, tally.faults(), tally.done, tally.less,
              tally.failed, tally.cutShort, tally.refused, tally.missed, tally.losses.size(), notes.c_str());
  std::fflush(stdout);
}

void Add(Tally& sum, const Tally& tally) {
  sum.allocations += tally.allocations;
  sum.calls += tally.calls;
  sum.commands += tally.commands;
  sum.kills += tally.kills;
  sum.done += tally.done;
  sum.less += tally.less;
  sum.failed += tally.failed;
  sum.cutShort += tally.cutShort;
  sum.refused += tally.refused;
  sum.missed += tally.missed;
  sum.names.insert(tally.names.begin(), tally.names.end());
  sum.losses.insert(sum.losses.end(), tally.losses.begin(), tally.losses.end());
}

void PrintLosses(const Exported& function, const Tally& tally) {
  int shown = 0;
  for (const std::string& loss : tally.losses) {
    if (++shown > kShown) break;
    std::fprintf(stderr, "%s: %s\n", function.szName, loss.c_str());
  }
  if (shown > kShown) std::fprintf(stderr, "%s: ... %zu in all\n", function.szName, tally.losses.size());
}

bool IsNamed(const Exported& function, const std::vector<std::string>& names) {
  return names.empty() || std::ranges::count(names, function.szName) > 0;
}

void PrintTable(const std::vector<std::string>& names, Tally& sum) {
  std::printf(
      "| function | memory | system calls | commands | kills | faults | done | less | failed | killed | refused | "
      "missed "
      "| lost | see |\n| --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- |\n");
  Notes notes;
  for (const Exported& function : ExportedFunctions()) {
    if (!IsNamed(function, names)) continue;
    const Tally tally = TryFaults(function, {});
    PrintRow(function.szName, tally, notes.NumbersOf(tally));
    PrintLosses(function, tally);
    Add(sum, tally);
  }
  PrintRow("all", sum, "-");
  notes.Print();
  std::printf("\nThe functions make %zu different system calls:", sum.names.size());
  for (const std::string& name : sum.names) std::printf(" %s", name.c_str());
  std::printf("\n");
}

// Whether there are functions of all these names; says which one there is not.
bool AreThere(const std::vector<std::string>& names) {
  for (const std::string& name : names) {
    const auto& all = ExportedFunctions();
    if (std::ranges::any_of(all, [&](const Exported& function) { return name == function.szName; })) continue;
    std::fprintf(stderr, "faults: there is no function '%s'\n", name.c_str());
    return false;
  }
  return true;
}

}  // namespace

int main(int argc, char** argv) {
  const std::vector<std::string> names(argv + 1, argv + argc);
  if (!AreThere(names)) return 2;
  EnterPrivateMachine();
  Tally sum;
  PrintTable(names, sum);
  // What the tests' own parts expect is told where the table is, and by this alone.
  return sum.losses.empty() && testing::UnitTest::GetInstance()->Passed() ? 0 : 1;
}
