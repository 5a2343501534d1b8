// import: takes the known networks and the access point's settings from a document.
#ifndef MERO_TOOLS_IMPORT_H
#define MERO_TOOLS_IMPORT_H

#include <string>

#include "work/program.h"

struct SettingsToImport {
  std::string file;  // "-" for the standard input
  bool networksAlone = false;
  bool dryRun = false;
};

// All of it, or nothing. Neither a connection nor an access point on the air is touched.
void Import(const Program& program, const SettingsToImport& wanted);

#endif  // MERO_TOOLS_IMPORT_H
