// A row of the table on a machine of its own.
#include "tests/fault/table/apart.h"

#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <utility>

#include "private_machine.h"
#include "tests/support/processes.h"

namespace {

// The numbers of a tally, in one order.
template <class Visit>
void ForEachNumber(Tally& tally, Visit visit) {
  for (int* number :
       {&tally.allocations, &tally.calls, &tally.commands, &tally.kills, &tally.done, &tally.less, &tally.failed,
        &tally.waiting, &tally.cutShort, &tally.left, &tally.refused, &tally.staying, &tally.missed}) {
    visit(*number);
  }
}

// A text is on one line, which ends with an octet that no text has.
constexpr char kEnd = '\1';

void Write(std::ostream& to, Tally& tally) {
  ForEachNumber(tally, [&](int number) { to << number << ' '; });
  to << tally.names.size() << ' ' << tally.reasons.size() << ' ' << tally.losses.size() << ' ';
  for (const std::string& name : tally.names) to << name << kEnd;
  for (const auto& [reason, times] : tally.reasons) to << times << ' ' << reason << kEnd;
  for (const std::string& loss : tally.losses) to << loss << kEnd;
}

std::string TextIn(std::istream& from) {
  std::string text;
  std::getline(from, text, kEnd);
  return text;
}

Tally Read(std::istream& from) {
  Tally tally;
  size_t sizes[3] = {};
  ForEachNumber(tally, [&](int& number) { from >> number; });
  for (size_t& size : sizes) from >> size;
  from.get();
  for (size_t i = 0; i < sizes[0]; ++i) tally.names.insert(TextIn(from));
  for (size_t i = 0; i < sizes[1]; ++i) {
    int times = 0;
    from >> times;
    from.get();
    tally.reasons[TextIn(from)] = times;
  }
  for (size_t i = 0; i < sizes[2]; ++i) tally.losses.push_back(TextIn(from));
  return tally;
}

void TallyInChild(const std::function<Tally()>& make, const std::string& path) {
  EnterPrivateMachine();
  Tally tally = make();
  if (!testing::UnitTest::GetInstance()->Passed()) tally.losses.emplace_back("the test itself: an expectation failed");
  std::ofstream to(path);
  Write(to, tally);
}

}  // namespace

Apart::Apart(const std::function<Tally()>& make) : memory_(::memfd_create("tally", 0)), child_(::fork()) {
  if (child_ != 0) return;
  TallyInChild(make, "/proc/self/fd/" + std::to_string(memory_));
  ::_exit(0);
}

bool Apart::IsDone() const {
  siginfo_t ended{};
  return ::waitid(P_PID, static_cast<id_t>(child_), &ended, WEXITED | WNOHANG | WNOWAIT) == 0 && ended.si_pid != 0;
}

Tally Apart::Take() {
  const int status = StatusOf(child_);
  std::ifstream from("/proc/self/fd/" + std::to_string(memory_));
  Tally tally = Read(from);
  ::close(memory_);
  if (status != 0) tally.losses.emplace_back("the test itself: it has not come to its end");
  return tally;
}
