// What the exported functions cost, in counts.
#include "tests/fault/calls.h"

#include <gtest/gtest.h>

namespace {

// Every function has a row. Whoever needs fewer lowers its row.
TEST(AnExportedFunction, StartsNoMoreProcessesAndOpensNoMoreFilesThanItsRowSays) {
  EXPECT_EQ(ExportedFunctions().size(), 23u);
  for (const Exported& function : ExportedFunctions()) {
    const Measured measured = Measure(function);
    EXPECT_TRUE(measured.done) << function.szName << testing::PrintToString(measured.reports);
    EXPECT_LE(measured.cost.processes, function.today.processes) << function.szName;
    EXPECT_LE(measured.Count("open"), function.today.opens) << function.szName;
    // A save of what was there already was counted: it writes nothing.
    EXPECT_GE(measured.Count("rename"), static_cast<int>(function.least.replaced.size())) << function.szName;
  }
}

}  // namespace
