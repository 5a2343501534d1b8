// A row of the table on a machine of its own.
#ifndef MERO_TESTS_FAULT_TABLE_APART_H
#define MERO_TESTS_FAULT_TABLE_APART_H

#include <sys/types.h>

#include <functional>

#include "tests/fault/faults.h"

// A child of this process, which enters a private machine and makes a tally there.
class Apart {
 public:
  explicit Apart(const std::function<Tally()>& make);
  Apart(const Apart&) = delete;
  Apart& operator=(const Apart&) = delete;

  bool IsDone() const;

  // To be called once: waits for the tally. What the tests' own parts expect in vain is among the losses.
  Tally Take();

 private:
  int memory_;
  pid_t child_;
};

#endif  // MERO_TESTS_FAULT_TABLE_APART_H
