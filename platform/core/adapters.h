// The wireless adapters that are plugged in.
#ifndef MERO_PLATFORM_ADAPTERS_H
#define MERO_PLATFORM_ADAPTERS_H

#include "platform/base/result.h"

// How many there are; a failure when none was seen, and there may be one that could not be looked at.
Result<int> CountAdapters();

#endif  // MERO_PLATFORM_ADAPTERS_H
