// iwlist with two forms more: `iwlist INTERFACE scanning mero` (or `scan mero`) lists the scan results that the radio's
// driver holds, in the fixed columns of listing.h, and does not scan for them; with `unsupported` behind it, it tells
// which of them cannot be joined. Every other form is the ordinary tool's, which the package system has moved aside.
//
// While the radio scans, for whomever, these forms wait for the end of that, since a part of the results would look
// like all of them. `iwlist INTERFACE scanning` does so too, since the kernel would refuse it a scan of its own, and
// then has the ordinary tool show what was heard, unless that scan was not for all networks in range.
//
// Exit status: 0 listed, also when nothing is in range; 1 not listed, with the reason in one line on standard error
// and nothing on standard output; 127 the ordinary tool is not there, 126 it cannot be run; else the ordinary tool's.
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <string_view>

#include "appliance/sbin/listing.h"
#include "appliance/sbin/radio.h"
#include "common/scan_end.h"

namespace {

// Where the package moves wireless-tools' own aside to: that of Debian 12, and that of 13, which says /usr/sbin/iwlist.
constexpr const char* kOrdinaryTools[] = {"/sbin/iwlist.distrib", "/usr/sbin/iwlist.ordinary"};

// Longer than a radio takes that goes over all channels while it is connected.
constexpr std::chrono::seconds kPatience{10};

bool AsksForScan(int argc, char* argv[]) {
  if (argc < 3) return false;
  const std::string_view verb = argv[2];
  return verb == "scanning" || verb == "scan";
}

bool AsksForListing(int argc, char* argv[]) {
  if (!AsksForScan(argc, argv) || (argc != 4 && argc != 5) || std::string_view(argv[3]) != "mero") return false;
  return argc == 4 || std::string_view(argv[4]) == "unsupported";
}

int List(const char* interface, bool unsupported) {
  try {
    (void)nl80211::AwaitScanEnd(interface, kPatience);  // one that lasts longer is listed as far as it has come
    const auto reader = isatty(STDOUT_FILENO) != 0 ? iwlist::Reader::kTerminal : iwlist::Reader::kProgram;
    const auto networks = iwlist::ReadScanResults(interface);
    iwlist::Write(STDOUT_FILENO,
                  unsupported ? iwlist::ListingOfObstacles(networks) : iwlist::Listing(networks, reader));
    return EXIT_SUCCESS;
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "iwlist: %s\n", failure.what());
    return EXIT_FAILURE;
  }
}

// Whether somebody else's scan was under way and has heard all that there is, so that no other one is needed.
bool HasJustScanned(const char* interface) {
  try {
    return nl80211::AwaitScanEnd(interface, kPatience);
  } catch (const std::exception&) {
    return false;  // the ordinary tool finds out what is wrong
  }
}

// Runs the ordinary tool in place of this program; returns only when that cannot be done.
int HandOver(char* const argv[]) {
  for (const char* szTool : kOrdinaryTools) {
    execv(szTool, argv);
    if (errno == ENOENT) continue;
    std::fprintf(stderr, "iwlist: cannot run the ordinary tool %s: %s\n", szTool, std::strerror(errno));
    return 126;
  }
  std::fprintf(stderr, "iwlist: the ordinary tool is neither %s nor %s\n", kOrdinaryTools[0], kOrdinaryTools[1]);
  return 127;
}

}  // namespace

int main(int argc, char* argv[]) {
  if (AsksForListing(argc, argv)) return List(argv[1], argc == 5);
  char last[] = "last";
  char* const asToldLast[] = {argv[0], argv[1], argv[2], last, nullptr};
  const bool isHeard = argc == 3 && AsksForScan(argc, argv) && HasJustScanned(argv[1]);
  return HandOver(isHeard ? asToldLast : argv);
}
