// Key/value files, as a shell reads them.
#include <filesystem>

#include "readings.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::ElementsAre;

constexpr char kPlain[] = "%s=%s\n";
constexpr char kQuoted[] = "%s=\"%s\"\n";

class KeyValueFile : public PlatformTest {
 protected:
  // The value of a key in a file of that content; "(none)" when it is not found.
  static std::string ValueIn(std::string_view content, const char* szKey) {
    WriteText(kFile, content);
    char szValue[64] = "(none)";
    const int found = PLIBCFileGetKeyValue(kFile, szKey, szValue, sizeof szValue, 0);
    EXPECT_EQ(found, std::string_view(szValue) == "(none)" ? 0 : 1) << content;
    return szValue;
  }

  // The content of a file after a value was set in it.
  static std::string Set(std::string_view content, const char* szKey, const char* szValue,
                         const char* szFormat = kPlain) {
    WriteText(kFile, content);
    EXPECT_EQ(PLIBCFileSetKeyValue(kFile, szKey, szValue, szFormat), 1) << content;
    return ReadText(kFile);
  }
};

TEST_F(KeyValueFile, GivesTheValueThatAShellWouldSee) {
  for (const Reading& row : ValueReadings()) {
    WriteText(kFile, row.text);
    std::string value(256 * 1024, '\0');
    ASSERT_EQ(PLIBCFileGetKeyValue(kFile, row.key.c_str(), value.data(), value.size(), 0), row.value ? 1 : 0)
        << Shortened(row.text);
    EXPECT_EQ(value.c_str(), row.value.value_or("")) << Shortened(row.text);
    if (!row.value) ExpectNothingFound(ERR_KEY_NOT_FOUND);
  }
}

TEST_F(KeyValueFile, SwitchesOnWithTheExactWordAlone) {
  for (const Reading& row : SwitchReadings()) {
    WriteText(kFile, row.text);
    EXPECT_EQ(PLIBCFileCheckKeyValue(kFile, row.key.c_str(), "yes", 0), row.value == "yes" ? 1 : 0) << row.text;
  }
}

TEST_F(KeyValueFile, HasNoKeyWhileItIsMissing) {
  char szValue[8] = "as was";
  for (const char* szPath : {kMissing, kInMissingDirectory}) {
    EXPECT_EQ(PLIBCFileGetKeyValue(szPath, "KEY", szValue, sizeof szValue, 0), 0);
    ExpectNothingFound(ERR_FILE_NOT_FOUND);
    EXPECT_EQ(PLIBCFileCheckKeyValue(szPath, "KEY", "", 0), 0);
    ExpectNothingFound(ERR_FILE_NOT_FOUND);
    EXPECT_EQ(PLIBCFileRemoveKey(szPath, "KEY"), 0);
    ExpectNothingFound(ERR_FILE_NOT_FOUND);
  }
  EXPECT_STREQ(szValue, "as was");
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre());
}

TEST_F(KeyValueFile, CutsAValueToTheCallersBuffer) {
  WriteText(kFile, "KEY=value\n");
  const struct {
    size_t size;
    std::string_view buffer;
  } rows[] = {
      {0, {"xxxxxxxx", 8}},  {1, {"\0xxxxxxx", 8}}, {2, {"v\0xxxxxx", 8}},
      {5, {"valu\0xxx", 8}}, {6, {"value\0xx", 8}}, {7, {"value\0xx", 8}},
  };
  for (const auto& row : rows) {
    std::string buffer(8, 'x');
    EXPECT_EQ(PLIBCFileGetKeyValue(kFile, "KEY", buffer.data(), row.size, 0), 1);
    EXPECT_EQ(buffer, row.buffer) << row.size;
  }
}

TEST_F(KeyValueFile, HoldsAValueOnlyWhenItIsExactlyThat) {
  WriteText(kFile, "RUN=\"yes\"\nEMPTY=\nTWICE=yes\nTWICE=no\n");
  const struct {
    const char* szKey;
    const char* szExpected;
    int holds;
  } rows[] = {
      {"RUN", "yes", 1}, {"RUN", "YES", 0}, {"RUN", "ye", 0},  {"RUN", "yes ", 0}, {"RUN", "\"yes\"", 0},
      {"RUN", "", 0},    {"EMPTY", "", 1},  {"EMPTY", "x", 0}, {"TWICE", "no", 1}, {"TWICE", "yes", 0},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(PLIBCFileCheckKeyValue(kFile, row.szKey, row.szExpected, 0), row.holds) << row.szKey << row.szExpected;
  }
  EXPECT_EQ(PLIBCFileCheckKeyValue(kFile, "NONE", "", 0), 0);
  ExpectNothingFound(ERR_KEY_NOT_FOUND);
}

