// What meets faults.
#include "tests/fault/subjects.h"

#include "tests/fault/calls.h"

const std::vector<Subject>& AllSubjects() {
  static const std::vector<Subject> all = [] {
    std::vector<Subject> subjects;
    for (const Exported& function : ExportedFunctions()) {
      subjects.push_back({function.szName, function.prepare, function.call, ContractOf(function.szName)});
    }
    for (Subject& operation : PlatformOperations()) subjects.push_back(std::move(operation));
    return subjects;
  }();
  return all;
}
