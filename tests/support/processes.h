// Processes of a test, what becomes of them, and what is open in this one.
#ifndef MERO_TESTS_SUPPORT_PROCESSES_H
#define MERO_TESTS_SUPPORT_PROCESSES_H

#include <sys/types.h>

#include <functional>
#include <set>
#include <string>
#include <vector>

// Waits for a child; its exit status, or -1 when a signal has ended it.
int StatusOf(pid_t pid);

// Runs `act` in a child, whose exit status is what `act` gives.
int RunInChild(const std::function<int()>& act);

struct Ran {
  int status = -1;  // as StatusOf()
  std::string out;
  std::string err;
};

// A child without a terminal (it has called setsid()), whose outputs are kept. It is killed when the holder ends before
// it was waited for.
class StartedChild {
 public:
  explicit StartedChild(const std::function<int()>& act, const std::string& input = "");
  StartedChild(const StartedChild&) = delete;
  StartedChild& operator=(const StartedChild&) = delete;
  ~StartedChild();

  pid_t pid() const { return pid_; }
  std::string OutputSoFar() const;
  Ran Wait();

 private:
  pid_t pid_;
  int out_;
  int err_;
};

// In a child: becomes a program. Gives a status to exit with when it cannot.
int Become(const std::vector<std::string>& command);

// The descriptors that this process has open.
std::set<int> OpenDescriptors();

// Whether something becomes true within seconds.
bool Soon(const std::function<bool()>& happens, int seconds = 20);

#endif  // MERO_TESTS_SUPPORT_PROCESSES_H
