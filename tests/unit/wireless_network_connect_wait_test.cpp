// Waiting until the supplicant is connected, or giving up.
#include "joining.h"

namespace {

using testing::ElementsAreArray;

class AwaitedConnection : public JoiningTest {};

TEST_F(AwaitedConnection, IsAskedAboutUpTo15TimesWithASecondBeforeEach) {
  for (int n = 1; n <= 15; ++n) {
    Begin();
    std::vector<fake::Output> outputs(static_cast<size_t>(n - 1), "wpa_state=ASSOCIATING\n");
    outputs.emplace_back("wpa_state=COMPLETED\n");
    fake::PipesGive(outputs);
    EXPECT_EQ(Join(), 0);
    EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + Times(n, kPolls) + kRecords + kFinishes + kEnds)) << n;
  }
}

TEST_F(AwaitedConnection, IsGivenUpAfter15QuestionsAndLeavesNoSupplicant) {
  WriteText(kRecord, "old");
  std::vector<fake::Output> outputs(15, "wpa_state=SCANNING\n");
  outputs.emplace_back("wpa_state=COMPLETED\n");
  fake::PipesGive(outputs);
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + Times(15, kPolls) + kTimesOut + kFails + kEnds));
  EXPECT_EQ(ReadText(kRecord), "old");
}

TEST_F(AwaitedConnection, IsGivenUpWithAReportWhenTheSupplicantCannotBeEnded) {
  fake::PipesGive({"wpa_state=SCANNING\n"});
  fake::system.Returns(0, -1);
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + Times(15, kPolls) + kTimesOut +
                                        ReportsOf("Failed to execute '" + kEndsSupplicant + "'") + kFails + kEnds));
}

TEST_F(AwaitedConnection, LosesAQuestionThatCannotBeAsked) {
  std::vector<fake::Output> outputs(14, fake::kNoPipe);
  outputs.emplace_back("wpa_state=COMPLETED\n");
  fake::PipesGive(outputs);
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + Times(14, kPollsInVain) + kPolls + kRecords + kFinishes + kEnds));

  Begin();
  fake::PipesGive({fake::kNoPipe});
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + Times(15, kPollsInVain) + kTimesOut + kFails + kEnds));
}

TEST_F(AwaitedConnection, IsThereWhenTheStateIsCompleted) {
  for (const char* szState :
       {"wpa_state=COMPLETED\n", "wpa_state=COMPLETED", "  wpa_state=COMPLETED\n", "\n\twpa_state=COMPLETED\n",
        "wpa_state= COMPLETED\n", "wpa_state=COMPLETED x\n", "wpa_state=COMPLETED\nwpa_state=SCANNING\n"}) {
    Begin();
    fake::PipesGive({szState});
    EXPECT_EQ(Join(), 0) << szState;
  }
}

TEST_F(AwaitedConnection, IsNotThereInAnyOtherState) {
  for (const std::string& state :
       {std::string(), std::string("\n"), std::string("wpa_state=\n"), std::string("wpa_state"),
        std::string("wpa_state=completed\n"), std::string("wpa_state=COMPLETE\n"),
        std::string("wpa_state=COMPLETED2\n"), std::string("wpa_state=NOT_COMPLETED\n"), std::string("COMPLETED\n"),
        std::string("state=COMPLETED\n"), std::string("WPA_STATE=COMPLETED\n"),
        std::string("p2p_wpa_state=COMPLETED\n"), std::string("wpa_state=SCANNING\nwpa_state=COMPLETED\n"),
        "wpa_state=COMPLETED" + std::string(100000, 'X'), "wpa_state=" + std::string(1023, 'X') + "COMPLETED\n",
        std::string("wpa_state=4WAY_HANDSHAKE\n")}) {
    Begin();
    fake::PipesGive({state});
    EXPECT_EQ(Join(), -1) << state.substr(0, 40);
    EXPECT_EQ(fake::popen.calls(), 15);
  }
}

TEST_F(AwaitedConnection, IsAskedAboutAgainAfterAnEmptyAnswer) {
  fake::PipesGive({"", "wpa_state=SCANNING\n", "", "wpa_state=COMPLETED\n"});
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(fake::popen.calls(), 4);
}

}  // namespace
