// What it costs to start the program, beside others of its kind and one that does nothing: processor time of the whole
// process, the loader's and the kernel's included. The directory that it is run in is that of the build; a root that
// the variable PEERS names has programs that are not installed, and their libraries.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>

#include "bench/support.h"

namespace {

struct Started {
  const char* szName;
  const char* szPath;
  const char* szOption;  // with which it does nothing but start
};

constexpr Started kPrograms[] = {
    {"true", "/bin/true", nullptr},           {"merowireless", "tools/merowireless", "--version"},
    {"wpa_cli", "/usr/sbin/wpa_cli", "-v"},   {"iw", "/usr/sbin/iw", "--version"},
    {"nmcli", "/usr/bin/nmcli", "--version"}, {"iwctl", "/usr/bin/iwctl", "--help"},
};

double SecondsOf(const timeval& time) {
  return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
}

// A program that is there, and what tells it where its libraries are.
struct Place {
  std::string path;
  std::string libraries;
};

// Runs a program to its end, with no output, and gives its processor time.
double Run(const Started& program, const Place& place) {
  posix_spawn_file_actions_t quiet;
  Require(::posix_spawn_file_actions_init(&quiet) == 0, "prepare");
  for (const int fd : {STDOUT_FILENO, STDERR_FILENO}) {
    Require(::posix_spawn_file_actions_addopen(&quiet, fd, "/dev/null", O_WRONLY, 0) == 0, "prepare");
  }
  char* const arguments[] = {const_cast<char*>(program.szName), const_cast<char*>(program.szOption), nullptr};
  char* const environment[] = {const_cast<char*>(place.libraries.c_str()), nullptr};
  pid_t pid = 0;
  Require(::posix_spawn(&pid, place.path.c_str(), &quiet, nullptr, arguments, environment) == 0, program.szName);
  ::posix_spawn_file_actions_destroy(&quiet);
  int status = 0;
  rusage usage{};
  Require(::wait4(pid, &status, 0, &usage) == pid && WIFEXITED(status) && WEXITSTATUS(status) == 0, program.szName);
  return SecondsOf(usage.ru_utime) + SecondsOf(usage.ru_stime);
}

// Installed, or among the peers; no value when it is not there.
std::optional<Place> PlaceOf(const Started& program, const std::string& peers) {
  for (const std::string& root : {std::string(), peers}) {
    const std::string path = root + program.szPath;
    const std::string libraries = root.empty() ? "" : "LD_LIBRARY_PATH=" + root + "/usr/lib/" MERO_LIBRARIES;
    if (::access(path.c_str(), X_OK) == 0) return Place{path, libraries};
  }
  return std::nullopt;
}

}  // namespace

int main(int argc, char** argv) {
  const char* szPeers = std::getenv("PEERS");
  const std::string peers = szPeers != nullptr ? szPeers : "";
  for (const Started& program : kPrograms) {
    const std::optional<Place> place = PlaceOf(program, peers);
    if (!place) {
      std::fprintf(stderr, "%s is not there, and not measured\n", program.szName);
      continue;
    }
    benchmark::RegisterBenchmark(program.szName, [&program, place](benchmark::State& state) {
      for (auto _ : state) state.SetIterationTime(Run(program, *place));
    })->UseManualTime();
  }
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return EXIT_FAILURE;
  benchmark::RunSpecifiedBenchmarks();
  return EXIT_SUCCESS;
}
