// What the kernel tells of the results of the last scan, without a look at what was heard.
#ifndef MERO_TOOLS_LAST_SCAN_H
#define MERO_TOOLS_LAST_SCAN_H

#include <chrono>
#include <optional>
#include <string>

#include "base/text.h"

struct LastScan {
  // How long ago the newest result was heard; nothing when there is none. The access point that the interface is joined
  // to does not count: the connection hears it all the time.
  std::optional<std::chrono::milliseconds> age;
  std::optional<Address> joined;  // the access point, or the cell, that the interface is joined to
};

LastScan ReadLastScan(const std::string& interface);

#endif  // MERO_TOOLS_LAST_SCAN_H
