// Hears what happens elsewhere while a call of the library lasts: a descriptor, and two calls.
#ifndef MERO_TOOLS_LISTENER_H
#define MERO_TOOLS_LISTENER_H

#include <chrono>

class Listener {
 public:
  // To be waited for; -1 while there is nothing to wait for. Readable when Receive() has something to do.
  virtual int fd() const = 0;

  // To be called before fd() is waited for, which may last no longer than that.
  virtual void Tick() = 0;
  virtual std::chrono::milliseconds interval() const = 0;

  virtual void Receive() = 0;

 protected:
  ~Listener() = default;
};

#endif  // MERO_TOOLS_LISTENER_H
