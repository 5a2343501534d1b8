// Network interfaces that a test makes, and what it sees of them.
#ifndef MERO_TESTS_PLATFORM_NETWORK_INTERFACES_H
#define MERO_TESTS_PLATFORM_NETWORK_INTERFACES_H

#include <gtest/gtest.h>

#include <string>

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

// Runs a command of the shell, which must succeed, and gives its output.
std::string Shell(const std::string& command);

#endif  // MERO_TESTS_PLATFORM_NETWORK_INTERFACES_H
