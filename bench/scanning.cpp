// What a scan costs: the library's two readings of a listing, beside a program that reads as much and drops it. The
// listing is canned, so that no radio is needed, and nothing sleeps.
#include <benchmark/benchmark.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>

#include "bench/support.h"
#include "platform.h"
#include "private_machine.h"
#include "wireless.h"

// ---- The library comes upon these before it comes upon the real ones ----

extern "C" {

unsigned sleep(unsigned) {
  return 0;
}

// What the library reports of each reading would be measured with the log's daemon, if there is one.
void __syslog_chk(int, int, const char*, ...) {}
void syslog(int, const char*, ...) {}

int MEROWirelessAdapterNum(void) {
  return 1;
}

int PLIBNetIfUp(const char*) {
  return 1;
}

}  // extern "C"

namespace {

constexpr char kListing[] = "/tmp/listing";
constexpr char kTool[] = "/sbin/iwlist";

void InstallTool() {
  std::ofstream tool(kTool);
  tool << "#!/bin/sh\nexec cat " << kListing << "\n";
  tool.close();
  Require(tool.good() && ::chmod(kTool, 0755) == 0, "install the listing tool");
}

// A listing of so many networks.
void MakeListing(int64_t networks) {
  std::ofstream listing(kListing);
  listing << "CH   ESSID                            BSSID             SIGNAL PROTOCOL SECURITY\n----\n";
  for (int i = 0; i < networks; ++i) {
    char row[128];
    std::snprintf(row, sizeof row, "%-4d %-32s 02:00:00:%02X:%02X:%02X %6d %-9s %s\n", 1 + i % 13,
                  ("Network " + std::to_string(i)).c_str(), i >> 16 & 0xff, i >> 8 & 0xff, i & 0xff, -30 - i % 60,
                  "11b/g/n", "WPA2PSK/AES");
    listing << row;
  }
  listing.close();
  Require(listing.good(), "make a listing");
}

void Scan(benchmark::State& state) {
  MakeListing(state.range(0));
  for (auto _ : state) {
    WIRELESS_LIST head{&head, &head};
    Require(MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, &head) == 0 &&
                CountAndFree<WIRELESS_NETWORK>(head) == state.range(0),
            "scan");
  }
}
BENCHMARK(Scan)->RangeMultiplier(10)->Range(10, 1'000)->UseRealTime();

int64_t ReadAndDrop() {
  FILE* pipe = ::popen("/sbin/iwlist wlan0 scanning mero", "r");
  Require(pipe != nullptr, "read the listing");
  int64_t lines = 0;
  for (char line[512]; std::fgets(line, sizeof line, pipe) != nullptr;) ++lines;
  Require(::pclose(pipe) == 0, "read the listing");
  return lines;
}

void ReadTwiceAndDrop(benchmark::State& state) {
  constexpr int kHeadings = 2;
  MakeListing(state.range(0));
  for (auto _ : state) {
    for (int reading = 0; reading < 2; ++reading) Require(ReadAndDrop() == kHeadings + state.range(0), "count");
  }
}
BENCHMARK(ReadTwiceAndDrop)->RangeMultiplier(10)->Range(10, 1'000)->UseRealTime();

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return EXIT_FAILURE;
  EnterPrivateMachine();
  InstallTool();
  benchmark::RunSpecifiedBenchmarks();
  return EXIT_SUCCESS;
}
