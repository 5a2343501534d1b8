// Somebody else with an account on the machine.
#include "local_user.h"

#include <fcntl.h>
#include <grp.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <fstream>

namespace {

constexpr uid_t kNobody = 65534;

bool Becomes(uid_t user) {
  return ::setgroups(0, nullptr) == 0 && ::setgid(user) == 0 && ::setuid(user) == 0;
}

}  // namespace

bool RunAsLocalUser(const std::function<bool()>& act) {
  const pid_t pid = ::fork();
  if (pid == 0) ::_exit(Becomes(kNobody) && act() ? 0 : 1);
  int state = -1;
  return ::waitpid(pid, &state, 0) == pid && state == 0;
}

bool HasLocalUsers() {
  return RunAsLocalUser([] { return true; });
}

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
