// Somebody else with an account on the machine.
#include "tests/support/local_user.h"

#include <grp.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fstream>
#include <vector>

#include "tests/support/files.h"
#include "tests/support/processes.h"

namespace {

constexpr uid_t kNobody = 65534;

// Something that may be in the way of a file, with its name.
struct Obstacle {
  std::string name;
  std::function<bool(const std::string& path)> put;
};

std::vector<Obstacle> Obstacles(const std::string& victim) {
  const auto file = [](const std::string& path) {
    std::ofstream(path) << "PRODUCT=theirs\n[theirs]\n";
    return ::chmod(path.c_str(), 0666) == 0;
  };
  return {
      {"a file", file},
      {"a link to a file", [=](const std::string& path) { return ::symlink(victim.c_str(), path.c_str()) == 0; }},
      {"a link to nothing",
       [=](const std::string& path) { return ::symlink((victim + ".missing").c_str(), path.c_str()) == 0; }},
      {"a link to itself", [](const std::string& path) { return ::symlink(path.c_str(), path.c_str()) == 0; }},
      {"a pipe", [](const std::string& path) { return ::mkfifo(path.c_str(), 0666) == 0; }},
      {"a directory", [](const std::string& path) { return ::mkdir(path.c_str(), 0777) == 0; }},
      {"a directory with a file in it",
       [=](const std::string& path) { return ::mkdir(path.c_str(), 0777) == 0 && file(path + "/file"); }},
  };
}

bool Becomes(uid_t user) {
  return ::setgroups(0, nullptr) == 0 && ::setgid(user) == 0 && ::setuid(user) == 0;
}

}  // namespace

bool RunAsLocalUser(const std::function<bool()>& act) {
  return RunInChild([&] { return Becomes(kNobody) && act() ? 0 : 1; }) == 0;
}

bool HasLocalUsers() {
  return RunAsLocalUser([] { return true; });
}

void ObstructEachWay(const std::string& path, const std::string& victim, const std::function<void()>& clear,
                     const std::function<void()>& look) {
  int nObstacles = 0;
  for (const Obstacle& obstacle : Obstacles(victim)) {
    clear();
    SCOPED_TRACE(obstacle.name);
    ASSERT_TRUE(RunAsLocalUser([&] { return obstacle.put(path); }));
    look();
    EXPECT_EQ(ReadText(victim), "as was");
    EXPECT_FALSE(Exists(victim + ".missing"));
    ++nObstacles;
  }
  EXPECT_EQ(nObstacles, 7);
}

bool IsOurs(const std::string& path) {
  struct stat info;
  return ::lstat(path.c_str(), &info) == 0 && S_ISREG(info.st_mode) && info.st_uid == ::geteuid() && info.st_nlink == 1;
}
