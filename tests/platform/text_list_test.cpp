// The text list.
#include <climits>
#include <cstddef>

#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::ElementsAre;

class AList : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    WriteText(kFile, "[b]\n[a]\n[b]\n[]\n");
    ASSERT_EQ(PLIBCFileEnumSection(kFile, list_.address()), 4);
  }

  TextList list_;
};

TEST_F(AList, GivesItsItemsByIndexAndNullForOthers) {
  EXPECT_THAT(list_.items(), ElementsAre("b", "a", "b", ""));
  for (const int index : {-1, 4, INT_MIN, INT_MAX}) EXPECT_EQ(PLIBCSzListGet(list_.get(), index), nullptr) << index;
}

TEST_F(AList, ShowsItsNumberOfItemsAsItsSecondNumber) {
  EXPECT_EQ(offsetof(PLIBSZLIST, nItem), sizeof(int32_t));
  EXPECT_EQ(sizeof(list_.get()->nItem), sizeof(int32_t));
  EXPECT_EQ(list_.get()->nItem, 4);
}

TEST_F(AList, FindsTheFirstItemThatEqualsATextExactly) {
  EXPECT_EQ(PLIBCSzListFind(list_.get(), "b"), 0);
  EXPECT_EQ(PLIBCSzListFind(list_.get(), "a"), 1);
  EXPECT_EQ(PLIBCSzListFind(list_.get(), ""), 3);
  for (const char* szAbsent : {"c", "A", "ab", "b "}) EXPECT_EQ(PLIBCSzListFind(list_.get(), szAbsent), -1) << szAbsent;
}

TEST_F(AList, ClosesTheGapOfARemovedItem) {
  EXPECT_EQ(PLIBCSzListRemove(list_.get(), 1), 0);
  EXPECT_THAT(list_.items(), ElementsAre("b", "b", ""));
  EXPECT_EQ(PLIBCSzListRemove(list_.get(), 2), 0);
  EXPECT_EQ(PLIBCSzListRemove(list_.get(), 0), 0);
  EXPECT_THAT(list_.items(), ElementsAre("b"));
  EXPECT_EQ(PLIBCSzListRemove(list_.get(), 0), 0);
  EXPECT_THAT(list_.items(), ElementsAre());
}

TEST_F(AList, StaysWhenThereIsNoItemToRemove) {
  for (const int index : {-1, 4, INT_MIN, INT_MAX}) {
    EXPECT_EQ(PLIBCSzListRemove(list_.get(), index), -1) << index;
    EXPECT_EQ(PLIBCErrGet(), ERR_BAD_PARAMETERS) << index;
  }
  EXPECT_THAT(list_.items(), ElementsAre("b", "a", "b", ""));
}

TEST_F(AList, CanBeFilledAgainAfterItemsWereRemoved) {
  EXPECT_EQ(PLIBCSzListRemove(list_.get(), 0), 0);
  ASSERT_EQ(PLIBCFileEnumSection(kFile, list_.address()), 4);
  EXPECT_THAT(list_.items(), ElementsAre("a", "b", "", "b", "a", "b", ""));
}

TEST_F(AList, GrowsBeyondAnySizeHint) {
  std::string content;
  for (int i = 0; i < 10'000; ++i) content += "[" + std::to_string(i) + "]\n";
  WriteText(kFile, content);
  for (const int cbSize : {INT_MIN, -1, 0, 1, 1024, 1 << 20, INT_MAX}) {
    PPLIBSZLIST list = PLIBCSzListAlloc(cbSize);
    ASSERT_NE(list, nullptr) << cbSize;
    EXPECT_EQ(list->nItem, 0);
    EXPECT_EQ(PLIBCFileEnumSection(kFile, &list), 10'000) << cbSize;
    for (int i = 0; i < list->nItem; ++i) ASSERT_EQ(PLIBCSzListGet(list, i), std::to_string(i));
    PLIBCSzListFree(list);
  }
}

TEST_F(AList, RefusesNullArguments) {
  EXPECT_EQ(PLIBCSzListGet(nullptr, 0), nullptr);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzListFind(nullptr, "a"), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzListFind(list_.get(), nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzListRemove(nullptr, 0), -1);
  ExpectNullRefused();
  PLIBCSzListFree(nullptr);
}

}  // namespace
