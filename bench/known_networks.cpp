// What known networks cost: listing them by their last save, and saving one; with the store in the kernel's cache
// (warm), and dropped from it before each time (cold).
//
// The store lies on the file system of the directory that the program is run in.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <vector>

#include "bench/support.h"
#include "common/known_networks_file.h"
#include "common/paths.h"
#include "common/text.h"
#include "platform.h"
#ifdef WITH_GLIB
#include "key_file.h"
#endif

namespace {

namespace fs = std::filesystem;

WIRELESS_NETWORK_CONFIG NetworkOf(int number) {
  WIRELESS_NETWORK_CONFIG config = {};
  CopyText(config.szKey, "correct horse battery " + std::to_string(number));
  CopyText(config.szIp, "192.168.1.2");
  CopyText(config.szMask, "255.255.255.0");
  CopyText(config.szGateway, "192.168.1.1");
  CopyText(config.network.szEssid, "Network " + std::to_string(number));
  for (int i = 3; i < 6; ++i) config.network.bssid[i] = static_cast<unsigned char>(number >> (8 * (5 - i)));
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  config.network.auth = WIRELESS_AUTH_WPA2PSK;
  config.network.encrypt = WIRELESS_ENCRYPT_AES;
  return config;
}

// The store's section of one network, saved at some time or other.
std::string SectionOf(int number) {
  const WIRELESS_NETWORK_CONFIG config = NetworkOf(number);
  char szBssid[18];
  MEROWirelessBssidStringGet(config.network.bssid, szBssid, sizeof szBssid);
  const int64_t time = 1'600'000'000 + int64_t{number} * 38'196'601 % 100'000'000;
  char szSection[1024];
  const int size = std::snprintf(szSection, sizeof szSection,
                                 "[%s]\n\tKEY=%s\n\tIPADDR=%s\n\tNETMASK=%s\n\tGATEWAY=%s\n\tESSID=%s\n\tBSSID=%s\n"
                                 "\tMODE=MANAGED\n\tACCESS_TIME=%lld\n\tAUTH=WPA2PSK\n\tENCRYPT=AES\n",
                                 szBssid, config.szKey, config.szIp, config.szMask, config.szGateway,
                                 config.network.szEssid, szBssid, static_cast<long long>(time));
  return {szSection, static_cast<size_t>(size)};
}

// Makes a store of so many networks, and lets its times settle as those of any store have that was not just written.
void MakeStore(int64_t networks) {
  std::ofstream store(kKnownNetworksPath, std::ios::trunc);
  for (int i = 0; i < networks; ++i) store << SectionOf(i);
  store.close();
  Require(store.good(), "make a store");
  const auto age = [] { return fs::file_time_type::clock::now() - fs::last_write_time(kKnownNetworksPath); };
  while (age() < std::chrono::milliseconds(100)) std::this_thread::sleep_for(std::chrono::milliseconds(5));
}

enum class Cache { kWarm, kCold };

// Whether any page of an open file is in the kernel's cache.
bool IsCached(int file) {
  struct stat info;
  Require(::fstat(file, &info) == 0, "look at the store");
  const auto size = static_cast<size_t>(info.st_size);
  void* map = ::mmap(nullptr, size, PROT_READ, MAP_SHARED, file, 0);
  Require(map != MAP_FAILED, "map the store");
  std::vector<unsigned char> pages(size / static_cast<size_t>(::getpagesize()) + 1);
  Require(::mincore(map, size, pages.data()) == 0 && ::munmap(map, size) == 0, "look for the store in the cache");
  return std::ranges::any_of(pages, [](unsigned char page) { return (page & 1) != 0; });
}

// Drops the store from the kernel's cache. A page that is just being put there stays the first time.
void DropStore() {
  const int store = ::open(kKnownNetworksPath, O_RDONLY | O_CLOEXEC);
  Require(::fdatasync(store) == 0, "flush the store");
  for (int tries = 0; IsCached(store); ++tries) {
    Require(tries < 100 && ::posix_fadvise(store, 0, 0, POSIX_FADV_DONTNEED) == 0, "drop the store from the cache");
  }
  ::close(store);
}

// Measures some work on a store of as many networks as the benchmark is for. Each time takes the number of the round.
template <class Work>
void Measure(benchmark::State& state, Cache cache, Work work) {
  MakeStore(state.range(0));
  int64_t round = 0;
  for (auto _ : state) {
    if (cache == Cache::kCold) {
      state.PauseTiming();
      DropStore();
      state.ResumeTiming();
    }
    work(round++);
  }
  using Counter = benchmark::Counter;
  state.counters["per_network"] =
      Counter(static_cast<double>(state.range(0)), Counter::kIsIterationInvariantRate | Counter::kInvert);
  state.SetComplexityN(state.range(0));
}

void EnumerateByLastSave(benchmark::State& state, Cache cache) {
  Measure(state, cache, [&](int64_t) {
    WIRELESS_LIST head;
    Require(MEROWirelessConfEnumByAtime(&head) == 0 && CountAndFree<WIRELESS_NETWORK_CONFIG>(head) == state.range(0),
            "enumerate");
  });
}

#ifdef WITH_GLIB
void LoadAndSortAsKeyFile(benchmark::State& state, Cache cache) {
  Measure(state, cache, [&](int64_t) {
    Require(SortedGroupsOfKeyFile(kKnownNetworksPath) == static_cast<size_t>(state.range(0)), "load a key file");
  });
}
#endif

// The least that anything can do that looks at the whole store.
void ReadStore(benchmark::State& state, Cache cache) {
  Measure(state, cache, [](int64_t) {
    const int store = ::open(kKnownNetworksPath, O_RDONLY | O_CLOEXEC);
    struct stat info;
    Require(::fstat(store, &info) == 0, "read the store");
    const auto size = static_cast<size_t>(info.st_size);
    void* room = std::malloc(size);
    Require(::read(store, room, size) == info.st_size && ::close(store) == 0, "read the store");
    benchmark::DoNotOptimize(room);
    std::free(room);
  });
}

// Each time with another secret of the same length: what is there already would not be written.
void SaveOne(benchmark::State& state, Cache cache) {
  Measure(state, cache, [&](int64_t round) {
    WIRELESS_NETWORK_CONFIG config = NetworkOf(static_cast<int>(round % state.range(0)));
    config.szKey[0] = static_cast<char>('a' + round / state.range(0) % 26);
    Require(MEROWirelessConfSet(&config) == 0, "save");
  });
}

void WriteFsyncRename(benchmark::State& state, bool flushDirectory) {
  std::string content;
  for (int i = 0; i < state.range(0); ++i) content += SectionOf(i);
  Measure(state, Cache::kWarm, [&](int64_t) { Replace(kKnownNetworksPath, content, flushDirectory); });
}

void ForTenToTenThousand(benchmark::internal::Benchmark* benchmark) {
  benchmark->RangeMultiplier(10)->Range(10, 10'000)->Complexity(benchmark::oN);
}

void OnTheClock(benchmark::internal::Benchmark* benchmark) {
  benchmark->Apply(ForTenToTenThousand)->UseRealTime();
}

BENCHMARK_CAPTURE(EnumerateByLastSave, warm, Cache::kWarm)->Apply(ForTenToTenThousand);
BENCHMARK_CAPTURE(EnumerateByLastSave, cold, Cache::kCold)->Apply(OnTheClock);
#ifdef WITH_GLIB
BENCHMARK_CAPTURE(LoadAndSortAsKeyFile, warm, Cache::kWarm)->Apply(ForTenToTenThousand);
BENCHMARK_CAPTURE(LoadAndSortAsKeyFile, cold, Cache::kCold)->Apply(OnTheClock);
#endif
BENCHMARK_CAPTURE(ReadStore, warm, Cache::kWarm)->Apply(ForTenToTenThousand);
BENCHMARK_CAPTURE(ReadStore, cold, Cache::kCold)->Apply(OnTheClock);
BENCHMARK_CAPTURE(SaveOne, warm, Cache::kWarm)->Apply(OnTheClock);
BENCHMARK_CAPTURE(SaveOne, cold, Cache::kCold)->Apply(OnTheClock);
BENCHMARK_CAPTURE(WriteFsyncRename, one_or_the_other, false)->Apply(OnTheClock);
BENCHMARK_CAPTURE(WriteFsyncRename, the_new_one, true)->Apply(OnTheClock);

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return EXIT_FAILURE;

  MeasureOnDisk([] { benchmark::RunSpecifiedBenchmarks(); });
  return EXIT_SUCCESS;
}
