// Files get the same modes whatever the caller's umask.
#ifndef MERO_COMMON_UMASK_H
#define MERO_COMMON_UMASK_H

#include <sys/stat.h>

// Sets the umask of this process, and so of the programs that it starts, until the holder ends.
class Umask {
 public:
  explicit Umask(mode_t mask) : before_(::umask(mask)) {}
  Umask(const Umask&) = delete;
  Umask& operator=(const Umask&) = delete;
  ~Umask() { ::umask(before_); }

 private:
  mode_t before_;
};

// The ordinary umask: only the owner may write.
inline constexpr mode_t kOrdinaryUmask = S_IWGRP | S_IWOTH;

#endif  // MERO_COMMON_UMASK_H
