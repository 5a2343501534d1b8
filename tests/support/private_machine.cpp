// A machine of the test's own.
#include "private_machine.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <limits>
#include <string>

namespace {

// Every machine has this directory, and keeps it for mounts that come and go.
const std::string kUpper = "/mnt";

void Require(bool done, const std::string& what) {
  if (done) return;
  std::fprintf(stderr, "cannot set up a private machine: %s: %s\n", what.c_str(), std::strerror(errno));
  std::exit(EXIT_FAILURE);
}

void WriteTo(const std::string& path, const std::string& text) {
  const int fd = ::open(path.c_str(), O_WRONLY | O_CLOEXEC);
  Require(fd >= 0, path);
  Require(::write(fd, text.data(), text.size()) == static_cast<ssize_t>(text.size()), path);
  ::close(fd);
}

void Mount(const char* szType, const std::string& target, const std::string& options) {
  Require(::mount(szType, target.c_str(), szType, 0, options.c_str()) == 0, "mount " + target);
}

void MakeDirectory(const std::string& path) {
  Require(::mkdir(path.c_str(), 0755) == 0 || errno == EEXIST, "make " + path);
}

bool MakeMountsPrivate(const char* szPath) {
  return ::mount(nullptr, szPath, nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
}

bool IsTop() {
  struct stat here{};
  struct stat above{};
  Require(::stat(".", &here) == 0 && ::stat("..", &above) == 0, "the directory above");
  return here.st_dev == above.st_dev && here.st_ino == above.st_ino;
}

// Has "/", which somebody has changed to a plain directory (chroot), become a mount point. Until the mounts that it
// stands among are private, a new one would be seen by the machine outside: this climbs to the top of them first.
void MountRoot() {
  const std::string working = std::filesystem::current_path();
  const int root = ::open("/", O_PATH | O_DIRECTORY | O_CLOEXEC);
  Require(root >= 0 && ::chdir("/") == 0 && ::chroot(kUpper.c_str()) == 0, "leave " + kUpper);
  while (!IsTop()) Require(::chdir("..") == 0, "climb");
  Require(MakeMountsPrivate("."), "private mounts");
  Require(::fchdir(root) == 0 && ::mount(".", kUpper.c_str() + 1, nullptr, MS_BIND | MS_REC, nullptr) == 0, "mount /");
  Require(::chdir(kUpper.c_str() + 1) == 0 && ::chroot(".") == 0 && ::chdir(working.c_str()) == 0, "enter /");
  ::close(root);
}

// A user other than root becomes the root of a user namespace.
void EnterNamespaces() {
  const uid_t uid = ::getuid();
  const gid_t gid = ::getgid();
  const int user = uid == 0 ? 0 : CLONE_NEWUSER;
  Require(::unshare(CLONE_NEWNS | CLONE_NEWNET | user) == 0, "namespaces");
  if (user == 0) return;
  WriteTo("/proc/self/setgroups", "deny");
  WriteTo("/proc/self/uid_map", "0 " + std::to_string(uid) + " 1");
  WriteTo("/proc/self/gid_map", "0 " + std::to_string(gid) + " 1");
}

// Whether root is root of the machine, and not of a namespace of users alone.
bool IsRootOfAll() {
  unsigned inside = 0;
  unsigned outside = 0;
  unsigned users = 0;
  std::ifstream("/proc/self/uid_map") >> inside >> outside >> users;
  return users == std::numeric_limits<unsigned>::max();
}

// What an overlay notes of directories that are removed or renamed, it may note for a namespace of users in attributes
// that are anyone's alone.
void MakeWritable(const std::string& name) {
  const std::string upper = kUpper + "/" + name;
  const std::string work = upper + ".work";
  MakeDirectory(upper);
  MakeDirectory(work);
  static const std::string kNotes = IsRootOfAll() ? "" : ",userxattr";
  Mount("overlay", "/" + name, "lowerdir=/" + name + ",upperdir=" + upper + ",workdir=" + work + kNotes);
}

// What an appliance that is installed on the machine outside keeps.
void ForgetAppliance() {
  for (const char* path : {"/usr/mero", "/etc/dhcpd", "/etc/sysconfig", "/var/tmp/.wireless_current_connection"}) {
    std::error_code error;
    std::filesystem::remove_all(path, error);
    Require(!error, std::string("remove ") + path);
  }
}

}  // namespace

void EnterPrivateMachine() {
  ::umask(022);
  ::setenv("LC_ALL", "C", 1);
  EnterNamespaces();
  if (!MakeMountsPrivate("/")) {
    MountRoot();
    Require(MakeMountsPrivate("/"), "private mounts");
  }
  Mount("tmpfs", kUpper, "");
  for (const char* name : {"etc", "run", "tmp", "usr", "var"}) MakeWritable(name);
  ForgetAppliance();
  Mount("sysfs", "/sys", "");
  for (const char* path : {"/usr/mero", "/usr/mero/etc", "/var/tmp"}) MakeDirectory(path);
}
