// A part of the faults of every script of the kit; `./run faults` tries all of them.
#include "tests/fault/scripts.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

class AFaultInScript : public testing::TestWithParam<std::string> {};

TEST_P(AFaultInScript, IsMendedByTheNextRun) {
  const Tally tally = TryScript(GetParam(), {.most = 2});
  EXPECT_GT(tally.commands, 0);
  EXPECT_GT(tally.kills, 0);
  for (const std::string& loss : tally.losses) ADD_FAILURE() << loss;
}

std::string NameOf(const testing::TestParamInfo<std::string>& of) {
  std::string name = of.param;
  std::ranges::replace_if(name, [](char c) { return c == ' ' || c == '.' || c == '-'; }, '_');
  return name;
}

INSTANTIATE_TEST_SUITE_P(, AFaultInScript, testing::ValuesIn(ScriptNames()), NameOf);

}  // namespace
