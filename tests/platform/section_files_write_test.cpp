// Section files: what is written to them.
#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::ElementsAre;

constexpr char kFormat[] = "\t%s=%s\n";

class SectionFileThatIsWritten : public PlatformTest {
 protected:
  static std::string Add(std::string_view content, const char* szSection, const TextHash::Pairs& pairs) {
    WriteText(kFile, content);
    EXPECT_EQ(PLIBCFileAddSection(kFile, szSection, TextHash(pairs).get(), kFormat), 1) << content;
    return ReadText(kFile);
  }

  static std::string Set(std::string_view content, const char* szSection, const TextHash::Pairs& pairs,
                         const char* szNewName = nullptr) {
    WriteText(kFile, content);
    EXPECT_EQ(PLIBCFileSetSection(kFile, szSection, szNewName, TextHash(pairs).get(), kFormat), 1) << content;
    return ReadText(kFile);
  }

  static std::string SetValue(std::string_view content, const char* szKey, const char* szValue) {
    WriteText(kFile, content);
    EXPECT_EQ(PLIBCFileSetSectionValue(kFile, "a", szKey, szValue, kFormat), 0) << content;
    return ReadText(kFile);
  }

  static void ExpectRefused(int result, const std::string& what) {
    EXPECT_EQ(result, -1) << what;
    ExpectFailure(ERR_BAD_PARAMETERS, "Failed to write /tmp/platform/file: Invalid argument");
    EXPECT_EQ(ReadText(kFile), "[a]\n\tKEY=old\n") << what;
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file")) << what;
  }
};

TEST_F(SectionFileThatIsWritten, GetsANewSectionAtItsEndWithThePairsInOrder) {
  EXPECT_EQ(Add("", "a", {{"Z", "1"}, {"A", " 2 "}, {"M", ""}}), "[a]\n\tZ=1\n\tA= 2 \n\tM=\n");
  EXPECT_EQ(Add("[b]\n\tKEY=1\n", "a", {{"KEY", "v"}}), "[b]\n\tKEY=1\n[a]\n\tKEY=v\n");
  EXPECT_EQ(Add("[b]\r\nKEY=1\r\n\r\n", "a", {}), "[b]\r\nKEY=1\r\n\r\n[a]\n");
  EXPECT_EQ(Add("# no section, no line end", "a", {{"KEY", "v"}}), "# no section, no line end\n[a]\n\tKEY=v\n");
}

TEST_F(SectionFileThatIsWritten, GetsNoSecondSectionOfOneName) {
  EXPECT_EQ(Add("[A]\n\tKEY=rival\n[b]\n", "a", {{"KEY", "v"}}), "[A]\n\tKEY=v\n[b]\n");
}

