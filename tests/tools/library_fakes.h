// The library, in the hands of a test: the program under test comes upon these functions instead of the real ones. The
// texts of enumerations are the real ones.
#ifndef MERO_TESTS_TOOLS_LIBRARY_FAKES_H
#define MERO_TESTS_TOOLS_LIBRARY_FAKES_H

#include <sys/types.h>

#include <ctime>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "platform.h"
#include "wireless.h"

// Each function with the number of its parameters. Those that do something are recorded, and so is a scan that is not
// a look at the last one's results.
#define LIBRARY_QUERIES(FAKE)             \
  FAKE(MEROWirelessAdapterNum, 0)         \
  FAKE(MEROWirelessInterfaceGet, 0)       \
  FAKE(MEROWirelessCheckBlock, 0)         \
  FAKE(MEROWirelessConnStatusGet, 0)      \
  FAKE(MEROWirelessCurInfoGet, 2)         \
  FAKE(MEROWirelessConfEnum, 1)           \
  FAKE(MEROWirelessConfEnumByAtime, 1)    \
  FAKE(MEROWirelessNetworkScan, 2)        \
  FAKE(MEROWirelessApConfigSecNameGet, 2) \
  FAKE(MEROWirelessGetAPConfig, 2)        \
  FAKE(MEROWirelessTestAPMode, 0)         \
  FAKE(PLIBCFileCheckKeyValue, 4)

#define LIBRARY_ACTIONS(FAKE)            \
  FAKE(MEROWirelessConfSet, 1)           \
  FAKE(MEROWirelessNetworkConnect, 1)    \
  FAKE(MEROWirelessAdhocCreate, 1)       \
  FAKE(MEROWirelessIfconfigSet, 2)       \
  FAKE(MEROWirelessDefaultGatewaySet, 1) \
  FAKE(MEROWirelessNetworkDisconnect, 0) \
  FAKE(MEROWirelessSetAPConfig, 1)       \
  FAKE(MEROWirelessAPEnable, 0)          \
  FAKE(MEROWirelessAPDisable, 0)         \
  FAKE(MEROWirelessModeChange, 1)        \
  FAKE(PLIBCFileRemoveSection, 2)        \
  FAKE(PLIBCFileSetKeyValue, 4)          \
  FAKE(PLIBCFileSetSectionValue, 5)

namespace library {

#define DECLARE(name, count) extern std::function<decltype(::name)> name;
LIBRARY_QUERIES(DECLARE)
LIBRARY_ACTIONS(DECLARE)
#undef DECLARE

// An adapter that is not connected, and nothing known or in range; all that is asked for succeeds.
void Reset();

// What was done, in order, also in processes of the program's own. A fake adds what matters to a test.
void Record(std::string_view what);
std::vector<std::string> Calls();

WIRELESS_NETWORK Network(std::string_view name, WIRELESS_AUTH auth = WIRELESS_AUTH_WPA2PSK,
                         WIRELESS_ENCRYPT encrypt = WIRELESS_ENCRYPT_AES);

// The network "Home" as one that is known, with an address by DHCP.
WIRELESS_NETWORK_CONFIG Home();

// The settings of an access point, which is switched off.
MERO_AP_CONF Office();

void InRange(std::vector<WIRELESS_NETWORK> networks);
void Known(std::vector<WIRELESS_NETWORK_CONFIG> configs);
void Connected(std::string_view name);
void InCell(std::string_view name);
void SavedAp(const MERO_AP_CONF& conf);

// Who runs the program, 0 for root.
extern uid_t g_user;

// The time, where that is to be the same in every run; 0, as at first, for the machine's.
extern std::time_t g_now;
inline constexpr std::time_t kNow = 1795174528;  // 2026-11-20 11:35:28 UTC

// As a unit of the library reports.
void Report(const char* szUnit, const char* szMessage);

}  // namespace library

#endif  // MERO_TESTS_TOOLS_LIBRARY_FAKES_H
