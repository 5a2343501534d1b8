// The text hash.
#include <algorithm>
#include <climits>
#include <ctime>

#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"

namespace {

class AHash : public PlatformTest {
 protected:
  static TextHash::Pairs Numbered(int count) {
    TextHash::Pairs pairs;
    for (int i = 0; i < count; ++i) pairs.emplace_back("key" + std::to_string(i), "value" + std::to_string(i));
    return pairs;
  }

  // The hash as a section, which shows its order.
  static std::string Written(const TextHash& hash) {
    EXPECT_EQ(PLIBCFileAddSection(kFile, "s", hash.get(), "%s=%s\n"), 1);
    const std::string text = ReadText(kFile);
    EXPECT_EQ(PLIBCSysUnlink(kFile), 0);
    return text;
  }
};

TEST_F(AHash, GivesTheValueOfEachKeyAndNullForOthers) {
  const TextHash hash{{"KEY", "value"}, {"", "of the empty key"}, {"EMPTY", ""}, {"key", "lower"}, {"\xFF", "\xFE"}};
  EXPECT_EQ(hash["KEY"], "value");
  EXPECT_EQ(hash["key"], "lower");
  EXPECT_EQ(hash[""], "of the empty key");
  EXPECT_EQ(hash["EMPTY"], "");
  EXPECT_EQ(hash["\xFF"], "\xFE");
  for (const char* szAbsent : {"Key", "KE", "KEY ", " KEY", "value"}) {
    EXPECT_EQ(PLIBCSzHashGetValue(hash.get(), szAbsent), nullptr) << szAbsent;
  }
}

TEST_F(AHash, KeepsCopiesOfBothTexts) {
  TextHash hash;
  char szKey[] = "KEY";
  char szValue[] = "value";
  EXPECT_EQ(PLIBCSzHashSetValue(hash.address(), szKey, szValue), 1);
  szKey[0] = szValue[0] = 'x';
  EXPECT_EQ(hash["KEY"], "value");
  EXPECT_EQ(hash["xEY"], "(none)");
}

TEST_F(AHash, ReplacesAValueAndKeepsThePlaceOfItsKey) {
  const TextHash hash{{"Z", "1"}, {"A", "2"}, {"M", "3"}, {"A", "longer than before"}, {"Z", ""}};
  EXPECT_EQ(Written(hash), "[s]\nZ=\nA=longer than before\nM=3\n");
}

TEST_F(AHash, MayBeGivenItsOwnTexts) {
  TextHash hash{{"A", "value"}, {"B", "other"}};
  EXPECT_EQ(PLIBCSzHashSetValue(hash.address(), "A", PLIBCSzHashGetValue(hash.get(), "A")), 1);
  EXPECT_EQ(PLIBCSzHashSetValue(hash.address(), "B", PLIBCSzHashGetValue(hash.get(), "A")), 1);
  EXPECT_EQ(hash["A"], "value");
  EXPECT_EQ(hash["B"], "value");
}

TEST_F(AHash, KeepsTheOrderOfAnyNumberOfKeys) {
  const TextHash::Pairs pairs = Numbered(10'000);
  const TextHash hash(pairs);
  std::string expected = "[s]\n";
  for (const auto& [key, value] : pairs) expected.append(key).append("=").append(value).append("\n");
  EXPECT_EQ(Written(hash), expected);
  for (const auto& [key, value] : pairs) ASSERT_EQ(hash[key.c_str()], value);
}

TEST_F(AHash, TakesAnySizeHint) {
  for (const int cbSize : {INT_MIN, -1, 0, 1, 1024, 1 << 20, INT_MAX}) {
    PPLIBSZHASH hash = PLIBCSzHashAlloc(cbSize);
    ASSERT_NE(hash, nullptr) << cbSize;
    EXPECT_EQ(PLIBCSzHashSetValue(&hash, "KEY", "value"), 1);
    EXPECT_STREQ(PLIBCSzHashGetValue(hash, "KEY"), "value");
    PLIBCSzHashFree(hash);
  }
}

// Processor time of this thread, so that a busy machine does not matter; the least of several.
double SecondsFor(const TextHash& hash, const TextHash::Pairs& keys) {
  const auto now = [] {
    timespec time;
    ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) / 1e9;
  };
  double least = 1e9;
  for (int round = 0; round < 5; ++round) {
    const double begin = now();
    for (const auto& [key, value] : keys) EXPECT_NE(PLIBCSzHashGetValue(hash.get(), key.c_str()), nullptr);
    least = std::min(least, now() - begin);
  }
  return least;
}

TEST_F(AHash, FindsAKeyAmongManyAsFastAsAmongFew) {
  const TextHash::Pairs few = Numbered(1'000);
  const double amongFew = SecondsFor(TextHash(few), few);
  const double amongMany = SecondsFor(TextHash(Numbered(100'000)), few);
  EXPECT_LT(amongMany, 20 * amongFew);  // chains that did not grow would take a hundred times as long
}

TEST_F(AHash, RefusesNullArguments) {
  TextHash hash;
  PPLIBSZHASH none = nullptr;
  EXPECT_EQ(PLIBCSzHashSetValue(nullptr, "KEY", "value"), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzHashSetValue(&none, "KEY", "value"), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzHashSetValue(hash.address(), nullptr, "value"), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzHashSetValue(hash.address(), "KEY", nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzHashGetValue(nullptr, "KEY"), nullptr);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSzHashGetValue(hash.get(), nullptr), nullptr);
  ExpectNullRefused();
  PLIBCSzHashFree(nullptr);
}

}  // namespace
