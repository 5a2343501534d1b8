// A failure for which the program knows no exit status of its own.
#ifndef MERO_TOOLS_FAILED_H
#define MERO_TOOLS_FAILED_H

#include <string>

#include "base/failure.h"

// A user who is not root is advised to be.
Failure Failed(const std::string& what, const std::string& advice = "-v shows what the library reports");

#endif  // MERO_TOOLS_FAILED_H
