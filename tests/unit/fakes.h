// The world around the units, in the hands of a test.
//
// The test program has functions of its own under the names of those that the units call, libc's and the platform's,
// and the libraries come upon these first. Each call is recorded, and passed on to the real function unless the test
// says what it does instead:
//
//     fake::PLIBNetIfUp.Returns(0);
//     EXPECT_EQ(MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, &head), -1);
//     EXPECT_THAT(fake::Effects(), ElementsAre("MEROWirelessAdapterNum()", ..., "PLIBNetIfUp(wlan0)", ...));
//
// One function more is one row more in MERO_FAKES. What the platform's real functions call in turn is their own
// affair: of that, only what goes to libc is recorded and faked.
#ifndef MERO_TESTS_UNIT_FAKES_H
#define MERO_TESTS_UNIT_FAKES_H

#include <signal.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "memory.h"
#include "platform.h"
#include "tests/support/fake_functions.h"

// Every faked function, where it is from, and the number of its parameters. Two are apart: time() has NowIs() below,
// and what goes to syslog() is recorded and goes no further.
#define MERO_FAKES(FAKE)                              \
  FAKE(kill, kLibc, 2)                                \
  FAKE(pclose, kLibc, 1)                              \
  FAKE(popen, kLibc, 2)                               \
  FAKE(sleep, kLibc, 1)                               \
  FAKE(system, kLibc, 1)                              \
  FAKE(PLIBCErrSet, kPlatform, 1)                     \
  FAKE(PLIBCErrGet, kPlatform, 0)                     \
  FAKE(PLIBCSzHashAlloc, kPlatform, 1)                \
  FAKE(PLIBCSzHashFree, kPlatform, 1)                 \
  FAKE(PLIBCSzHashGetValue, kPlatform, 2)             \
  FAKE(PLIBCSzHashSetValue, kPlatform, 3)             \
  FAKE(PLIBCSzListAlloc, kPlatform, 1)                \
  FAKE(PLIBCSzListFree, kPlatform, 1)                 \
  FAKE(PLIBCSzListGet, kPlatform, 2)                  \
  FAKE(PLIBCSzListFind, kPlatform, 2)                 \
  FAKE(PLIBCSzListRemove, kPlatform, 2)               \
  FAKE(PLIBCFileExist, kPlatform, 1)                  \
  FAKE(PLIBCFileTouch, kPlatform, 1)                  \
  FAKE(PLIBCFileGetKeyValue, kPlatform, 5)            \
  FAKE(PLIBCFileSetKeyValue, kPlatform, 4)            \
  FAKE(PLIBCFileCheckKeyValue, kPlatform, 4)          \
  FAKE(PLIBCFileRemoveKey, kPlatform, 2)              \
  FAKE(PLIBCFileEnumSection, kPlatform, 2)            \
  FAKE(PLIBCFileGetSection, kPlatform, 3)             \
  FAKE(PLIBCFileAddSection, kPlatform, 4)             \
  FAKE(PLIBCFileSetSection, kPlatform, 5)             \
  FAKE(PLIBCFileSetSectionValue, kPlatform, 5)        \
  FAKE(PLIBCFileRemoveSection, kPlatform, 2)          \
  FAKE(PLIBCExec, kPlatform, 5)                       \
  FAKE(PLIBCSysUnlink, kPlatform, 1)                  \
  FAKE(PLIBCSysRemove, kPlatform, 1)                  \
  FAKE(MEROWirelessAdapterNum, kPlatform, 0)          \
  FAKE(MEROWirelessInterfaceGet, kPlatform, 0)        \
  FAKE(MEROWirelessCurInfoGet, kPlatform, 2)          \
  FAKE(MEROWirelessConfGet, kPlatform, 2)             \
  FAKE(MEROWirelessOpmodeSet, kPlatform, 1)           \
  FAKE(MEROWirelessNetworkDisconnect, kPlatform, 0)   \
  FAKE(MEROWirelessAuthStringGet, kPlatform, 1)       \
  FAKE(MEROWirelessEncryptStringGet, kPlatform, 2)    \
  FAKE(MEROWirelessOpmodeStringGet, kPlatform, 1)     \
  FAKE(MEROWirelessBssidStringGet, kPlatform, 3)      \
  FAKE(MEROWirelessAuthParse, kPlatform, 1)           \
  FAKE(MEROWirelessEncryptParse, kPlatform, 1)        \
  FAKE(MEROWirelessProtocolParse, kPlatform, 1)       \
  FAKE(PLIBNetIfUp, kPlatform, 1)                     \
  FAKE(PLIBNetIfDown, kPlatform, 1)                   \
  FAKE(PLIBNetBridgeSlaveEnum, kPlatform, 2)          \
  FAKE(MERONetGetBridgeConfig, kPlatform, 3)          \
  FAKE(MERONetSetBridgeConfig, kPlatform, 2)          \
  FAKE(MERONetGetDhcpServerConf, kPlatform, 3)        \
  FAKE(MERONetSetDhcpServerConfigFiles, kPlatform, 2) \
  FAKE(MERONetIsSameSubnet, kPlatform, 3)             \
  FAKE(MERONetNtoa, kPlatform, 1)                     \
  FAKE(MERONetSetCard1, kPlatform, 2)                 \
  FAKE(MEROIGetDHCPTestNetInfo, kPlatform, 2)         \
  FAKE(MEROMediaService, kPlatform, 1)

