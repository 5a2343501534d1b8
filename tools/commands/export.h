// export: writes the known networks and the access point's settings into a document.
#ifndef MERO_TOOLS_EXPORT_H
#define MERO_TOOLS_EXPORT_H

#include <string>

#include "work/program.h"

struct SettingsToExport {
  std::string file;  // empty or "-" for the standard output
  bool secrets = false;
  bool networksAlone = false;
};

void Export(const Program& program, const SettingsToExport& wanted);

#endif  // MERO_TOOLS_EXPORT_H
