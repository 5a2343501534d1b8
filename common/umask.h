// The caller's umask, which is to have no say in the modes of what is made on its behalf.
#ifndef MERO_COMMON_UMASK_H
#define MERO_COMMON_UMASK_H

#include <sys/stat.h>

// While it lives, what this process and the programs that it starts create can be written to by its owner alone, and be
// read by all who the creator lets.
class OrdinaryUmask {
 public:
  OrdinaryUmask() : before_(::umask(S_IWGRP | S_IWOTH)) {}
  OrdinaryUmask(const OrdinaryUmask&) = delete;
  OrdinaryUmask& operator=(const OrdinaryUmask&) = delete;
  ~OrdinaryUmask() { ::umask(before_); }

 private:
  mode_t before_;
};

#endif  // MERO_COMMON_UMASK_H
