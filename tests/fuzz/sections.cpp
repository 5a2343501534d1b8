// Section files: what a plain reader makes of a file, the library makes of it; a change changes what it is about and no
// other line, and can be read back; what is refused leaves the file as it is.
//
// Runs: 12000
// Covers: platform/core/section_files.cpp platform/core/section_lines.cpp platform/core/section_text.cpp
// Covers: platform/core/settings_file.cpp platform/core/text_hash.cpp platform/core/text_list.cpp
#include <algorithm>
#include <memory>
#include <vector>

#include "platform.h"
#include "tests/fuzz/support.h"

namespace {

constexpr char kFormat[] = "\t%s=%s\n";

struct FreeHash {
  void operator()(PPLIBSZHASH hash) const { PLIBCSzHashFree(hash); }
};
struct FreeList {
  void operator()(PPLIBSZLIST list) const { PLIBCSzListFree(list); }
};

class Hash {
 public:
  Hash() : hash_(PLIBCSzHashAlloc(64)) {}
  Hash(const Hash&) = delete;
  Hash& operator=(const Hash&) = delete;
  ~Hash() { PLIBCSzHashFree(hash_); }

  PPLIBSZHASH* address() { return &hash_; }
  void Set(const std::string& key, const std::string& value) {
    Require(PLIBCSzHashSetValue(&hash_, key.c_str(), value.c_str()) > 0, "a hash takes a pair");
  }
  const char* Get(const std::string& key) const { return PLIBCSzHashGetValue(hash_, key.c_str()); }

 private:
  PPLIBSZHASH hash_;
};

// ---- A plain reader ----

struct Line {
  std::string text;  // without its line feed
  bool isPair = false;
  std::string key;
  std::string value;
};

struct Section {
  std::string name;  // of what stands before the first one, none
  std::string header;
  std::vector<Line> lines;

  bool EndsInCr() const { return header.ends_with('\r'); }
};

using File = std::vector<Section>;

std::optional<std::string> NameOn(const std::string& line) {
  const std::string text = Trimmed(line);
  if (text.size() < 2 || text.front() != '[' || text.back() != ']') return std::nullopt;
  return Trimmed(text.substr(1, text.size() - 2));
}

// Whether a caller can name it: no text of a caller's holds a NUL.
bool IsText(const std::string& text) {
  return text.find('\0') == text.npos;
}

Line LineOf(std::string text, bool cutsCr) {
  Line line;
  line.text = text;
  if (cutsCr && text.ends_with('\r')) text.pop_back();
  const std::size_t equals = text.find('=');
  if (equals == text.npos) return line;
  line.key = Trimmed(text.substr(0, equals));
  line.value = text.substr(equals + 1);
  line.isPair = !line.key.empty() && line.key[0] != '#' && line.key[0] != ';' && IsText(line.key);
  return line;
}

File Parsed(const std::string& text) {
  File file(1);
  for (const std::string& line : LinesOf(text)) {
    if (const auto name = NameOn(line)) {
      file.push_back({.name = *name, .header = line, .lines = {}});
    } else {
      file.back().lines.push_back(LineOf(line, file.back().EndsInCr()));
    }
  }
  return file;
}

bool SameName(const std::string& a, const std::string& b) {
  const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; };
  return std::ranges::equal(a, b, {}, lower, lower);
}

File::iterator Find(File& file, const std::string& name) {
  return std::find_if(file.begin() + 1, file.end(), [&](const Section& one) { return SameName(one.name, name); });
}

// ---- A plain writer ----

void AppendSection(File& file, const std::string& name, const std::vector<Line>& pairs) {
  file.push_back({.name = name, .header = "[" + name + "]", .lines = pairs});
}

auto BehindLastPair(std::vector<Line>& lines) {
  return std::find_if(lines.rbegin(), lines.rend(), [](const Line& line) { return line.isPair; }).base();
}

void SetPair(File& file, const std::string& name, const Line& pair) {
  const auto section = Find(file, name);
  if (section == file.end()) return AppendSection(file, name, {pair});
  const auto old = std::find_if(section->lines.rbegin(), section->lines.rend(),
                                [&](const Line& line) { return line.isPair && line.key == pair.key; });
  if (old != section->lines.rend()) {
    *old = pair;
  } else {
    section->lines.insert(BehindLastPair(section->lines), pair);
  }
}

void SetPairs(File& file, const std::string& name, const std::optional<std::string>& newName,
              const std::vector<Line>& pairs) {
  const auto section = Find(file, name);
  if (section == file.end()) return AppendSection(file, newName.value_or(name), pairs);
  std::vector<Line>& lines = section->lines;
  const auto isPair = [](const Line& line) { return line.isPair; };
  const auto first = std::ranges::find_if(lines, isPair);
  const auto place = first == lines.end() ? 0 : first - lines.begin();
  std::erase_if(lines, isPair);
  lines.insert(lines.begin() + place, pairs.begin(), pairs.end());
  if (newName) section->name = *newName, section->header = "[" + *newName + "]";
}

