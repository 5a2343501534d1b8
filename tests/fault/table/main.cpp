// fault-table [NAME...]: tries every fault of the functions, the operations and the scripts, or of those that are
// named, and prints a table of what came of it. Exits with 1 when something was lost.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <deque>
#include <functional>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "tests/fault/faults.h"
#include "tests/fault/scripts.h"
#include "tests/fault/subjects.h"
#include "tests/fault/table/apart.h"

namespace {

constexpr int kShown = 40;  // losses of a row
constexpr int kAtOnce = 3;  // rows, which wait for commands for some of their time

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
  std::printf("| %s | %d | %d | %d | %d | %d | %d | %d | %d | %d | %d | %d | %d | %d | %d | %zu | %s |\n", name.c_str(),
              tally.allocations, tally.calls, tally.commands, tally.kills, tally.faults(), tally.done, tally.less,
              tally.failed, tally.waiting, tally.cutShort, tally.left, tally.refused, tally.staying, tally.missed,
              tally.losses.size(), notes.c_str());
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
  sum.waiting += tally.waiting;
  sum.cutShort += tally.cutShort;
  sum.left += tally.left;
  sum.refused += tally.refused;
  sum.staying += tally.staying;
  sum.missed += tally.missed;
  sum.names.insert(tally.names.begin(), tally.names.end());
  sum.losses.insert(sum.losses.end(), tally.losses.begin(), tally.losses.end());
}

void PrintLosses(const std::string& name, const Tally& tally) {
  int shown = 0;
  for (const std::string& loss : tally.losses) {
    if (++shown > kShown) break;
    std::fprintf(stderr, "%s: %s\n", name.c_str(), loss.c_str());
  }
  if (shown > kShown) std::fprintf(stderr, "%s: ... %zu in all\n", name.c_str(), tally.losses.size());
}

struct Row {
  std::string name;
  std::function<Tally()> make;
};

std::vector<Row> AllRows() {
  std::vector<Row> rows;
  for (const Subject& subject : AllSubjects()) rows.push_back({subject.name, [&] { return TryFaults(subject, {}); }});
  for (const std::string& name : ScriptNames()) rows.push_back({name, [name] { return TryScript(name, {}); }});
  return rows;
}

bool IsNamed(const Row& row, const std::vector<std::string>& names) {
  return names.empty() || std::ranges::count(names, row.name) > 0;
}

void PrintTable(const std::vector<std::string>& names, Tally& sum) {
  std::printf(
      "| what | memory | system calls | commands | kills | faults | done | less | failed | waits | killed | left | "
      "refused | stays | missed | lost | see |\n"
      "| --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- | --- |\n");
  Notes notes;
  std::vector<Row> rows = AllRows();
  std::erase_if(rows, [&](const Row& row) { return !IsNamed(row, names); });
  std::deque<Apart> ahead;  // the rows that have been begun, and not printed yet
  for (size_t next = 0; const Row& row : rows) {
    while (ahead.empty() || !ahead.front().IsDone()) {
      const bool hasRoom = std::ranges::count_if(ahead, [](const Apart& one) { return !one.IsDone(); }) < kAtOnce;
      if (hasRoom && next < rows.size()) {
        ahead.emplace_back(rows[next++].make);
      } else {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
      }
    }
    const Tally tally = ahead.front().Take();
    ahead.pop_front();
    PrintRow(row.name, tally, notes.NumbersOf(tally));
    PrintLosses(row.name, tally);
    Add(sum, tally);
  }
  PrintRow("all", sum, "-");
  notes.Print();
  std::printf("\nThey make %zu different system calls:", sum.names.size());
  for (const std::string& name : sum.names) std::printf(" %s", name.c_str());
  std::printf("\n");
}

// Whether there are rows of all these names; says which one there is not.
bool AreThere(const std::vector<std::string>& names) {
  const std::vector<Row> rows = AllRows();
  for (const std::string& name : names) {
    if (std::ranges::count(rows, name, &Row::name) > 0) continue;
    std::fprintf(stderr, "faults: there is no row '%s'\n", name.c_str());
    return false;
  }
  return true;
}

}  // namespace

int main(int argc, char** argv) {
  const std::vector<std::string> names(argv + 1, argv + argc);
  if (!AreThere(names)) return 2;
  Tally sum;
  PrintTable(names, sum);
  return sum.losses.empty() ? 0 : 1;
}
