// iwlist with two forms more: `iwlist INTERFACE scanning mero` (or `scan mero`) lists the scan results that the radio's
// driver holds, in the fixed columns of listing.h, and does not scan for them; with `unsupported` behind it, it tells
// which of them cannot be joined. Every other form is the ordinary tool's, which the package system has moved aside.
//
// Exit status: 0 listed, also when nothing is in range; 1 not listed, with the reason in one line on standard error
// and nothing on standard output; 127 the ordinary tool is not there, 126 it cannot be run; else the ordinary tool's.
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <string_view>

#include "appliance/sbin/listing.h"
#include "appliance/sbin/radio.h"

namespace {

constexpr char kOrdinaryTool[] = "/sbin/iwlist.distrib";

bool AsksForListing(int argc, char* argv[]) {
  if (argc != 4 && argc != 5) return false;
  const std::string_view verb = argv[2];
  if ((verb != "scanning" && verb != "scan") || std::string_view(argv[3]) != "mero") return false;
  return argc == 4 || std::string_view(argv[4]) == "unsupported";
}

int List(const char* interface, bool unsupported) {
  try {
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

// Runs the ordinary tool in place of this program; returns only when that cannot be done.
int HandOver(char* argv[]) {
  execv(kOrdinaryTool, argv);
  const int status = errno == ENOENT ? 127 : 126;
  std::fprintf(stderr, "iwlist: cannot run the ordinary tool %s: %s\n", kOrdinaryTool, std::strerror(errno));
  return status;
}

}  // namespace

int main(int argc, char* argv[]) {
  return AsksForListing(argc, argv) ? List(argv[1], argc == 5) : HandOver(argv);
}
