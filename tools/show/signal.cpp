// How strongly something is heard.
#include "show/signal.h"

#include <algorithm>
#include <iterator>

int QualityOf(int signal) {
  return std::clamp(signal < 0 ? 2 * (signal + 100) : signal, 0, 100);
}

Shown ShowSignal(int signal, bool utf8) {
  constexpr std::string_view kBars[] = {"▂", "▄", "▆", "█"};
  const int quality = QualityOf(signal);
  const auto lit = static_cast<std::size_t>((quality + 24) / 25);
  std::string text;
  for (std::size_t i = 0; i < std::size(kBars); ++i) {
    text += utf8 ? (i < lit ? kBars[i] : "▁") : (i < lit ? "#" : ".");
  }
  const std::string figure = std::to_string(signal);
  text += std::string(figure.size() < 4 ? 4 - figure.size() : 1, ' ') + figure;
  return {text, quality >= 60 ? Tone::kGood : quality >= 30 ? Tone::kFair : Tone::kBad};
}
