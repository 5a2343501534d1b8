// Network interfaces that a test makes, what it sees of them, and programs that it runs beside them.
#ifndef MERO_TESTS_PLATFORM_NETWORK_INTERFACES_H
#define MERO_TESTS_PLATFORM_NETWORK_INTERFACES_H

#include <gtest/gtest.h>
#include <sys/types.h>

#include <string>
#include <vector>

#include "tests/support/shell.h"

// An Ethernet interface that is connected to nobody, for as long as the holder lives.
class NetworkInterface {
 public:
  explicit NetworkInterface(std::string name);
  NetworkInterface(const NetworkInterface&) = delete;
  NetworkInterface& operator=(const NetworkInterface&) = delete;
  ~NetworkInterface();

  unsigned flags() const;

  // Its IPv4 addresses, in order, each with a space behind it.
  std::string addresses() const;

 private:
  std::string name_;
};

// A program that runs until the holder ends.
class RunningProgram {
 public:
  explicit RunningProgram(const std::vector<const char*>& argv);
  RunningProgram(const RunningProgram&) = delete;
  RunningProgram& operator=(const RunningProgram&) = delete;
  ~RunningProgram();

 private:
  pid_t pid_;
};

#endif  // MERO_TESTS_PLATFORM_NETWORK_INTERFACES_H
