// The commands about the access point.
#ifndef MERO_TOOLS_ACCESS_POINT_H
#define MERO_TOOLS_ACCESS_POINT_H

#include <map>
#include <string>
#include <string_view>

#include "model/secrets.h"
#include "work/program.h"

struct ApChanges {
  std::map<std::string_view, std::string> settings;  // by key, as ApSettings() has them
  SecretSource secret;
  std::string guestKeyFile;
};

void ShowAp(const Program& program, bool showSecrets);
void SetAp(const Program& program, const ApChanges& changes);
void EnableAp(const Program& program);
void DisableAp(const Program& program);
void ShowApStatus(const Program& program);

#endif  // MERO_TOOLS_ACCESS_POINT_H
