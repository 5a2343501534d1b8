// The signals by which somebody ends the program, while it waits for something.
#ifndef MERO_TOOLS_SIGNALS_H
#define MERO_TOOLS_SIGNALS_H

#include <csignal>

#include "descriptor.h"

// Holds the signals back from now on; they make fd() readable instead. One that the program was started to ignore
// stays ignored.
class Signals {
 public:
  Signals();
  Signals(const Signals&) = delete;
  Signals& operator=(const Signals&) = delete;
  ~Signals();

  int fd() const { return fd_.get(); }

  // Whether one has come.
  bool HasCome() const;

  // Gives a child the mask that was there before.
  void RestoreMask() const;

 private:
  sigset_t before_;
  Descriptor fd_;
};

#endif  // MERO_TOOLS_SIGNALS_H
