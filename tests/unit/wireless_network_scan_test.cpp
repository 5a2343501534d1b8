// A scan's course: the adapter, the interface, the readings. What a reading makes of its rows is tested by itself.
#include <fcntl.h>

#include <climits>

#include "hostile_texts.h"
#include "listing.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

constexpr char kListsLast[] = "popen(/sbin/iwlist wlan0 scanning mero, r)";
constexpr char kScansAfresh[] = "system(/sbin/iwlist wlan0 scanning > /dev/null 2>&1)";
constexpr char kClosesPipe[] = "pclose(&)";

std::string ReportOf(const std::string& message) {
  return fake::Report("wireless_network_scan:" + message);
}

class Scan : public UnitTest {
 protected:
  Scan() {
    BeginWithAdapter();
    fake::system.Returns(0);
    fake::PipesGive({ListingOf(1)});
  }

  int Run(WIRELESS_SCAN scan = WIRELESS_SCAN_LAST) {
    return memory::Run(0, [&] { return MEROWirelessNetworkScan(scan, ring_.head()); });
  }

  // What was done, but for the texts that rows were taken apart into.
  static std::vector<std::string> Steps() {
    return fake::EffectsOf({"MEROWirelessAdapterNum", "MEROWirelessInterfaceGet", "PLIBNetIfUp", "sleep", "system",
                            "popen", "pclose", "syslog"});
  }

  // The steps of a scan, from the first question about the adapter to the interface that is up.
  static std::vector<std::string> After(std::vector<std::string> steps) {
    const char* const before[] = {"MEROWirelessAdapterNum()", "MEROWirelessInterfaceGet()", "PLIBNetIfUp(wlan0)",
                                  "sleep(1)"};
    steps.insert(steps.begin(), std::begin(before), std::end(before));
    return steps;
  }

  Ring<WIRELESS_NETWORK> ring_;
};

