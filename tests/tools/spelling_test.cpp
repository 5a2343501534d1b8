// What somebody has meant who has misspelt it.
#include "app/spelling.h"

#include <gtest/gtest.h>

namespace {

const std::vector<std::string> kWords = {"scan", "connect", "disconnect", "status", "watch", "ap", "--channel"};

TEST(Spelling, LeadsToTheNearestWord) {
  const std::pair<const char*, const char*> rows[] = {
      {"scna", "scan"},       {"can", "scan"},      {"scann", "scan"},          {"conect", "connect"},
      {"disc", "disconnect"}, {"statsu", "status"}, {"--chnanel", "--channel"}, {"app", "ap"},
  };
  for (const auto& [given, meant] : rows) EXPECT_EQ(Nearest(given, kWords), meant) << given;
}

TEST(Spelling, LeadsNowhereFromWhatIsFar) {
  for (const char* given : {"", "bogus", "xx", "sc", "--encryption"}) EXPECT_EQ(Nearest(given, kWords), "") << given;
  EXPECT_EQ(Nearest("scan", {}), "");
}

}  // namespace
