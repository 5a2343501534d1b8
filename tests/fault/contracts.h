// What the contract of each exported function says of failures: what it reports, what it depends on, and where it does
// otherwise than all others, with the reason.
#ifndef MERO_TESTS_FAULT_CONTRACTS_H
#define MERO_TESTS_FAULT_CONTRACTS_H

#include <string>
#include <vector>

// Without an exception, a function that fails has reported so itself; one that succeeds has done all its work; every
// file has a content that it has at some time in a call without a fault; nothing is left over; and after a failure, or
// when the process was killed, one more call makes everything good.
enum class Exception {
  kSilent,        // a failure may be reported by nobody
  kBelow,         // a failure is reported by those alone whom the function calls
  kLess,          // it succeeds with less
  kNothingTried,  // it succeeds without doing anything, and says nothing
  kTolerates,     // it succeeds without the change of the file, and reports that
  kUnnoticed,     // it succeeds without the change of the file, and does not notice
  kAnother,       // the file may be about another network
  kNarrower,      // the file may be for root alone
  kOtherwise,     // the file may have what it has at no time without a fault
  kInPlace,       // the file is written from its beginning: it may be missing, or a part of it be there
  kUnflushed,     // the one file is renamed into its place without having been flushed
  kRefused,       // after a kill the file stays, for which the next call is refused and which it removes
  kPassedOver,    // after a kill the file stays, for which the next call does less, and which it removes
  kStays,         // after a kill a file stays whose name begins so
  kMissed,        // after a failure or a kill, the next call does not bring the file into its good state
};

struct Excuse {
  Exception exception;
  std::string path;  // of the file; empty when the exception is about none
  const char* szReason;
};

struct Contract {
  const char* szName;
  const char* szUnit;                 // that reports in the function's name
  std::vector<std::string> failures;  // how the last of its reports of a failure begins
  std::vector<std::string> commands;  // the programs that it runs
  std::vector<Excuse> excuses;

  // Null when there is no such exception.
  const Excuse* Find(Exception exception, const std::string& path = {}) const;
};

const Contract& ContractOf(const char* function);

#endif  // MERO_TESTS_FAULT_CONTRACTS_H
