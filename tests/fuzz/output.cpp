// The program's output: whatever a record or a failure holds, nothing in it steers a terminal or hides; JSON parses,
// and gives the texts back; the %b of printf gives a porcelain line's back.
//
// Runs: 3000
// Covers: tools/show/output.cpp tools/base/text.cpp
#include "show/output.h"

#include <algorithm>
#include <array>
#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <nlohmann/json.hpp>

#include "tests/fuzz/support.h"

namespace {

// ---- Records of five columns ----

using Record = std::array<Value, 5>;

template <std::size_t kColumn>
Value ColumnOf(const Record& record) {
  return record[kColumn];
}

Shown ShowTone(const Record&, bool) {
  return {"tone", Tone::kGood};
}

constexpr Field<Record> kFields[] = {
    {"name", "NAME", ColumnOf<0>, Layout::kElastic},        {"count", "  COUNT", ColumnOf<1>, Layout::kRight},
    {"text", "TEXT", ColumnOf<2>, Layout::kLeft},           {"hidden", "", ColumnOf<3>},
    {"tone", "TONE", ColumnOf<4>, Layout::kLeft, ShowTone},
};

Record Taken(Fields& fields) {
  const std::string name = fields.Text();
  const std::int64_t count = fields.Number();
  const std::string text = fields.Text();
  const bool flag = fields.Flag();
  return {name, count, text, name + text, flag ? Value(flag) : Value(nullptr)};
}

// ---- What is written ----

std::string Written(const std::function<void()>& write) {
  char* szText = nullptr;
  std::size_t size = 0;
  FILE* const before = stdout;
  stdout = ::open_memstream(&szText, &size);
  write();
  std::fclose(stdout);
  stdout = before;
  const std::string text(szText, size);
  std::free(szText);
  return text;
}

struct Range {
  unsigned long first;
  unsigned long last;
};

// What moves the cursor, changes the colour or the direction of writing, or is not seen.
constexpr Range kSteering[] = {{0x00, 0x1f},     {0x7f, 0x9f},     {0xad, 0xad},     {0x200b, 0x200f},
                               {0x2028, 0x202e}, {0x2060, 0x206f}, {0xfeff, 0xfeff}, {0xe0000, 0xe007f}};

// The code of the character that a text begins with, and its bytes; no bytes where there is no character of UTF-8.
std::pair<unsigned long, std::size_t> First(std::string_view text) {
  wchar_t code = 0;
  std::mbstate_t state{};
  const std::size_t size = std::mbrtowc(&code, text.data(), text.size(), &state);
  return {static_cast<unsigned long>(code), size > text.size() ? 0 : std::max<std::size_t>(size, 1)};
}

void RequireHarmless(std::string_view text, const Terminal& terminal, std::string_view allowed) {
  const std::string_view whole = text;
  while (!text.empty()) {
    if (text.front() >= ' ' && text.front() <= '~') {  // as nearly all are
      text.remove_prefix(1);
      continue;
    }
    constexpr std::string_view kColours[] = {"\x1b[0m", "\x1b[2m", "\x1b[31m", "\x1b[32m", "\x1b[33m"};
    const auto* colour = std::ranges::find_if(kColours, [&](std::string_view one) { return text.starts_with(one); });
    if (terminal.colour && colour != std::end(kColours)) {
      text.remove_prefix(colour->size());
      continue;
    }
    const auto [code, size] = First(text);
    const bool isAllowed = size == 1 && allowed.find(text.front()) != allowed.npos;
    const bool isAscii = terminal.utf8 || !terminal.isTerminal || code < 0x80;
    const bool steers = std::ranges::any_of(
        kSteering, [&, at = code](const Range& range) { return at >= range.first && at <= range.last; });
    Require(size > 0 && isAscii && (isAllowed || !steers), "nothing steers a terminal", {text.substr(0, 8), whole});
    text.remove_prefix(size);
  }
}

// As the %b of printf reads it.
std::string Unescaped(std::string_view text) {
  std::string plain;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '\\') {
      plain += text[i];
      continue;
    }
    Require(++i < text.size(), "an escape is whole", {text});
    const char kind = text[i];
    Require(std::string_view("tn\\0").find(kind) != std::string_view::npos, "printf knows an escape", {text});
    if (kind != '0') {
      plain += kind == 't' ? '\t' : kind == 'n' ? '\n' : kind;
      continue;
    }
    plain += static_cast<char>(std::stoi(std::string(text.substr(i + 1, 3)), nullptr, 8));
    i += 3;
  }
  return plain;
}

