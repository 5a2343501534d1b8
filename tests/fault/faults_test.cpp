// A part of the faults of every exported function; `./run faults` tries all of them.
#include "tests/fault/faults.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

std::vector<std::string> Names() {
  std::vector<std::string> names;
  for (const Exported& function : ExportedFunctions()) names.emplace_back(function.szName);
  return names;
}

class AFaultIn : public testing::TestWithParam<std::string> {};

TEST_P(AFaultIn, HasTheResultAndLeavesTheFilesThatTheContractSays) {
  const auto function = std::ranges::find(ExportedFunctions(), GetParam(), &Exported::szName);
  const Tally tally = TryFaults(*function, {.most = 10});
  for (const std::string& loss : tally.losses) ADD_FAILURE() << loss;
}

INSTANTIATE_TEST_SUITE_P(, AFaultIn, testing::ValuesIn(Names()), [](const auto& of) { return of.param; });

}  // namespace
