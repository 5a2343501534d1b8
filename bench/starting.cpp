// What it costs to start the program, beside others of its kind and one that does nothing: processor time of the whole
// process, the loader's and the kernel's included. The directory that it is run in is that of the build.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <string>

#include "bench/support.h"

namespace {

struct Started {
  const char* szName;
  const char* szPath;
  const char* szOption;  // with which it does nothing but start
};

constexpr Started kPrograms[] = {
    {"true", "/bin/true", nullptr},
    {"merowireless", "tools/merowireless", "--version"},
    {"wpa_cli", "/usr/sbin/wpa_cli", "-v"},
    {"iw", "/usr/sbin/iw", "--version"},
    {"nmcli", "/usr/bin/nmcli", "--version"},
    {"iwctl", "/usr/bin/iwctl", "--version"},
    {"connmanctl", "/usr/bin/connmanctl", "--version"},
};

double SecondsOf(const timeval& time) {
  return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
}

// Runs a program to its end, with no output, and gives its processor time.
double Run(const Started& program) {
  posix_spawn_file_actions_t quiet;
  Require(::posix_spawn_file_actions_init(&quiet) == 0, "prepare");
  for (const int fd : {STDOUT_FILENO, STDERR_FILENO}) {
    Require(::posix_spawn_file_actions_addopen(&quiet, fd, "/dev/null", O_WRONLY, 0) == 0, "prepare");
  }
  char* const arguments[] = {const_cast<char*>(program.szPath), const_cast<char*>(program.szOption), nullptr};
  pid_t pid = 0;
  Require(::posix_spawn(&pid, program.szPath, &quiet, nullptr, arguments, environ) == 0, program.szPath);
  ::posix_spawn_file_actions_destroy(&quiet);
  int status = 0;
  rusage usage{};
  Require(::wait4(pid, &status, 0, &usage) == pid && WIFEXITED(status), program.szPath);
  return SecondsOf(usage.ru_utime) + SecondsOf(usage.ru_stime);
}

}  // namespace

int main(int argc, char** argv) {
  for (const Started& program : kPrograms) {
    if (::access(program.szPath, X_OK) != 0) {
      std::fprintf(stderr, "%s is not there, and not measured\n", program.szPath);
      continue;
    }
    benchmark::RegisterBenchmark(program.szName, [&program](benchmark::State& state) {
      for (auto _ : state) state.SetIterationTime(Run(program));
    })->UseManualTime();
  }
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return EXIT_FAILURE;
  benchmark::RunSpecifiedBenchmarks();
  return EXIT_SUCCESS;
}
