// A command that is broken, for as long as the holder lives.
#ifndef MERO_TESTS_FAULT_COMMANDS_H
#define MERO_TESTS_FAULT_COMMANDS_H

#include <string>

#include "tests/fault/fault.h"

class BrokenCommand {
 public:
  explicit BrokenCommand(const Fault& fault);
  BrokenCommand(const BrokenCommand&) = delete;
  BrokenCommand& operator=(const BrokenCommand&) = delete;
  ~BrokenCommand();

 private:
  std::string path_;  // empty for none
};

#endif  // MERO_TESTS_FAULT_COMMANDS_H
