// A daemon that calls end, and that is there again for the next one.
#ifndef MERO_TESTS_FAULT_DAEMON_H
#define MERO_TESTS_FAULT_DAEMON_H

#include <sys/types.h>

#include <string>
#include <vector>

class Daemon {
 public:
  // The name of the program, and its pid files.
  Daemon(std::string name, std::vector<std::string> pidFiles);
  Daemon(const Daemon&) = delete;
  Daemon& operator=(const Daemon&) = delete;
  ~Daemon();

  // Starts the daemon, unless it runs, and notes its process in those of its pid files that exist.
  void Renew();

 private:
  bool IsRunning() const;
  void Start();

  std::string name_;
  std::vector<std::string> pidFiles_;
  pid_t pid_ = -1;
};

#endif  // MERO_TESTS_FAULT_DAEMON_H
