// The functions that the libraries come upon instead of the real ones.
#include "fakes.h"

#include <dlfcn.h>
#include <sys/mman.h>
#include <syslog.h>

#include <cerrno>
#include <cstdarg>
#include <ctime>

namespace fake {
namespace {

constexpr std::string_view kReport = "syslog(3, ";

bool g_recording = false;
int g_insidePlatform = 0;
std::vector<std::string> g_effects;
std::optional<int64_t> g_now;

bool IsCallOf(std::string_view effect, std::string_view function) {
  return effect.starts_with(function) && effect.substr(function.size()).starts_with('(');
}

// A stream that can be read once, with a descriptor, as that of a pipe has.
FILE* StreamOf(const std::string& output) {
  const int fd = ::memfd_create("output", MFD_CLOEXEC);
  FILE* stream = ::fdopen(fd, "w+");
  if (stream == nullptr) std::abort();
  std::fwrite(output.data(), 1, output.size(), stream);
  std::rewind(stream);
  return stream;
}

void ResetAll() {
#define RESET(name, origin, count) name.Reset();
  MERO_FAKES(RESET)
#undef RESET
  g_now.reset();
  g_effects.clear();
}

}  // namespace

void Begin() {
  ResetAll();
  g_recording = true;
}

void End() {
  g_recording = false;
  ResetAll();
}

std::vector<std::string> Effects() {
  return g_effects;
}

std::vector<std::string> EffectsOf(std::initializer_list<std::string_view> functions) {
  std::vector<std::string> effects;
  std::ranges::copy_if(g_effects, std::back_inserter(effects), [&](const std::string& effect) {
    return std::ranges::any_of(functions, [&](std::string_view function) { return IsCallOf(effect, function); });
  });
  return effects;
}

std::vector<std::string> Messages() {
  std::vector<std::string> messages = EffectsOf({"syslog"});
  for (std::string& message : messages) {
    if (!message.starts_with(kReport)) continue;
    message.erase(0, kReport.size());
    message.pop_back();
  }
  return messages;
}

std::string Report(std::string_view message) {
  return std::string(kReport).append(message) + ")";
}

void NowIs(int64_t seconds) {
  g_now = seconds;
}

void PipesGive(std::vector<Output> outputs) {
  PipesAnswer([outputs = std::move(outputs), next = size_t{0}](std::string_view) mutable {
    return outputs[std::min(next++, outputs.size() - 1)];
  });
}

void PipesAnswer(std::function<Output(std::string_view command)> outputOf) {
  popen.Does([outputOf = std::move(outputOf)](const char* szCommand, const char*) -> FILE* {
    if (const Output output = outputOf(szCommand)) return StreamOf(*output);
    errno = EMFILE;
    return nullptr;
  });
  pclose.Does([](FILE* stream) { return std::fclose(stream); });
}

bool IsFaked(Origin origin) {
  return g_recording && (origin == Origin::kLibc || g_insidePlatform == 0);
}

void Record(const char* szFunction, std::initializer_list<std::string> arguments) {
  std::string effect = szFunction;
  const char* szBefore = "(";
  for (const std::string& argument : arguments) {
    effect.append(szBefore).append(argument);
    szBefore = ", ";
  }
  g_effects.push_back(effect + (arguments.size() == 0 ? "()" : ")"));
}

void* AddressOfReal(const char* szFunction) {
  const memory::Pause pause;
  void* real = ::dlsym(RTLD_NEXT, szFunction);
  if (real != nullptr) return real;
  std::fprintf(stderr, "there is no real %s()\n", szFunction);
  std::abort();
}

Inside::Inside(Origin origin) : depth_(origin == Origin::kPlatform ? 1 : 0) {
  g_insidePlatform += depth_;
}

Inside::~Inside() {
  g_insidePlatform -= depth_;
}

#define DEFINE_FAKE(name, origin, count) Fake<TYPE_OF(name)> name(#name, Origin::origin);
MERO_FAKES(DEFINE_FAKE)
#undef DEFINE_FAKE

namespace {

void RecordReport(int priority, const char* szFormat, va_list values) {
  char szMessage[4096];
  std::vsnprintf(szMessage, sizeof szMessage, szFormat, values);  // at once: %m is the errno of this moment
  const memory::Pause pause;
  if (g_recording) Record("syslog", {std::to_string(priority), szMessage});
}

template <class Seconds>
Seconds Now(Seconds* pSeconds) {
  const memory::Pause pause;
  if (g_recording) Record("time", {});
  timespec now;
  ::clock_gettime(CLOCK_REALTIME, &now);
  const auto seconds = static_cast<Seconds>(g_now.value_or(now.tv_sec));
  if (pSeconds != nullptr) *pSeconds = seconds;
  return seconds;
}

}  // namespace
}  // namespace fake

#define DEFINE_FUNCTION(name, origin, count)   \
  STAND_IN_FOR(name, count) {                  \
    return fake::name.Call(ARGUMENTS_##count); \
  }
MERO_FAKES(DEFINE_FUNCTION)

extern "C" void syslog(int priority, const char* szFormat, ...) {
  va_list values;
  va_start(values, szFormat);
  fake::RecordReport(priority, szFormat, values);
  va_end(values);
}

// The name of syslog() in a library that is built with _FORTIFY_SOURCE.
// NOLINTNEXTLINE(bugprone-reserved-identifier)
extern "C" void __syslog_chk(int priority, int, const char* szFormat, ...) {
  va_list values;
  va_start(values, szFormat);
  fake::RecordReport(priority, szFormat, values);
  va_end(values);
}

extern "C" time_t time(time_t* pTime) noexcept {
  return fake::Now(pTime);
}

// The name of time() where a time_t has 32 bits by default, and the library asked for 64.
// NOLINTNEXTLINE(bugprone-reserved-identifier)
extern "C" int64_t __time64(int64_t* pTime) noexcept {
  return fake::Now(pTime);
}
