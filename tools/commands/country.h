// The command about the country: country.
#ifndef MERO_TOOLS_COMMANDS_COUNTRY_H
#define MERO_TOOLS_COMMANDS_COUNTRY_H

#include <string>

#include "work/program.h"

void ShowCountry(const Program& program);

// Two letters; "none" or "00" for the rules that can be kept everywhere.
void SetCountry(const Program& program, const std::string& text);

#endif  // MERO_TOOLS_COMMANDS_COUNTRY_H
