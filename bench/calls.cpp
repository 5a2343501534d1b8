// What each exported function costs in processes, system calls and bytes, beside the least that its contract allows:
// one line each, separated by tabs. Counts, which are the same on every machine.
#include <cstdio>
#include <cstdlib>
#include <string>

#include "private_machine.h"
#include "tests/fault/calls.h"

namespace {

void Print(const Exported& function, const Measured& measured) {
  const Least& least = function.least;
  const Cost& cost = measured.cost;
  std::printf("%s\t%s\t%d\t%d\t%d\t%d\t%d\t%d\t%d\t%d\t%d\t%d\t%lld\t%lld\t%lld\t%lld\t%lld\n", function.szName,
              function.szState, cost.processes, least.processes(), measured.Count("open"), least.opens(),
              measured.Count("read"), measured.Count("write"), measured.Count("fsync"), measured.Count("rename"),
              cost.calls, least.calls(), static_cast<long long>(cost.bytesRead),
              static_cast<long long>(measured.leastRead), static_cast<long long>(cost.bytesWritten),
              static_cast<long long>(measured.leastWritten), static_cast<long long>(cost.secondsSlept));
}

}  // namespace

int main() {
  EnterPrivateMachine();
  for (const Exported& function : ExportedFunctions()) {
    const Measured measured = Measure(function);
    if (!measured.done) {
      std::fprintf(stderr, "%s did not do its work\n", function.szName);
      for (const std::string& report : measured.reports) std::fprintf(stderr, "%s\n", report.c_str());
      return EXIT_FAILURE;
    }
    Print(function, measured);
  }
  return EXIT_SUCCESS;
}
