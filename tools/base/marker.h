// Files that tell by being there.
#ifndef MERO_TOOLS_MARKER_H
#define MERO_TOOLS_MARKER_H

#include <chrono>
#include <optional>
#include <string>

// How long ago a marker was made, by the clock on the wall; nothing without one. One that is not root's, or no plain
// file, tells of nothing: it stands where anyone may make files.
std::optional<std::chrono::nanoseconds> AgeOfMarker(const std::string& path);

#endif  // MERO_TOOLS_MARKER_H
