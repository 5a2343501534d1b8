// Section files: what is read from them.
#include "readings.h"
#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::ElementsAre;

class SectionFile : public PlatformTest {
 protected:
  static std::vector<std::string> SectionsOf(std::string_view content) {
    WriteText(kFile, content);
    TextList list;
    const int count = PLIBCFileEnumSection(kFile, list.address());
    EXPECT_EQ(count, list.get()->nItem) << content;
    return list.items();
  }
};

TEST_F(SectionFile, ListsItsSectionsInOrder) {
  const struct {
    std::string_view content;
    std::vector<std::string> names;
  } rows[] = {
      {"", {}},
      {"junk\nKEY=value\n", {}},
      {"[a]", {"a"}},
      {"[b]\n[a]\n[c]\n", {"b", "a", "c"}},
      {"KEY=before\n[a]\n\tKEY=1\n\n# comment\n[b]\n", {"a", "b"}},
      {"[a]\r\nKEY=1\r\n[b]\r\n", {"a", "b"}},
      {"  [ two words ] \t\n", {"two words"}},
      {"[00:11:22:AA:BB:CC]\n", {"00:11:22:AA:BB:CC"}},
      {"[a]b\nx[c]\n[d\ne]\n[\n]\n[e]\n", {"e"}},
      {"[a]]\n[[b]\n", {"a]", "[b"}},
      {"[]\n", {""}},
      {"#[a]\n;[b]\nKEY=[c]\n", {}},
      {"[a]\n[A]\n[a]\n", {"a", "A", "a"}},
      {"[\xFF\xFE]\n", {"\xFF\xFE"}},
  };
  for (const auto& row : rows) EXPECT_EQ(SectionsOf(row.content), row.names) << row.content;
}

TEST_F(SectionFile, HasNoSectionsWhileItIsMissing) {
  TextList list;
  for (const char* szPath : {kMissing, kInMissingDirectory}) {
    EXPECT_EQ(PLIBCFileEnumSection(szPath, list.address()), 0);
    ExpectNothingFound(ERR_FILE_NOT_FOUND);
  }
  EXPECT_EQ(list.get()->nItem, 0);
}

TEST_F(SectionFile, AppendsItsSectionsToAList) {
  WriteText(kFile, "[b]\n[c]\n");
  TextList list;
  EXPECT_EQ(PLIBCFileEnumSection(kFile, list.address()), 2);
  EXPECT_EQ(PLIBCFileEnumSection(kFile, list.address()), 2);
  EXPECT_THAT(list.items(), ElementsAre("b", "c", "b", "c"));
}

TEST_F(SectionFile, GivesEachValueAsExactlyTheBytesBehindTheEqualsSign) {
  for (const Reading& row : SectionReadings()) {
    WriteText(kFile, row.text);
    TextHash hash;
    EXPECT_EQ(PLIBCFileGetSection(kFile, "RT [5370", hash.address()), 1) << Shortened(row.text);
    EXPECT_EQ(hash[row.key.c_str()], row.value.value_or("(none)")) << Shortened(row.text);
  }
}

TEST_F(SectionFile, GivesTheFirstOfSeveralSectionsOfOneName) {
  WriteText(kFile, "[a]\nFIRST=1\n[b]\n[A]\nSECOND=2\n");
  TextHash hash;
  EXPECT_EQ(PLIBCFileGetSection(kFile, "a", hash.address()), 1);
  EXPECT_EQ(hash["FIRST"], "1");
  EXPECT_EQ(hash["SECOND"], "(none)");
}

TEST_F(SectionFile, HasKeysOfSeveralWords) {
  WriteText(kFile, "[a]\ntwo words=value\n");
  TextHash hash;
  EXPECT_EQ(PLIBCFileGetSection(kFile, "a", hash.address()), 1);
  EXPECT_EQ(hash["two words"], "value");
}

TEST_F(SectionFile, LeavesInAHashWhatTheSectionDoesNotHold) {
  WriteText(kFile, "[a]\nKEY=new\n");
  TextHash hash{{"KEY", "old"}, {"OTHER", "kept"}};
  EXPECT_EQ(PLIBCFileGetSection(kFile, "a", hash.address()), 1);
  EXPECT_EQ(hash["KEY"], "new");
  EXPECT_EQ(hash["OTHER"], "kept");
}

TEST_F(SectionFile, GivesAnEmptySection) {
  WriteText(kFile, "[a]\n[b]\nKEY=other\n");
  TextHash hash;
  EXPECT_EQ(PLIBCFileGetSection(kFile, "a", hash.address()), 1);
  EXPECT_EQ(hash["KEY"], "(none)");
}

TEST_F(SectionFile, HasNoSectionButThoseWithAHeader) {
  TextHash hash;
  for (const char* szContent : {"", "a\n", "[ab]\n", "[b]\nKEY=[a]\n", "#[a]\n", "[a\n", "x[a]\n"}) {
    WriteText(kFile, szContent);
    EXPECT_EQ(PLIBCFileGetSection(kFile, "a", hash.address()), 0) << szContent;
    ExpectNothingFound(ERR_SECTION_NOT_FOUND);
  }
  EXPECT_EQ(PLIBCFileGetSection(kMissing, "a", hash.address()), 0);
  ExpectNothingFound(ERR_FILE_NOT_FOUND);
}

TEST_F(SectionFile, ReadsLinesAndNamesOfAnyLength) {
  const std::string name(100'000, 'n');
  const std::string value(1'000'000, 'v');
  EXPECT_THAT(SectionsOf("[" + name + "]\nKEY=" + value + "\n"), ElementsAre(name));
  TextHash hash;
  EXPECT_EQ(PLIBCFileGetSection(kFile, name.c_str(), hash.address()), 1);
  EXPECT_EQ(hash["KEY"], value);
}

TEST_F(SectionFile, ThatCannotBeReadIsReported) {
  TextList list;
  EXPECT_EQ(PLIBCFileEnumSection(kDirectory, list.address()), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to read /tmp/platform: Invalid argument");
  TextHash hash;
  EXPECT_EQ(PLIBCFileGetSection(kDirectory, "a", hash.address()), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to read /tmp/platform: Invalid argument");
}

TEST_F(SectionFile, RefusesNullArguments) {
  TextList list;
  PPLIBSZLIST noList = nullptr;
  EXPECT_EQ(PLIBCFileEnumSection(nullptr, list.address()), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileEnumSection(kFile, nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileEnumSection(kFile, &noList), -1);
  ExpectNullRefused();

  TextHash hash;
  PPLIBSZHASH noHash = nullptr;
  EXPECT_EQ(PLIBCFileGetSection(nullptr, "a", hash.address()), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileGetSection(kFile, nullptr, hash.address()), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileGetSection(kFile, "a", nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileGetSection(kFile, "a", &noHash), -1);
  ExpectNullRefused();
}

}  // namespace
