// Key/value files: a value that is set is read back, a key that is removed is gone, and no line of another key changes;
// what is refused leaves the file as it is; a value is cut to the caller's buffer and no further.
//
// Runs: 12000
// Covers: platform/core/key_value_files.cpp platform/core/section_lines.cpp platform/core/section_text.cpp
// Covers: platform/core/settings_file.cpp platform/base/file_edit.cpp platform/base/file_read.cpp
// Covers: platform/base/bytes.cpp
#include <array>
#include <iterator>
#include <vector>

#include "platform.h"
#include "tests/fuzz/support.h"

namespace {

constexpr const char* kFormats[] = {"%s=%s\n", "%s=\"%s\"\n", "%s='%s'\n", "%s=%s"};

bool IsOf(const std::string& line, const std::string& key) {
  const std::size_t equals = line.find('=');
  if (equals == line.npos || key.empty() || key[0] == '#' || key[0] == ';') return false;
  const std::string whole = Trimmed(line);
  const bool isHeader = whole.front() == '[' && whole.back() == ']' && whole.size() > 1;
  return !isHeader && Trimmed(line.substr(0, equals)) == key;
}

std::string ValueOn(const std::string& line) {
  std::string value = Trimmed(line.substr(line.find('=') + 1));
  const char quote = value.empty() ? '\0' : value.front();
  const bool quoted = value.size() > 1 && value.back() == quote && (quote == '"' || quote == '\'');
  return quoted ? value.substr(1, value.size() - 2) : value;
}

// The value that counts, as a caller can be told of it; none where there is no line of the key.
std::optional<std::string> ValueIn(const std::string& text, const std::string& key) {
  std::optional<std::string> value;
  for (const std::string& line : LinesOf(text)) {
    if (IsOf(line, key)) value = ValueOn(line);
  }
  return value;
}

std::vector<std::string> LinesButOf(const std::string& text, const std::string& key) {
  std::vector<std::string> lines = LinesOf(text);
  std::erase_if(lines, [&](const std::string& line) { return IsOf(line, key); });
  return lines;
}

void CheckReading(const std::string& text, const std::string& key) {
  const std::optional<std::string> value = ValueIn(text, key);
  std::array<char, 4> szFew{'x', 'x', 'x', 'x'};
  for (std::size_t size = 0; size <= szFew.size(); ++size) {
    const int found = PLIBCFileGetKeyValue(kScratchPath, key.c_str(), szFew.data(), size, 0);
    Require(found == (value ? 1 : 0), "a key that is there is found", {key, text});
    if (!value || size == 0) continue;
    const std::string expected = std::string(value->c_str()).substr(0, size - 1);
    Require(szFew.data() == expected, "a value is cut to its buffer", {expected, text});
  }
  const bool isText = value && value->find('\0') == value->npos;
  Require(PLIBCFileCheckKeyValue(kScratchPath, key.c_str(), value ? value->c_str() : "", 0) == (isText ? 1 : 0),
          "a key has the value that is read", {key, text});
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Fields fields(data, size);
  const auto format = static_cast<unsigned>(fields.Number());
  const std::string key = fields.Text();
  const std::string value = fields.Text();
  const std::string text = fields.Rest();
  PutFile(kScratchPath, text);
  CheckReading(text, key);

  const bool removed = PLIBCFileRemoveKey(kScratchPath, key.c_str()) > 0;
  std::string after = FileAt(kScratchPath).value_or("");
  Require(removed == ValueIn(text, key).has_value(), "a key that is there is removed", {key, text});
  Require(!ValueIn(after, key), "a key that is removed is gone", {key, after});
  Require(removed ? LinesButOf(after, key) == LinesButOf(text, key) : after == text, "the lines of other keys stay",
          {text, after});

  PutFile(kScratchPath, text);
  const char* szFormat = kFormats[format % std::size(kFormats)];
  const bool done = PLIBCFileSetKeyValue(kScratchPath, key.c_str(), value.c_str(), szFormat) > 0;
  after = FileAt(kScratchPath).value_or("");
  if (!done) {
    Require(after == text, "what is refused leaves the file as it is", {text, after});
    return 0;
  }
  Require(ValueIn(after, key) == value, "a value that is set is read back", {value, after});
  Require(LinesButOf(after, key) == LinesButOf(text, key), "the lines of other keys stay", {text, after});
  CheckReading(after, key);
  return 0;
}
