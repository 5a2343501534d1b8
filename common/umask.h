// The caller's umask, which is to have no say in the modes of what is made on its behalf.
#ifndef MERO_COMMON_UMASK_H
#define MERO_COMMON_UMASK_H

#include <sys/stat.h>

// The umask of this process, and of the programs that it starts, for as long as the holder lives.
class Umask {
 public:
  explicit Umask(mode_t mask) : before_(::umask(mask)) {}
  Umask(const Umask&) = delete;
  Umask& operator=(const Umask&) = delete;
  ~Umask() { ::umask(before_); }

 private:
  mode_t before_;
};

// What programs have that nobody wants anything particular of: only the owner may write.
inline constexpr mode_t kOrdinaryUmask = S_IWGRP | S_IWOTH;

#endif  // MERO_COMMON_UMASK_H
