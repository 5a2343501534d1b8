// The commands about the stations of the access point.
#ifndef MERO_TOOLS_COMMANDS_STATIONS_H
#define MERO_TOOLS_COMMANDS_STATIONS_H

#include <string>

#include "work/program.h"

void ShowStations(const Program& program);

// Makes the station with an address leave.
void KickStation(const Program& program, const std::string& address);

#endif  // MERO_TOOLS_COMMANDS_STATIONS_H
