// Key/value files, as a shell reads them.
#include "common/text.h"
#include "platform/base/failure.h"
#include "platform/core/section_text.h"
#include "platform/core/settings_file.h"

namespace {

constexpr mode_t kMode = 0644;

// The value of a key; none when there is no such line.
std::optional<std::string_view> ValueIn(std::string_view text, const char* szKey) {
  const std::optional<LinePlace> place = FindKey(text, szKey, ValueForm::kShell);
  if (!place) return std::nullopt;
  Lines line(Slice(text, place->begin, place->end));
  line.Next();
  const std::optional<Pair> pair = PairOfLine(line.text(), ValueForm::kShell);
  return pair ? std::optional(pair->value) : std::nullopt;
}

// Reads the value of a key, as a view of the file's text. 1 found, 0 no such key or file, -1 on failure.
int ReadValue(const char* szPath, const char* szKey, Bytes& text, std::string_view& value) {
  if (const int result = ReadSettings(szPath, text); result <= 0) return result;
  const std::optional<std::string_view> found = ValueIn(text.view(), szKey);
  if (!found) return PLIBCErrSet(ERR_KEY_NOT_FOUND), 0;
  value = *found;
  return 1;
}

// Appends a text without the lines of a key.
void AppendWithout(Bytes& content, std::string_view text, std::string_view key) {
  for (Lines lines(text); lines.Next();) {
    const std::optional<Pair> pair = PairOfLine(lines.text(), ValueForm::kShell);
    if (!pair || pair->key != key) content.Append(lines.whole());
  }
}

}  // namespace

int PLIBCFileGetKeyValue(const char* szPath, const char* szKey, char* szValue, size_t cbValue, int /*flags*/) {
  if (szPath == nullptr || szKey == nullptr || szValue == nullptr) return REFUSE_NULL(), -1;
  Bytes text;
  std::string_view value;
  const int result = ReadValue(szPath, szKey, text, value);
  if (result > 0) CopyText(szValue, cbValue, value);
  return result;
}

int PLIBCFileCheckKeyValue(const char* szPath, const char* szKey, const char* szExpected, int /*flags*/) {
  if (szPath == nullptr || szKey == nullptr || szExpected == nullptr) return REFUSE_NULL(), 0;
  Bytes text;
  std::string_view value;
  return ReadValue(szPath, szKey, text, value) > 0 && value == szExpected ? 1 : 0;
}

int PLIBCFileSetKeyValue(const char* szPath, const char* szKey, const char* szValue, const char* szFormat) {
  if (szPath == nullptr || szKey == nullptr || szValue == nullptr || szFormat == nullptr) return REFUSE_NULL(), -1;

  return ChangeSettings(szPath, kMode, [&](std::string_view text, Revision& revision) {
    const LinePlace end{text.size(), text.size()};
    const LinePlace place = FindKey(text, szKey, ValueForm::kShell).value_or(end);
    revision.before = Slice(text, 0, place.begin);
    EndLine(revision.content, revision.before);
    AppendPair(revision.content, szFormat, {szKey, szValue}, ValueForm::kShell);
    revision.behind = Slice(text, place.end);
  });
}

int PLIBCFileRemoveKey(const char* szPath, const char* szKey) {
  if (szPath == nullptr || szKey == nullptr) return REFUSE_NULL(), -1;
  return ShortenSettings(szPath, ERR_KEY_NOT_FOUND, [&](std::string_view text, Revision& revision) {
    AppendWithout(revision.content, text, szKey);
  });
}
