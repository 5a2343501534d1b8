// A failure for which the program knows no exit status of its own.
#include "model/failed.h"

#include <unistd.h>

Failure Failed(const std::string& what, const std::string& advice) {
  return {Exit::kFailed, what, ::geteuid() == 0 ? advice : "run it as root; -v shows what the library reports"};
}
