// Hears what happens elsewhere while a call of the library lasts: a descriptor, and two calls.
#ifndef MERO_TOOLS_LISTENER_H
#define MERO_TOOLS_LISTENER_H

class Listener {
 public:
  // To be waited for; -1 while there is nothing to wait for. Readable when Receive() has something to do.
  virtual int fd() const = 0;

  // To be called a few times a second, before fd() is waited for.
  virtual void Tick() = 0;

  virtual void Receive() = 0;

 protected:
  ~Listener() = default;
};

#endif  // MERO_TOOLS_LISTENER_H
