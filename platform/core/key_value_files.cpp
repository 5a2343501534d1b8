// Key/value files, as a shell reads them.
#include "common/text.h"
#include "platform/base/failure.h"
#include "platform/base/file_edit.h"
#include "platform/base/file_read.h"
#include "platform/core/section_text.h"

namespace {

constexpr mode_t kMode = 0644;

// The value of a key; none when there is no such line.
std::optional<std::string_view> ValueIn(std::string_view text, const char* szKey) {
  const std::optional<LinePlace> place = FindKey(text, szKey, ValueForm::kShell);
  if (!place) return std::nullopt;
  Lines line(Slice(text, place->begin, place->end));
  line.Next();
  return PairOfLine(line.text(), ValueForm::kShell)->value;
}

// Calls `use(value)` for the value of a key. 1 found, 0 no such key or file, -1 on failure.
template <class Use>
int UseValue(const char* szPath, const char* szKey, Use use) {
  Result<Bytes> file = ReadFile(szPath);
  if (file.error() == ENOENT) return PLIBCErrSet(ERR_FILE_NOT_FOUND), 0;
  if (!file.ok()) return FAIL(file.error(), "Failed to read %s", szPath), -1;
  const std::optional<std::string_view> value = ValueIn(file->view(), szKey);
  if (!value) return PLIBCErrSet(ERR_KEY_NOT_FOUND), 0;
  use(*value);
  return 1;
}

// Appends a text without the lines of a key; false when it has none.
bool AppendWithout(Bytes& content, std::string_view text, std::string_view key) {
  bool removed = false;
  for (Lines lines(text); lines.Next();) {
    const std::optional<Pair> pair = PairOfLine(lines.text(), ValueForm::kShell);
    if (pair && pair->key == key) {
      removed = true;
    } else {
      content.Append(lines.whole());
    }
  }
  return removed;
}

}  // namespace

int PLIBCFileGetKeyValue(const char* szPath, const char* szKey, char* szValue, size_t cbValue, int /*flags*/) {
  if (szPath == nullptr || szKey == nullptr || szValue == nullptr) return REFUSE_NULL(), -1;
  return UseValue(szPath, szKey, [&](std::string_view value) { CopyText(szValue, cbValue, value); });
}

int PLIBCFileCheckKeyValue(const char* szPath, const char* szKey, const char* szExpected, int /*flags*/) {
  if (szPath == nullptr || szKey == nullptr || szExpected == nullptr) return REFUSE_NULL(), 0;
  bool same = false;
  (void)UseValue(szPath, szKey, [&](std::string_view value) { same = value == szExpected; });  // has reported
  return same ? 1 : 0;
}

int PLIBCFileSetKeyValue(const char* szPath, const char* szKey, const char* szValue, const char* szFormat) {
  if (szPath == nullptr || szKey == nullptr || szValue == nullptr || szFormat == nullptr) return REFUSE_NULL(), -1;

  const Status status = EditFile(szPath, kMode, [&](std::string_view text, Bytes& content) {
    const LinePlace end{text.size(), text.size()};
    const LinePlace place = FindKey(text, szKey, ValueForm::kShell).value_or(end);
    content.Append(Slice(text, 0, place.begin));
    EndLine(content);
    AppendPair(content, szFormat, {szKey, szValue}, ValueForm::kShell);
    content.Append(Slice(text, place.end));
  });
  if (!status.ok()) return FAIL(status.error(), "Failed to write %s", szPath), -1;
  return 1;
}

int PLIBCFileRemoveKey(const char* szPath, const char* szKey) {
  if (szPath == nullptr || szKey == nullptr) return REFUSE_NULL(), -1;

  Result<FileEdit> edit = FileEdit::Open(szPath, 0);
  if (edit.error() == ENOENT) return PLIBCErrSet(ERR_FILE_NOT_FOUND), 0;
  if (!edit.ok()) return FAIL(edit.error(), "Failed to read %s", szPath), -1;

  Bytes content;
  if (!AppendWithout(content, edit->text(), szKey)) return PLIBCErrSet(ERR_KEY_NOT_FOUND), 0;
  const Status status = edit->Commit(content);
  if (!status.ok()) return FAIL(status.error(), "Failed to write %s", szPath), -1;
  return 1;
}