TEST_F(KeyValueFile, ChangesOneLineAndNoOtherByte) {
  const struct {
    std::string before;
    std::string after;
  } rows[] = {
      {"", "KEY=new\n"},
      {"KEY=old\n", "KEY=new\n"},
      {"KEY=old", "KEY=new\n"},
      {" KEY = 'old' \r\n", "KEY=new\n"},
      {"A=1\nKEY=old\nB=2\n", "A=1\nKEY=new\nB=2\n"},
      {"A=1\r\nKEY=old\r\nB=2\r\n", "A=1\r\nKEY=new\nB=2\r\n"},
      {"A=1\nB=2", "A=1\nB=2\nKEY=new\n"},
      {"A=1\nB=2\n", "A=1\nB=2\nKEY=new\n"},
      {"A=1\n\n\n", "A=1\n\n\nKEY=new\n"},
      {"# head\n\n  A = 1 \njunk\nKEY=old\n\n#KEY=old\nB=\"2\"",
       "# head\n\n  A = 1 \njunk\nKEY=new\n\n#KEY=old\nB=\"2\""},
      {"KEY=older\nKEY=old\nB=2\n", "KEY=older\nKEY=new\nB=2\n"},
      {std::string("A=\0\xFF\nKEY=old\n\0", 15), std::string("A=\0\xFF\nKEY=new\n\0", 15)},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(Set(row.before, "KEY", "new"), row.after) << row.before;
    EXPECT_EQ(ValueIn(row.after, "KEY"), "new") << row.before;
  }
}

TEST_F(KeyValueFile, TakesTheFormOfALineFromTheCaller) {
  EXPECT_EQ(Set("", "KEY", "a b", kQuoted), "KEY=\"a b\"\n");
  EXPECT_EQ(Set("", "KEY", " a ", kQuoted), "KEY=\" a \"\n");
  EXPECT_EQ(Set("", "KEY", "\"", kQuoted), "KEY=\"\"\"\n");
  EXPECT_EQ(Set("", "KEY", "", kQuoted), "KEY=\"\"\n");
  EXPECT_EQ(Set("", "KEY", "", kPlain), "KEY=\n");
  EXPECT_EQ(Set("", "KEY", "%s%n", kPlain), "KEY=%s%n\n");
  EXPECT_EQ(Set("", "%d", "v", kPlain), "%d=v\n");
  EXPECT_EQ(Set("", "KEY", "it's", "  %s = '%s'\n"), "  KEY = 'it's'\n");
}

TEST_F(KeyValueFile, StaysWhenAPairWouldNotReadBack) {
  const struct {
    const char* szKey;
    const char* szValue;
    const char* szFormat;
  } rows[] = {
      {"KEY", "two\nlines", kPlain}, {"KEY", "line\n", kPlain},
      {"KEY", "\n", kQuoted},        {"KEY", "v\nKEY2=w", kQuoted},
      {"KEY", " begins", kPlain},    {"KEY", "ends ", kPlain},
      {"KEY", "ends\r", kPlain},     {"KEY", "\"quoted\"", kPlain},
      {"KEY", "'quoted'", kPlain},   {"", "v", kPlain},
      {"A=B", "v", kPlain},          {"#KEY", "v", kPlain},
      {";KEY", "v", kPlain},         {" KEY", "v", kPlain},
      {"KEY ", "v", kPlain},         {"K\nEY", "v", kPlain},
      {"[KEY", "v]", kPlain},
  };
  for (const auto& row : rows) {
    WriteText(kFile, "KEY=old\n");
    EXPECT_EQ(PLIBCFileSetKeyValue(kFile, row.szKey, row.szValue, row.szFormat), -1) << row.szKey << row.szValue;
    ExpectFailure(ERR_BAD_PARAMETERS, "Failed to write /tmp/platform/file: Invalid argument");
    EXPECT_EQ(ReadText(kFile), "KEY=old\n") << row.szKey << row.szValue;
  }
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(KeyValueFile, StaysWhenTheFormatIsNoLineOfAPair) {
  for (const char* szFormat :
       {"",         "\n",          "%s\n",     "=%s\n",     "%s=%s",     "%s=%s%s\n", "%s=%s\n\n", "\n%s=%s\n",
        "%s=%d\n",  "%d=%s\n",     "%s=%n\n",  "%%s=%s\n",  "%s=%s%%\n", "%s=%s%\n",  "%s %s\n",   "#%s=%s\n",
        "%s=%5s\n", "%1$s=%2$s\n", "%s=%s#\n", "[%s=%s]\n", "x%s=%s\n",  "%s=\"%s'\n"}) {
    WriteText(kFile, "KEY=old\n");
    EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "new", szFormat), -1) << szFormat;
    ExpectFailure(ERR_BAD_PARAMETERS, "Failed to write /tmp/platform/file: Invalid argument");
    EXPECT_EQ(ReadText(kFile), "KEY=old\n") << szFormat;
  }
}

