// What the settings of the access point cost: reading them, saving them, and writing the access-point daemon's file of
// them; beside the same bytes read or written, behind the same commands.
//
// The settings lie on the file system of the directory that the program is run in.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "bench/support.h"
#include "common/paths.h"
#include "common/text.h"
#include "wireless.h"
#ifdef WITH_GLIB
#include "key_file.h"
#endif

// The library comes upon this before it comes upon the real one: there is no interface to take down.
extern "C" int PLIBNetIfDown(const char*) {
  return 1;
}

namespace {

constexpr char kModel[] = "RT-5370";
constexpr char kHostFile[] = "/etc/hostapd/hostapd-wlan0-host.conf";

MERO_AP_CONF Settings() {
  MERO_AP_CONF conf = {};
  (void)MEROWirelessGetAPConfig(kModel, &conf);  // the defaults, unless they are saved
  conf.blEnable = TRUE;
  CopyText(conf.szSecName, kModel);
  CopyText(conf.hostapConf.szSSID, "Home");
  CopyText(conf.hostapConf.szBridge, "lbr0");
  conf.hostapConf.channel = 6;
  conf.hostapConf.encryption = AP_ENCRYPT_WPA_PSK;
  conf.hostapConf.encryptInfo.wpaPskInfo.wpaType = TYPE_WPA2;
  conf.hostapConf.encryptInfo.wpaPskInfo.encryptType = TYPE_CCMP;
  CopyText(conf.hostapConf.encryptInfo.wpaPskInfo.szPassPhrase, "correct horse battery");
  return conf;
}

// Runs a command, and drops what it says.
void RunAndDrop(const char* szCommand) {
  FILE* pipe = ::popen(szCommand, "r");
  Require(pipe != nullptr, szCommand);
  for (char line[512]; std::fgets(line, sizeof line, pipe) != nullptr;) continue;
  (void)::pclose(pipe);  // that grep finds nothing is no failure
}

void MakeDirectory() {
  const pid_t child = ::vfork();
  if (child == 0) {
    ::execl("/bin/mkdir", "mkdir", "-p", "/etc/hostapd", nullptr);
    ::_exit(EXIT_FAILURE);
  }
  int status = -1;
  Require(::waitpid(child, &status, 0) == child && status == 0, "run mkdir");
}

void Save() {
  MERO_AP_CONF conf = Settings();
  Require(MEROWirelessSetAPConfig(&conf) == TRUE, "save");
}

// ---- Reading ----

void Read_library(benchmark::State& state) {
  Save();
  MERO_AP_CONF conf;
  for (auto _ : state) Require(MEROWirelessGetAPConfig(kModel, &conf) > 0, "read");
}
BENCHMARK(Read_library)->UseRealTime();

void Read_floor(benchmark::State& state) {
  Save();
  char content[8192];
  for (auto _ : state) {
    const int file = ::open(kApSettingsPath, O_RDONLY | O_CLOEXEC);
    Require(::read(file, content, sizeof content) > 0 && ::close(file) == 0, "read");
  }
}
BENCHMARK(Read_floor)->UseRealTime();

// ---- Saving ----

// Each time with another channel: what is there already would not be written.
void Save_library(benchmark::State& state) {
  Save();
  MERO_AP_CONF conf = Settings();
  for (auto _ : state) {
    conf.hostapConf.channel = 17 - conf.hostapConf.channel;
    Require(MEROWirelessSetAPConfig(&conf) == TRUE, "save");
  }
}
BENCHMARK(Save_library)->UseRealTime();

void Save_floor(benchmark::State& state) {
  Save();
  const std::string content = ContentOf(kApSettingsPath);
  for (auto _ : state) {
    RunAndDrop("grep -i \"\\[RT-5370\\]\" /usr/mero/etc/wireless_ap.conf");
    Replace(kApSettingsPath, content);
  }
}
BENCHMARK(Save_floor)->UseRealTime();

#ifdef WITH_GLIB
void Read_peer(benchmark::State& state) {
  Save();
  for (auto _ : state) Require(SizeOfValuesInKeyFile(kApSettingsPath, kModel) > 0, "read a key file");
}
BENCHMARK(Read_peer)->UseRealTime();

void Save_peer(benchmark::State& state) {
  Save();
  for (auto _ : state) SaveGroupOfKeyFile(kApSettingsPath, kModel);
}
BENCHMARK(Save_peer)->UseRealTime();
#endif

// ---- The daemon's file ----

void Hostapd_library(benchmark::State& state) {
  Save();
  MERO_AP_CONF conf = Settings();
  for (auto _ : state) Require(MEROWirelessSetHostAPConf("wlan0", &conf.hostapConf) == TRUE, "write hostapd's file");
}
BENCHMARK(Hostapd_library)->UseRealTime();

void Hostapd_floor(benchmark::State& state) {
  MERO_AP_CONF conf = Settings();
  Require(MEROWirelessSetHostAPConf("wlan0", &conf.hostapConf) == TRUE, "write hostapd's file");
  const std::string content = ContentOf(kHostFile);
  for (auto _ : state) {
    RunAndDrop("ps | grep hostapd | grep wlan0 | awk {'print $1'}");
    MakeDirectory();
    const int file = ::open(kHostFile, O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    Require(::write(file, content.data(), content.size()) == static_cast<ssize_t>(content.size()), "write");
    Require(::close(file) == 0, "write");
  }
}
BENCHMARK(Hostapd_floor)->UseRealTime();

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return EXIT_FAILURE;
  MeasureOnDisk([] { benchmark::RunSpecifiedBenchmarks(); });
  return EXIT_SUCCESS;
}
