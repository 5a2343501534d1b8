// The line that tells what the program waits for.
#include "show/progress.h"

#include <cstdio>

#include "base/text.h"

using std::chrono::duration_cast;
using std::chrono::milliseconds;

Progress::Progress(const Terminal& terminal, std::string doing)
    : terminal_(terminal), doing_(std::move(doing)), began_(std::chrono::steady_clock::now()) {}

Progress::~Progress() {
  Clear();
}

void Progress::Update() {
  constexpr milliseconds kPatience{500};
  if (!terminal_.obeys) return;
  const auto elapsed = duration_cast<milliseconds>(std::chrono::steady_clock::now() - began_);
  if (elapsed < kPatience) return;

  const auto tenths = elapsed.count() / 100;
  const std::string time = "  " + std::to_string(tenths / 10) + "." + std::to_string(tenths % 10) + " s";
  // A line that the terminal would wrap could not be taken back.
  const std::size_t room = terminal_.width > time.size() ? terminal_.width - time.size() - 1 : 0;
  std::fprintf(stderr, "\r%s%s\x1b[K", CutToWidth(doing_, room, terminal_.utf8).c_str(), time.c_str());
  std::fflush(stderr);
  shown_ = true;
}

void Progress::Clear() {
  if (!shown_) return;
  std::fputs("\r\x1b[K", stderr);
  std::fflush(stderr);
  shown_ = false;
}