TEST_F(KeyValueFile, IsNotMadeForAPairThatIsRefused) {
  EXPECT_EQ(PLIBCFileSetKeyValue(kMissing, "KEY", "two\nlines", kPlain), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to write /tmp/platform/missing: Invalid argument");
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre());
}

// Up to the NUL it was another key.
TEST_F(KeyValueFile, HasNoPairWithANulInItsKey) {
  const std::string line("KEY\0S=other\n", 12);
  EXPECT_EQ(ValueIn(line, "KEY"), "(none)");
  EXPECT_EQ(Set(line, "KEY", "value"), line + "KEY=value\n");
}

TEST_F(KeyValueFile, IsMadeForEverybodyToRead) {
  EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "value", kPlain), 1);
  EXPECT_EQ(ReadText(kFile), "KEY=value\n");
  EXPECT_EQ(ModeOf(kFile), 0644u);
}

TEST_F(KeyValueFile, LosesEveryLineOfAKeyAndNoOtherByte) {
  const struct {
    std::string before;
    std::string after;
  } rows[] = {
      {"KEY=a\n", ""},
      {"KEY=a", ""},
      {"KEY=a\nKEY=b\n", ""},
      {"A=1\r\n KEY = 'a' \r\n#KEY=b\nkey=c\n\nKEY=d\nB=2", "A=1\r\n#KEY=b\nkey=c\n\nB=2"},
  };
  for (const auto& row : rows) {
    WriteText(kFile, row.before);
    EXPECT_EQ(PLIBCFileRemoveKey(kFile, "KEY"), 1) << row.before;
    EXPECT_EQ(ReadText(kFile), row.after) << row.before;
  }
}

TEST_F(KeyValueFile, IsNotReplacedWhenThereIsNoKeyToRemove) {
  WriteText(kFile, "A=1\n");
  std::filesystem::create_hard_link(kFile, "/tmp/platform/same");
  EXPECT_EQ(PLIBCFileRemoveKey(kFile, "KEY"), 0);
  ExpectNothingFound(ERR_KEY_NOT_FOUND);
  EXPECT_TRUE(std::filesystem::equivalent(kFile, "/tmp/platform/same"));
}

TEST_F(KeyValueFile, ThatCannotBeReadOrWrittenIsReported) {
  char szValue[8] = "as was";
  EXPECT_EQ(PLIBCFileGetKeyValue(kDirectory, "KEY", szValue, sizeof szValue, 0), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to read /tmp/platform: Invalid argument");
  EXPECT_EQ(PLIBCFileCheckKeyValue(kDirectory, "KEY", "value", 0), 0);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to read /tmp/platform: Invalid argument");
  EXPECT_EQ(PLIBCFileRemoveKey(kDirectory, "KEY"), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to read /tmp/platform: Invalid argument");
  EXPECT_EQ(PLIBCFileSetKeyValue(kInMissingDirectory, "KEY", "value", kPlain), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, "Failed to write /tmp/platform/missing/file: No such file or directory");
  EXPECT_STREQ(szValue, "as was");
}

TEST_F(KeyValueFile, RefusesNullArguments) {
  char szValue[8];
  EXPECT_EQ(PLIBCFileGetKeyValue(nullptr, "KEY", szValue, sizeof szValue, 0), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileGetKeyValue(kFile, nullptr, szValue, sizeof szValue, 0), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileGetKeyValue(kFile, "KEY", nullptr, sizeof szValue, 0), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileCheckKeyValue(nullptr, "KEY", "value", 0), 0);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileCheckKeyValue(kFile, nullptr, "value", 0), 0);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileCheckKeyValue(kFile, "KEY", nullptr, 0), 0);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileRemoveKey(nullptr, "KEY"), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileRemoveKey(kFile, nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileSetKeyValue(nullptr, "KEY", "value", kPlain), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileSetKeyValue(kFile, nullptr, "value", kPlain), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", nullptr, kPlain), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "value", nullptr), -1);
  ExpectNullRefused();
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre());
}

}  // namespace
