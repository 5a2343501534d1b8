// Moments as text.
#include "base/clock.h"

namespace {

std::string TextOf(const std::tm* parts, const char* szFormat) {
  char szText[64];
  if (parts == nullptr || std::strftime(szText, sizeof szText, szFormat, parts) == 0) return "";
  return szText;
}

}  // namespace

std::string UtcText(std::time_t time) {
  std::tm parts{};
  return TextOf(::gmtime_r(&time, &parts), "%FT%TZ");
}

std::time_t TimeOf(const std::string& text) {
  std::tm parts{};
  const char* szEnd = ::strptime(text.c_str(), "%FT%TZ", &parts);
  return szEnd == text.c_str() + text.size() ? ::timegm(&parts) : -1;
}

std::string LocalText(std::time_t time, const char* szFormat) {
  std::tm parts{};
  return TextOf(::localtime_r(&time, &parts), szFormat);
}