TEST_F(Scan, ReadsTheLastResultsUntilTwoReadingsAgree) {
  EXPECT_EQ(Run(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(After({kListsLast, kClosesPipe, ReportOf("169 Scan 0: result is un-stable."),
                                               kListsLast, kClosesPipe, ReportOf("164 Scan 1: success.")})));
  EXPECT_EQ(ring_.Records().size(), 1u);
}

TEST_F(Scan, IsMadeAfreshFirstWhenThatIsAskedFor) {
  EXPECT_EQ(Run(WIRELESS_SCAN_RENEW), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(
                           After({kScansAfresh, kListsLast, kClosesPipe, ReportOf("169 Scan 0: result is un-stable."),
                                  kListsLast, kClosesPipe, ReportOf("164 Scan 1: success.")})));
}

TEST_F(Scan, IsNotMadeAfreshForAnyOtherValue) {
  for (const int scan : {0, 2, -1, 257, INT_MAX}) {
    EXPECT_EQ(Run(static_cast<WIRELESS_SCAN>(scan)), 0) << scan;
    ring_.Clear();
  }
  EXPECT_EQ(fake::system.calls(), 0);
}

// The steps of waiting so many times for an adapter, up to the question that follows.
std::vector<std::string> Waits(int count) {
  std::vector<std::string> steps;
  for (int i = 0; i < count; ++i) {
    steps.insert(steps.end(),
                 {"MEROWirelessAdapterNum()", ReportOf("233 Wait for wlan0 ready, " + std::to_string(i)), "sleep(1)"});
  }
  steps.push_back("MEROWirelessAdapterNum()");
  return steps;
}

TEST_F(Scan, WaitsForAnAdapterUpToFiveTimesASecond) {
  for (int absent = 0; absent <= 5; ++absent) {
    BeginWithAdapter();
    fake::MEROWirelessAdapterNum.Does([left = absent]() mutable { return left-- > 0 ? -(left % 2) : 2; });
    fake::MEROWirelessInterfaceGet.Returns("usb7");
    fake::PLIBNetIfUp.Returns(0);
    EXPECT_EQ(Run(), -1);
    std::vector<std::string> expected = Waits(absent);
    expected.insert(expected.end(), {"MEROWirelessInterfaceGet()", "PLIBNetIfUp(usb7)",
                                     ReportOf("191 Failed to activate network interface usb7")});
    EXPECT_THAT(fake::Effects(), ElementsAreArray(expected)) << absent;
  }
}

TEST_F(Scan, FailsWithoutAnAdapterAndLeavesTheHeadAsItWas) {
  for (const int none : {0, -1}) {
    BeginWithAdapter();
    fake::MEROWirelessAdapterNum.Returns(none);
    EXPECT_EQ(Run(), -1);
    std::vector<std::string> expected = Waits(5);
    expected.push_back(ReportOf("229 There is no wireless USB adapter plugged"));
    EXPECT_THAT(fake::Effects(), ElementsAreArray(expected)) << none;
    EXPECT_FALSE(ring_.IsSet());
  }
}

TEST_F(Scan, RejectsANullHeadOnceThereIsAnAdapter) {
  EXPECT_EQ(MEROWirelessNetworkScan(WIRELESS_SCAN_RENEW, nullptr), -1);
  EXPECT_THAT(fake::Effects(),
              ElementsAre("MEROWirelessAdapterNum()", "MEROWirelessInterfaceGet()", ReportOf("188 Bad parameters")));
  BeginWithAdapter();
  fake::MEROWirelessAdapterNum.Returns(0);
  EXPECT_EQ(MEROWirelessNetworkScan(WIRELESS_SCAN_RENEW, nullptr), -1);
  EXPECT_EQ(fake::Effects().back(), ReportOf("229 There is no wireless USB adapter plugged"));
}

TEST_F(Scan, RejectsAnInterfaceWithoutAName) {
  fake::MEROWirelessInterfaceGet.Returns(static_cast<const char*>(nullptr));
  EXPECT_EQ(Run(), -1);
  EXPECT_THAT(fake::Effects(),
              ElementsAre("MEROWirelessAdapterNum()", "MEROWirelessInterfaceGet()", ReportOf("188 Bad parameters")));
}

TEST_F(Scan, FailsWhenTheInterfaceStaysDown) {
  fake::PLIBNetIfUp.Returns(0);
  EXPECT_EQ(Run(WIRELESS_SCAN_RENEW), -1);
  EXPECT_THAT(fake::Effects(),
              ElementsAre("MEROWirelessAdapterNum()", "MEROWirelessInterfaceGet()", "PLIBNetIfUp(wlan0)",
                          ReportOf("191 Failed to activate network interface wlan0")));
}

TEST_F(Scan, TakesAnyAnswerButZeroForAnInterfaceThatIsUp) {
  fake::PLIBNetIfUp.Returns(-1);
  EXPECT_EQ(Run(), 0);
}

TEST_F(Scan, FailsWhenTheFreshScanCannotBeStarted) {
  fake::system.Returns(-1);
  EXPECT_EQ(Run(WIRELESS_SCAN_RENEW), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(After(
                  {kScansAfresh, ReportOf("200 Failed to execute '/sbin/iwlist wlan0 scanning > /dev/null 2>&1'")})));
}

TEST_F(Scan, DoesNotMindHowTheFreshScanEnds) {
  for (const int status : {1, 256, 65280, INT_MAX}) {
    fake::system.Returns(status);
    EXPECT_EQ(Run(WIRELESS_SCAN_RENEW), 0) << status;
    ring_.Clear();
  }
}

// The log line of a reading.
struct Outcome {
  const char* szLine;
  const char* szText;
};
constexpr Outcome kFailed = {"162", "failed."};
constexpr Outcome kSuccess = {"164", "success."};
constexpr Outcome kNothing = {"167", "no scan result."};
constexpr Outcome kUnstable = {"169", "result is un-stable."};

// How many networks each reading of a scan has, negative for one that cannot be taken, and what is said of it.
struct Course {
  std::vector<int> readings;
  std::vector<Outcome> outcomes;
};

const Course kCourses[] = {
    {{3, 3}, {kUnstable, kSuccess}},
    {{1, 2, 2}, {kUnstable, kUnstable, kSuccess}},
    {{0, 3, 3}, {kNothing, kUnstable, kSuccess}},
    {{3, 0, 3, 3}, {kUnstable, kNothing, kUnstable, kSuccess}},
    {{1, 2, 3, 4, 4}, {kUnstable, kUnstable, kUnstable, kUnstable, kSuccess}},
    {{2, 3, 4, 5, 6}, {kUnstable, kUnstable, kUnstable, kUnstable, kUnstable}},
    {{3, 2, 3, 2, 3}, {kUnstable, kUnstable, kUnstable, kUnstable, kUnstable}},
    {{0, 0, 0, 0, 0}, {kNothing, kNothing, kNothing, kNothing, kNothing}},
    {{1, 2, 3, 4, 0}, {kUnstable, kUnstable, kUnstable, kUnstable, kNothing}},
    {{-1, 3, 3}, {kFailed, kUnstable, kSuccess}},
    {{3, -1, 3, 3}, {kUnstable, kFailed, kUnstable, kSuccess}},
    {{-1, -1, -1, -1, 2}, {kFailed, kFailed, kFailed, kFailed, kUnstable}},
    {{-1, -1, -1, -1, 0}, {kFailed, kFailed, kFailed, kFailed, kNothing}},
    {{-1, -1, -1, -1, -1}, {kFailed, kFailed, kFailed, kFailed, kFailed}},
    {{1, 2, 3, 4, -1}, {kUnstable, kUnstable, kUnstable, kUnstable, kFailed}},
};

TEST_F(Scan, TakesUpToFiveReadingsAndKeepsTheLast) {
  const std::string notOpened = "83 Failed to popen '/sbin/iwlist wlan0 scanning mero', errno=Too many open files";
  for (const auto& [readings, outcomes] : kCourses) {
    std::vector<fake::Output> outputs;
    std::vector<std::string> expected;
    for (size_t i = 0; i < readings.size(); ++i) {
      const bool opens = readings[i] >= 0;
      outputs.push_back(opens ? fake::Output(ListingOf(readings[i])) : fake::kNoPipe);
      expected.push_back(kListsLast);
      expected.push_back(opens ? kClosesPipe : ReportOf(notOpened));
      expected.push_back(ReportOf(outcomes[i].szLine + (" Scan " + std::to_string(i)) + ": " + outcomes[i].szText));
    }
    const bool fails = readings.back() < 0;
    if (fails) expected.push_back(ReportOf("204 Failed to get network scanning result"));
    const size_t listed = fails ? 0 : static_cast<size_t>(readings.back());

    BeginWithAdapter();
    fake::PipesGive(outputs);
    EXPECT_EQ(Run(), fails ? -1 : 0) << testing::PrintToString(readings);
    EXPECT_THAT(Steps(), ElementsAreArray(After(expected))) << testing::PrintToString(readings);
    EXPECT_EQ(ring_.Records().size(), listed) << testing::PrintToString(readings);
    EXPECT_EQ(memory::Held(), listed) << "records of earlier readings are left";
    ring_.Clear();
  }
}

TEST_F(Scan, EndsEveryPipeAndInheritsNoneToOtherCommands) {
  fake::popen.Does([](const char*, const char* szMode) { return fake::popen.Real("echo; echo", szMode); });
  fake::pclose.Does([](FILE* pipe) {
    EXPECT_NE(fcntl(fileno(pipe), F_GETFD) & FD_CLOEXEC, 0);
    return fake::pclose.Real(pipe);
  });
  EXPECT_EQ(Run(), 0);
  EXPECT_EQ(fake::popen.calls(), 5);
  EXPECT_EQ(fake::pclose.calls(), 5);
}

constexpr char kTool[] = "/usr/sbin/iwlist";

// The tool notes the words that it was called with, and lists one network when they are the right ones.
void InstallTool() {
  WriteScript(kTool,
              "for word; do printf '<%s>' \"$word\"; done >> /tmp/words; echo >> /tmp/words\n"
              "[ \"$3\" = mero ] || exit 1\n"
              "printf 'heading\\nheading\\n%s\\n' '" +
                  RowOf("6", "net") + "'\n");
  WriteText("/tmp/words", "");
}

TEST_F(Scan, RunsTheListingTool) {
  InstallTool();
  BeginWithAdapter();
  EXPECT_EQ(Run(WIRELESS_SCAN_RENEW), 0);
  EXPECT_EQ(ring_.Records().size(), 1u);
  EXPECT_EQ(ReadText("/tmp/words"), "<wlan0><scanning>\n<wlan0><scanning><mero>\n<wlan0><scanning><mero>\n");
}

// What a shell had created stood for nothing, since it was empty; and what the machine had there failed the test.
TEST_F(Scan, PassesAnyInterfaceNameOnAsOneInertWord) {
  InstallTool();
  ForgetCalls();
  for (const char* szName : {"a b",
                             "$(touch /tmp/x)",
                             "`touch /tmp/x`",
                             "a;touch /tmp/x",
                             "a|b",
                             "a&b",
                             "'",
                             "'';'''",
                             "\"",
                             "\\",
                             "*",
                             "~",
                             "#",
                             "a>/tmp/x",
                             "!",
                             "{a,b}",
                             "\t\n",
                             "\x80\xff",
                             "$IFS",
                             "''''''''''''''' "}) {
    BeginWithAdapter();
    fake::MEROWirelessInterfaceGet.Returns(szName);
    WriteText("/tmp/words", "");
    EXPECT_EQ(Run(WIRELESS_SCAN_RENEW), 0) << szName;
    const std::string word = "<" + std::string(szName) + ">";
    EXPECT_EQ(ReadText("/tmp/words"),
              word + "<scanning>\n" + word + "<scanning><mero>\n" + word + "<scanning><mero>\n");
    EXPECT_EQ(ring_.Records().size(), 1u) << szName;
    EXPECT_FALSE(HasIntruder()) << szName;
    ring_.Clear();
  }
}

TEST_F(Scan, NeverRunsACommandThatWouldBeCut) {
  const std::string name(200, 'i');
  fake::MEROWirelessInterfaceGet.Returns(name.c_str());
  EXPECT_EQ(Run(WIRELESS_SCAN_RENEW), -1);
  EXPECT_EQ(fake::system.calls(), 0);
  EXPECT_EQ(fake::Messages().back(),
            "wireless_network_scan:200 Failed to execute '" + ("/sbin/iwlist " + name).substr(0, 127) + "'");

  EXPECT_EQ(Run(WIRELESS_SCAN_LAST), -1);
  EXPECT_EQ(fake::popen.calls(), 0);
  EXPECT_THAT(fake::Messages(),
              testing::Contains("wireless_network_scan:83 Failed to popen '" + ("/sbin/iwlist " + name).substr(0, 127) +
                                "', errno=Argument list too long")
                  .Times(5));
}

}  // namespace
