// Saves what a network was joined by.
#ifndef MERO_TOOLS_SAVING_H
#define MERO_TOOLS_SAVING_H

#include <string>

#include "base/failure.h"
#include "model/library.h"

enum class Saving { kNothing, kDone, kFailed };

// Saves a network that has been joined, unless it is known just like that. With `isWhole` one that is known is changed
// as one thing, with all of its access points.
Saving SaveWhatWorked(const KnownNetwork& config, bool isWhole);

// The failure when it could not be saved. The connection stays.
Failure JoinedAndNotSaved(const std::string& name);

#endif  // MERO_TOOLS_SAVING_H
