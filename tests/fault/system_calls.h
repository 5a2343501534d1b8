// System calls: what they are called, the errors that they can give, and what they are about.
#ifndef MERO_TESTS_FAULT_SYSTEM_CALLS_H
#define MERO_TESTS_FAULT_SYSTEM_CALLS_H

#include <string>
#include <vector>

struct SystemCall {
  int number = -1;
  std::string name;  // by which the C library knows it; where all calls count, " of a stream" for a pipe or a socket
};

// Null for a call that no operation on files makes: for memory, the time and the like.
const SystemCall* CallOnFiles(int number);

SystemCall AnyCall(int number);

bool IsSleep(int number);

// Whether an allocator makes it, which calls the kernel whenever it happens to need memory.
bool IsAllocators(int number);

// Which argument of the call is a path; -1 when none is.
int PathArgumentOf(int number);

// The errors that a system call of that name is made to give: those of a disk, of memory, of rights, and of signals.
const std::vector<int>& ErrorsOf(const std::string& name);

#endif  // MERO_TESTS_FAULT_SYSTEM_CALLS_H
