// What the contract of a function or an operation says of failures: what it reports, what it depends on, and where it
// does otherwise than all others, with the reason.
#ifndef MERO_TESTS_FAULT_CONTRACTS_H
#define MERO_TESTS_FAULT_CONTRACTS_H

#include <string>
#include <vector>

// Without an exception, what fails has reported so itself; what succeeds has done all its work, and its commands have
// run as without a fault; every file has a content that it has at some time in a call without a fault; nothing is left
// over; and after a failure, or when the process was killed, one more call makes everything good. A command that does
// not end keeps no call for ever.
enum class Exception {
  kSilent,        // a failure may be reported by nobody
  kBelow,         // a failure is reported by those alone whom the function calls
  kLess,          // it succeeds with less
  kNothingTried,  // it succeeds without doing anything, and says nothing, because the file could not be read
  kLeftOut,       // for the same cause, it succeeds without the change of the file, or without the command
  kTolerates,     // it succeeds without the change of the file, and reports that
  kUnnoticed,     // it succeeds without the change of the file, and does not notice
  kAnother,       // the file may be about another network
  kNarrower,      // the file may be for root alone
  kInPlace,       // the file is written from its beginning: it may be missing, or a part of it be there
  kUnflushed,     // the one file is renamed into its place without having been flushed
  kRefused,       // after a kill the file stays, for which the next call is refused and which it removes
  kPassedOver,    // after a kill the file stays, for which the next call does less, and which it removes
  kStays,         // after a kill a file stays whose name begins so, also behind the next call
  kMissed,        // after a failure or a kill, the next call does not bring the file into its good state
  kIgnores,       // it succeeds although the command has not run
  kRepeats,       // it may run the command more often
  kOtherWords,    // it may give the command other words
  kWaits,         // the command is waited for, however long it takes
  kRunsOn,        // the command is not waited for
};

// As it stands above.
const char* NameOf(Exception exception);

struct Excuse {
  Exception exception;
  std::string path;  // of the file or the command; empty when the exception is about none
  const char* szReason;
};

struct Contract {
  const char* szUnit;                 // that reports in the function's name; empty when any may
  std::vector<std::string> failures;  // how the last of its reports of a failure begins
  std::vector<std::string> commands;  // the programs that it runs
  std::vector<Excuse> excuses;
  bool setsCode = false;  // a failure sets the error code

  // Null when there is no such exception.
  const Excuse* Find(Exception exception, const std::string& path = {}) const;
};

// Of an exported function.
const Contract& ContractOf(const char* function);

#endif  // MERO_TESTS_FAULT_CONTRACTS_H