void CheckPorcelain(std::string_view text, const std::vector<Record>& records) {
  for (const Record& record : records) {
    const std::size_t end = text.find('\n');
    Require(end != text.npos, "a record is a line", {text});
    std::string_view line = text.substr(0, end);
    text.remove_prefix(end + 1);
    for (std::size_t i = 0; i < record.size(); ++i) {
      const std::size_t tab = line.find('\t');
      Require((tab != line.npos) == (i + 1 < record.size()), "a field ends at a tab", {line});
      const std::string field = Unescaped(line.substr(0, tab));
      line.remove_prefix(tab == line.npos ? line.size() : tab + 1);
      const auto* held = std::get_if<std::string>(&record[i]);
      Require(held == nullptr || *held == field, "a field is given back", {field});
    }
  }
  Require(text.empty(), "there are no other lines", {text});
}

void CheckJson(const std::string& text, const std::vector<Record>& records) {
  Require(text.ends_with('\n') && text.find('\n') == text.size() - 1, "a document is one line", {text});
  const nlohmann::json document = nlohmann::json::parse(text, nullptr, false);
  Require(!document.is_discarded() && document["records"].size() == records.size(), "JSON parses", {text});
  for (std::size_t row = 0; row < records.size(); ++row) {
    for (std::size_t i = 0; i < std::size(kFields); ++i) {
      const auto* held = std::get_if<std::string>(&records[row][i]);
      if (held == nullptr || held->empty() || !IsUtf8(*held)) continue;
      Require(document["records"][row][kFields[i].key] == *held, "JSON gives a text back", {*held, text});
    }
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const char* const szLocale = std::setlocale(LC_CTYPE, "C.UTF-8");
  Require(szLocale != nullptr, "there is a locale with UTF-8");
  Fields fields(data, size);
  const bool isTerminal = fields.Flag();
  const Terminal terminal{.isTerminal = isTerminal,
                          .obeys = isTerminal,
                          .colour = isTerminal && fields.Flag(),
                          .utf8 = fields.Flag(),
                          .width = static_cast<std::size_t>(std::abs(fields.Number() % 200))};
  const std::vector<Record> records{Taken(fields), Taken(fields)};
  const std::string rest = fields.Rest();

  const Output human(Form::kHuman, terminal);
  RequireHarmless(Written([&] {
                    human.List<Record>("records", kFields, records, "none");
                    human.One<Record>("record", kFields, records[0]);
                    human.Done("did " + human.Name(rest));
                  }),
                  terminal, "\n");

  const Output json(Form::kJson, terminal);
  const std::string document = Written([&] { json.List<Record>("records", kFields, records, "none"); });
  RequireHarmless(document, terminal, "\n");
  CheckJson(document, records);
  const std::string failed = Written([&] { json.Failed(Failure(Exit::kFailed, rest, rest)); });
  RequireHarmless(failed, terminal, "\n");
  Require(nlohmann::json::accept(failed), "JSON parses", {failed});

  const std::string lines =
      Written([&] { Output(Form::kPorcelain, terminal).List<Record>("records", kFields, records, "none"); });
  RequireHarmless(lines, terminal, "\n\t");
  CheckPorcelain(lines, records);
  return 0;
}