TEST_F(SectionFileThatIsWritten, LosesASectionAndNoOtherByte) {
  const struct {
    const char* szBefore;
    const char* szAfter;
  } rows[] = {
      {"[a]\n", ""},
      {"[a]", ""},
      {"HEAD=1\n\n[b]\nK=b\n [ A ] \r\nK=a\n# of a\n\n[c]\nK=c", "HEAD=1\n\n[b]\nK=b\n[c]\nK=c"},
      {"[a]\nK=1\n[b]\nK=[a]\n[a]\nK=2\n", "[b]\nK=[a]\n"},
  };
  for (const auto& row : rows) {
    WriteText(kFile, row.szBefore);
    EXPECT_EQ(PLIBCFileRemoveSection(kFile, "a"), 1) << row.szBefore;
    EXPECT_EQ(ReadText(kFile), row.szAfter);
  }
  EXPECT_EQ(PLIBCFileRemoveSection(kFile, "c"), 0);
  EXPECT_EQ(PLIBCErrGet(), ERR_SECTION_NOT_FOUND);
  EXPECT_EQ(ReadText(kFile), "[b]\nK=[a]\n");
  EXPECT_EQ(PLIBCFileRemoveSection("/tmp/platform/missing", "a"), 0);
  EXPECT_EQ(PLIBCErrGet(), ERR_FILE_NOT_FOUND);
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
  EXPECT_EQ(PLIBCFileRemoveSection(kFile, nullptr), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Bad parameters");
}

TEST_F(SectionFileThatIsWritten, HasThePairsOfOneSectionReplacedAndNoOtherByte) {
  const struct {
    std::string before;
    std::string after;
  } rows[] = {
      {"[a]\n", "[a]\n\tK=1\n\tL=2\n"},
      {"[a]", "[a]\n\tK=1\n\tL=2\n"},
      {"[a]\nOLD=x\nK=y\n", "[a]\n\tK=1\n\tL=2\n"},
      {"[a]\nOLD=x", "[a]\n\tK=1\n\tL=2\n"},
      {"HEAD=1\n[b]\nK=b\n [ A ] \r\nK=a\n[c]\nK=c", "HEAD=1\n[b]\nK=b\n [ A ] \r\n\tK=1\n\tL=2\n[c]\nK=c"},
      {"[a]\n# first\n\nK=x\n# between\nOLD=y\n\n; last\n\n[b]\n",
       "[a]\n# first\n\n\tK=1\n\tL=2\n# between\n\n; last\n\n[b]\n"},
      {"[a]\r\n# first\r\nK=x\r\n# last\r\n[b]\r\n", "[a]\r\n# first\r\n\tK=1\n\tL=2\n# last\r\n[b]\r\n"},
      {"[a]\r\nK=x", "[a]\r\n\tK=1\n\tL=2\n"},
      {"[a]\njunk\n[b]\n", "[a]\n\tK=1\n\tL=2\njunk\n[b]\n"},
      {"[a]\n#last", "[a]\n\tK=1\n\tL=2\n#last"},
      {"[a]\nK=x\n[a]\nK=second\n", "[a]\n\tK=1\n\tL=2\n[a]\nK=second\n"},
      {std::string("[b]\n\0\xFF\r\n\n[a]\nK=x\n[c]\n\0", 22),
       std::string("[b]\n\0\xFF\r\n\n[a]\n\tK=1\n\tL=2\n[c]\n\0", 28)},
  };
  for (const auto& row : rows) EXPECT_EQ(Set(row.before, "a", {{"K", "1"}, {"L", "2"}}), row.after) << row.before;
}

TEST_F(SectionFileThatIsWritten, HasASectionEmptiedByAnEmptyHash) {
  EXPECT_EQ(Set("[a]\nK=1\n# kept\nL=2\n[b]\nK=b\n", "a", {}), "[a]\n# kept\n[b]\nK=b\n");
}

TEST_F(SectionFileThatIsWritten, HasASectionRenamed) {
  EXPECT_EQ(Set("[z]\n[A]\nK=1\n[c]\n", "a", {{"K", "2"}}, "b"), "[z]\n[b]\n\tK=2\n[c]\n");
  EXPECT_EQ(Set("[A]\n", "a", {}, "a"), "[a]\n");
}

TEST_F(SectionFileThatIsWritten, GetsASectionThatIsSetWhileAbsent) {
  EXPECT_EQ(Set("[b]\n", "a", {{"K", "1"}}), "[b]\n[a]\n\tK=1\n");
  EXPECT_EQ(Set("[b]", "a", {{"K", "1"}}, "new"), "[b]\n[new]\n\tK=1\n");
}

TEST_F(SectionFileThatIsWritten, HasOneKeyOfOneSectionSetAndNoOtherByte) {
  const struct {
    std::string before;
    std::string after;
  } rows[] = {
      {"", "[a]\n\tKEY=new\n"},
      {"[b]", "[b]\n[a]\n\tKEY=new\n"},
      {"[a]", "[a]\n\tKEY=new\n"},
      {"[a]\nKEY=old", "[a]\n\tKEY=new\n"},
      {"[a]\nA=1", "[a]\nA=1\n\tKEY=new\n"},
      {"[a]\nA=1\n KEY = old \r\nB=2\n[b]\nKEY=b\n", "[a]\nA=1\n\tKEY=new\nB=2\n[b]\nKEY=b\n"},
      {"[a]\nA=1\nB=2\n\n# trailing\n\n[b]\n", "[a]\nA=1\nB=2\n\tKEY=new\n\n# trailing\n\n[b]\n"},
      {"[a]\n\n# comment\n[b]\nKEY=b\n", "[a]\n\tKEY=new\n\n# comment\n[b]\nKEY=b\n"},
      {"KEY=before\n[b]\nKEY=b\n[A]\nkey=lower\n", "KEY=before\n[b]\nKEY=b\n[A]\nkey=lower\n\tKEY=new\n"},
      {"[a]\nKEY=1\nKEY=2\nB=3\n", "[a]\nKEY=1\n\tKEY=new\nB=3\n"},
      {"[a]\n[a]\nKEY=second\n", "[a]\n\tKEY=new\n[a]\nKEY=second\n"},
  };
  for (const auto& row : rows) EXPECT_EQ(SetValue(row.before, "KEY", "new"), row.after) << row.before;
}

TEST_F(SectionFileThatIsWritten, GivesBackEveryValueThatItTook) {
  for (const char* szBefore : {"[a]\n", "[a]\r\n", "[a]\r", "[a]\r\nKEY=x", "[a]\r\nKEY=x\r\n[b]\n", "[b]\r\n"}) {
    for (const char* szValue : {"", " ", "\t", "#", "[x]", "a=b", "\"q\"", "%s%n", "\xFF\xFE", "two words ", "\r x",
                                "\r", "\r\r", "ends\r", "\rends\r\r"}) {
      SetValue(szBefore, "KEY", szValue);
      TextHash hash;
      EXPECT_EQ(PLIBCFileGetSection(kFile, "a", hash.address()), 1);
      EXPECT_EQ(hash["KEY"], szValue) << szBefore;
      ASSERT_EQ(PLIBCFileSetSection(kFile, "a", nullptr, hash.get(), kFormat), 1);
      ASSERT_EQ(PLIBCFileSetSection(kFile, "a", "a", hash.get(), kFormat), 1);
      TextHash again;
      EXPECT_EQ(PLIBCFileGetSection(kFile, "a", again.address()), 1);
      EXPECT_EQ(again["KEY"], szValue) << szBefore;
    }
  }
}

TEST_F(SectionFileThatIsWritten, IsForTheOwnerAloneWhenItIsMade) {
  TextHash hash{{"KEY", "v"}};
  EXPECT_EQ(PLIBCFileAddSection("/tmp/platform/1", "a", hash.get(), kFormat), 1);
  EXPECT_EQ(PLIBCFileSetSection("/tmp/platform/2", "a", nullptr, hash.get(), kFormat), 1);
  EXPECT_EQ(PLIBCFileSetSectionValue("/tmp/platform/3", "a", "KEY", "v", kFormat), 0);
  for (const char* szPath : {"/tmp/platform/1", "/tmp/platform/2", "/tmp/platform/3"}) {
    EXPECT_EQ(ReadText(szPath), "[a]\n\tKEY=v\n");
    EXPECT_EQ(ModeOf(szPath), 0600u) << szPath;
  }
}

TEST_F(SectionFileThatIsWritten, StaysWhenAPairWouldNotReadBack) {
  const TextHash::Pairs pairs = {
      {"KEY", "two\nlines"}, {"KEY", "line\n"}, {"KEY", "v\n[b]"}, {"", "v"},      {"A=B", "v"},   {"#KEY", "v"},
      {";KEY", "v"},         {" KEY", "v"},     {"KEY ", "v"},     {"K\nEY", "v"}, {"[KEY", "v]"},
  };
  for (const auto& [key, value] : pairs) {
    WriteText(kFile, "[a]\n\tKEY=old\n");
    TextHash hash{{"GOOD", "value"}, {key, value}};
    ExpectRefused(PLIBCFileSetSectionValue(kFile, "a", key.c_str(), value.c_str(), kFormat), key + value);
    ExpectRefused(PLIBCFileAddSection(kFile, "b", hash.get(), kFormat), key + value);
    ExpectRefused(PLIBCFileSetSection(kFile, "a", nullptr, hash.get(), kFormat), key + value);
  }
}

TEST_F(SectionFileThatIsWritten, StaysWhenANameWouldNotReadBack) {
  const TextHash hash{{"KEY", "v"}};
  for (const char* szName : {"two\nlines", "line\n", " begins", "ends ", "\t", "ends\r"}) {
    WriteText(kFile, "[a]\n\tKEY=old\n");
    ExpectRefused(PLIBCFileAddSection(kFile, szName, hash.get(), kFormat), szName);
    ExpectRefused(PLIBCFileSetSection(kFile, szName, nullptr, hash.get(), kFormat), szName);
    ExpectRefused(PLIBCFileSetSection(kFile, "a", szName, hash.get(), kFormat), szName);
    ExpectRefused(PLIBCFileSetSectionValue(kFile, szName, "KEY", "v", kFormat), szName);
  }
}

TEST_F(SectionFileThatIsWritten, StaysWhenTheFormatIsNoLineOfAPair) {
  const TextHash hash{{"KEY", "v"}};
  for (const char* szFormat : {"", "%s\n", "%s=%s", "%s=%s%s\n", "%s=%s\n\n", "%s=%d\n", "%s=%n\n", "%%s=%s\n",
                               "%s=%s%\n", "#%s=%s\n", "%s= %s\n", "%s=\"%s\"\n", "[%s=%s]\n", "%s %s\n"}) {
    WriteText(kFile, "[a]\n\tKEY=old\n");
    ExpectRefused(PLIBCFileSetSectionValue(kFile, "a", "KEY", "v", szFormat), szFormat);
    ExpectRefused(PLIBCFileAddSection(kFile, "b", hash.get(), szFormat), szFormat);
    ExpectRefused(PLIBCFileSetSection(kFile, "a", nullptr, hash.get(), szFormat), szFormat);
  }
}

TEST_F(SectionFileThatIsWritten, IsNotMadeForWhatIsRefused) {
  EXPECT_EQ(PLIBCFileSetSectionValue(kMissing, "a", "KEY", "two\nlines", kFormat), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to write /tmp/platform/missing: Invalid argument");
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre());
}

TEST_F(SectionFileThatIsWritten, ReportsThatItCannotBe) {
  const TextHash hash;
  const char* szReport = "Failed to write /tmp/platform/missing/file: No such file or directory";
  EXPECT_EQ(PLIBCFileAddSection(kInMissingDirectory, "a", hash.get(), kFormat), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, szReport);
  EXPECT_EQ(PLIBCFileSetSection(kInMissingDirectory, "a", nullptr, hash.get(), kFormat), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, szReport);
  EXPECT_EQ(PLIBCFileSetSectionValue(kInMissingDirectory, "a", "KEY", "v", kFormat), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, szReport);
}

TEST_F(SectionFileThatIsWritten, RefusesNullArguments) {
  TextHash hash;
  PPLIBSZHASH h = hash.get();
  using Call = int (*)(PPLIBSZHASH);
  const Call calls[] = {
      [](PPLIBSZHASH x) { return PLIBCFileAddSection(nullptr, "a", x, kFormat); },
      [](PPLIBSZHASH x) { return PLIBCFileAddSection(kFile, nullptr, x, kFormat); },
      [](PPLIBSZHASH) { return PLIBCFileAddSection(kFile, "a", nullptr, kFormat); },
      [](PPLIBSZHASH x) { return PLIBCFileAddSection(kFile, "a", x, nullptr); },
      [](PPLIBSZHASH x) { return PLIBCFileSetSection(nullptr, "a", "b", x, kFormat); },
      [](PPLIBSZHASH x) { return PLIBCFileSetSection(kFile, nullptr, "b", x, kFormat); },
      [](PPLIBSZHASH) { return PLIBCFileSetSection(kFile, "a", "b", nullptr, kFormat); },
      [](PPLIBSZHASH x) { return PLIBCFileSetSection(kFile, "a", "b", x, nullptr); },
      [](PPLIBSZHASH) { return PLIBCFileSetSectionValue(nullptr, "a", "KEY", "v", kFormat); },
      [](PPLIBSZHASH) { return PLIBCFileSetSectionValue(kFile, nullptr, "KEY", "v", kFormat); },
      [](PPLIBSZHASH) { return PLIBCFileSetSectionValue(kFile, "a", nullptr, "v", kFormat); },
      [](PPLIBSZHASH) { return PLIBCFileSetSectionValue(kFile, "a", "KEY", nullptr, kFormat); },
      [](PPLIBSZHASH) { return PLIBCFileSetSectionValue(kFile, "a", "KEY", "v", nullptr); },
  };
  for (const Call call : calls) {
    EXPECT_EQ(call(h), -1);
    ExpectNullRefused();
  }
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre());
}

}  // namespace
