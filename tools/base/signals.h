// The signals by which somebody ends the program, while it waits for something.
#ifndef MERO_TOOLS_SIGNALS_H
#define MERO_TOOLS_SIGNALS_H

#include <csignal>
#include <initializer_list>

#include "common/descriptor.h"

// Blocks the signals that end the program, and `others`, as long as it lives; they make fd() readable instead. A signal
// that the program was started to ignore stays ignored. One may live within the life of another: the inner one hears.
class Signals {
 public:
  explicit Signals(std::initializer_list<int> others = {});
  Signals(const Signals&) = delete;
  Signals& operator=(const Signals&) = delete;
  ~Signals();

  int fd() const { return fd_.get(); }

  // The next one that has come, or 0.
  int Next() const;
  bool HasCome() const { return Next() != 0; }

  // Gives a child the mask that was there before all of them.
  static void RestoreMask();

 private:
  sigset_t before_;
  Descriptor fd_;
};

#endif  // MERO_TOOLS_SIGNALS_H
