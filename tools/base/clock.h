// Moments as text.
#ifndef MERO_TOOLS_CLOCK_H
#define MERO_TOOLS_CLOCK_H

#include <ctime>
#include <string>

// "2026-11-20T11:35:28Z"
std::string UtcText(std::time_t time);

// The moment of such a text; -1 when it is none.
std::time_t TimeOf(const std::string& text);

// By the clock on the wall, in a format of strftime().
std::string LocalText(std::time_t time, const char* szFormat);

#endif  // MERO_TOOLS_CLOCK_H