namespace fake {

// Forgets everything, and records from now on until End(). Before and after, the fakes are the real functions.
void Begin();
void End();

// What the code under test did, in order, each a text such as "sleep(1)" or "PLIBNetIfUp(wlan0)". Texts and numbers
// stand as they are; other pointers are "&" or "null".
std::vector<std::string> Effects();

// The effects that are calls of these functions.
std::vector<std::string> EffectsOf(std::initializer_list<std::string_view> functions);

// What was reported to syslog at LOG_ERR. What was reported at another priority stands as its whole effect.
std::vector<std::string> Messages();

// The effect of a report at LOG_ERR.
std::string Report(std::string_view message);

// Sets the clock, in seconds since 1970, also beyond what a time_t can hold.
void NowIs(int64_t seconds);

// Gives outputs to the commands that are read through pipes: to each its own, and the last one to those that follow.
// One without output cannot be started.
using Output = std::optional<std::string>;
inline constexpr std::nullopt_t kNoPipe = std::nullopt;
void PipesGive(std::vector<Output> outputs);

// Gives each command that is read through a pipe the output that `outputOf` has for it.
void PipesAnswer(std::function<Output(std::string_view command)> outputOf);

enum class Origin { kLibc, kPlatform };

// What the fakes below are made of.
bool IsFaked(Origin origin);
void Record(const char* szFunction, std::initializer_list<std::string> arguments);
void* AddressOfReal(const char* szFunction);

// Within the platform's own code.
class Inside {
 public:
  explicit Inside(Origin origin);
  Inside(const Inside&) = delete;
  Inside& operator=(const Inside&) = delete;
  ~Inside();

 private:
  int depth_;
};

// An overload of its own shows a record whose fields matter.
template <class Value>
std::string Show(Value value) {
  if constexpr (std::is_same_v<Value, const char*>) {
    return value != nullptr ? value : "null";
  } else if constexpr (std::is_pointer_v<Value>) {
    return value != nullptr ? "&" : "null";
  } else if constexpr (std::is_class_v<Value>) {
    return "{}";
  } else {
    return std::to_string(+value);
  }
}

template <class Function>
class Fake;

template <class Result, class... Args>
class Fake<Result(Args...) noexcept> : public Fake<Result(Args...)> {
 public:
  using Fake<Result(Args...)>::Fake;
};

template <class Result, class... Args>
class Fake<Result(Args...)> {
 public:
  using Behaviour = std::function<Result(Args...)>;

  Fake(const char* szName, Origin origin) : szName_(szName), origin_(origin) {}

  // Answers every call from now on.
  void Does(Behaviour behaviour) { behaviour_ = std::move(behaviour); }

  // Gives these results, to each call its own, and the last one to those that follow.
  template <class... Results>
  void Returns(Results... results) {
    Does([all = std::vector<Result>{static_cast<Result>(results)...}, next = size_t{0}](Args...) mutable {
      return all[std::min(next++, all.size() - 1)];
    });
  }

  // Gives `result` to the nth call from now on, from 1; the others go where they have gone before.
  template <class Failure>
  void FailsAt(int n, Failure result) {
    Does([this, n, result, before = std::move(behaviour_)](Args... args) mutable {
      if (--n == 0) return static_cast<Result>(result);
      return before ? before(args...) : Real(args...);
    });
  }

  int calls() const { return calls_; }

  Result Real(Args... args) {
    if (real_ == nullptr) real_ = reinterpret_cast<Result (*)(Args...)>(AddressOfReal(szName_));
    const Inside inside(origin_);
    return real_(args...);
  }

  void Reset() {
    behaviour_ = nullptr;
    calls_ = 0;
  }

  Result Call(Args... args) {
    if (!IsFaked(origin_)) return Real(args...);
    ++calls_;
    {
      const memory::Pause pause;
      Record(szName_, {Show(args)...});
      if (behaviour_) return behaviour_(args...);
    }
    return Real(args...);
  }

 private:
  const char* szName_;
  Origin origin_;
  Behaviour behaviour_;
  int calls_ = 0;
  Result (*real_)(Args...) = nullptr;
};

#define DECLARE(name, origin, count) extern Fake<TYPE_OF(name)> name;
MERO_FAKES(DECLARE)
#undef DECLARE

}  // namespace fake

#endif  // MERO_TESTS_UNIT_FAKES_H