// ---- What has to hold ----

void CheckReading(File file) {
  const std::unique_ptr<PLIBSZLIST, FreeList> list(PLIBCSzListAlloc(64));
  PPLIBSZLIST pslList = list.get();
  const int count = PLIBCFileEnumSection(kScratchPath, &pslList);
  int next = 0;
  for (std::size_t i = 1; i < file.size(); ++i) {
    const Section& section = file[i];
    if (!IsText(section.name)) continue;
    Require(next < count && PLIBCSzListGet(pslList, next++) == section.name, "a section is listed by its name",
            {section.name});
    Hash hash;
    Require(PLIBCFileGetSection(kScratchPath, section.name.c_str(), hash.address()) == 1, "a section is found",
            {section.name});
    std::vector<Line>& lines = Find(file, section.name)->lines;
    for (auto line = lines.rbegin(); line != lines.rend(); ++line) {
      const bool isLast =
          std::none_of(lines.rbegin(), line, [&](const Line& other) { return other.isPair && other.key == line->key; });
      if (!line->isPair || !isLast) continue;
      const char* szValue = hash.Get(line->key);
      Require(szValue != nullptr && std::string(szValue) == line->value.c_str(), "a pair is read",
              {line->key, line->value});
    }
  }
  Require(next == count, "what is no section is not listed");
}

bool Same(const Line& a, const Line& b) {
  return a.isPair == b.isPair && (a.isPair ? a.key == b.key && a.value == b.value : a.text == b.text);
}

// What a change made of the file; `written` are the lines that it wrote, whose text is its own affair.
void CheckWritten(bool done, const std::string& before, const File& expected) {
  const std::string after = FileAt(kScratchPath).value_or("");
  if (!done) return Require(after == before, "what is refused leaves the file as it is", {before, after});
  const File file = Parsed(after);
  Require(file.size() == expected.size(), "a change leaves the other sections", {before, after});
  for (std::size_t i = 0; i < file.size(); ++i) {
    Require(file[i].name == expected[i].name, "a change leaves the names", {before, after});
    Require(file[i].lines.size() == expected[i].lines.size(), "a change leaves the other lines", {before, after});
    for (std::size_t n = 0; n < file[i].lines.size(); ++n) {
      const Line& had = expected[i].lines[n];
      Require(Same(file[i].lines[n], had), "a line is what it was, or what was set", {had.text, before, after});
      Require(had.text.empty() || file[i].lines[n].text == had.text, "a line is not rewritten", {before, after});
    }
  }
}

// A pair that is set: its line is written in the form of the caller.
Line Pair(const std::string& key, const std::string& value) {
  return {.text = "", .isPair = true, .key = key, .value = value};
}

// A change as a caller asks for it.
struct Change {
  std::string what;
  std::string name;
  std::string newName;
  std::string key;
  std::string value;
  std::string otherKey;
  std::string otherValue;
};

// Makes a change of the whole section, by the library and by the plain writer; whether the library has made it.
bool ChangeSection(const Change& change, File& file) {
  Hash hash;
  hash.Set(change.key, change.value);
  hash.Set(change.otherKey, change.otherValue);
  const bool same = change.key == change.otherKey;
  std::vector<Line> pairs{Pair(change.key, same ? change.otherValue : change.value)};
  if (!same) pairs.push_back(Pair(change.otherKey, change.otherValue));

  const bool renames = change.what == "rename";
  SetPairs(file, change.name, renames ? std::optional(change.newName) : std::nullopt, pairs);
  if (!renames) return PLIBCFileAddSection(kScratchPath, change.name.c_str(), *hash.address(), kFormat) > 0;
  return PLIBCFileSetSection(kScratchPath, change.name.c_str(), change.newName.c_str(), *hash.address(), kFormat) > 0;
}

bool RemoveSection(const std::string& name, File& file) {
  const std::size_t before = file.size();
  file.erase(std::remove_if(file.begin() + 1, file.end(), [&](const Section& one) { return SameName(one.name, name); }),
             file.end());
  const bool done = PLIBCFileRemoveSection(kScratchPath, name.c_str()) > 0;
  Require(done == (file.size() < before), "a section that is there is removed", {name});
  return done;
}

bool MakeChange(const Change& change, File& file) {
  if (change.what == "remove") return RemoveSection(change.name, file);
  if (change.what == "add" || change.what == "rename") return ChangeSection(change, file);
  SetPair(file, change.name, Pair(change.key, change.value));
  return PLIBCFileSetSectionValue(kScratchPath, change.name.c_str(), change.key.c_str(), change.value.c_str(),
                                  kFormat) >= 0;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Fields fields(data, size);
  const Change change{fields.Text(), fields.Text(), fields.Text(), fields.Text(),
                      fields.Text(), fields.Text(), fields.Text()};
  const std::string text = fields.Rest();
  PutFile(kScratchPath, text);
  File file = Parsed(text);
  CheckReading(file);
  const bool done = MakeChange(change, file);
  CheckWritten(done, text, file);
  return 0;
}
