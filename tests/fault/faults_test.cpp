// A part of the faults of every function and operation; `./run faults` tries all of them.
#include "tests/fault/faults.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <set>

#include "tests/fault/subjects.h"

namespace {

std::vector<std::string> Names() {
  std::vector<std::string> names;
  for (const Subject& subject : AllSubjects()) names.push_back(subject.name);
  return names;
}

class AFaultIn : public testing::TestWithParam<std::string> {};

TEST_P(AFaultIn, HasTheResultAndLeavesTheFilesThatTheContractSays) {
  const auto subject = std::ranges::find(AllSubjects(), GetParam(), &Subject::name);
  const Tally tally = TryFaults(*subject, {.most = 6});
  for (const std::string& loss : tally.losses) ADD_FAILURE() << loss;
  const std::set<std::string> asksNobody = {"MEROWirelessProtocolStringGet", "MEROWirelessAPInterfaceGet",
                                            "MEROWirelessAPIsSupported"};
  EXPECT_EQ(tally.kills == 0 && tally.calls == 0, asksNobody.contains(subject->name));
}

std::string NameOf(const testing::TestParamInfo<std::string>& of) {
  std::string name = of.param;
  std::ranges::replace_if(name, [](char c) { return c == ' ' || c == ','; }, '_');
  return name;
}

INSTANTIATE_TEST_SUITE_P(, AFaultIn, testing::ValuesIn(Names()), NameOf);

}  // namespace
