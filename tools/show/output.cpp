// The three forms of the program's output, all from the same records: tables for people, JSON, and one record a line.
#include "show/output.h"

#include <algorithm>
#include <nlohmann/json.hpp>
#include <numeric>
#include <sstream>

namespace {

using Json = nlohmann::ordered_json;

template <class... Functions>
struct Overloaded : Functions... {
  using Functions::operator()...;
};
template <class... Functions>
Overloaded(Functions...) -> Overloaded<Functions...>;

void Put(std::string_view text) {
  std::fwrite(text.data(), 1, text.size(), stdout);
}

// ---- JSON: one document a line ----

// A text without a character is none.
Json JsonOf(const Value& value) {
  return std::visit(Overloaded{[](const auto& held) { return Json(held); },
                               [](const std::string& held) { return held.empty() ? Json(nullptr) : Json(held); }},
                    value);
}

Json JsonOf(const Table& table, std::size_t row) {
  Json record = Json::object();
  for (std::size_t i = 0; i < table.columns.size(); ++i) {
    record[std::string(table.columns[i].key)] = JsonOf(table.rows[row][i].value);
  }
  return record;
}

// A code unit of UTF-16 as JSON escapes it.
std::string WrittenOut(char32_t code) {
  char szCode[sizeof "\\u001b"];
  std::snprintf(szCode, sizeof szCode, "\\u%04x", static_cast<unsigned int>(code & 0xFFFF));
  return szCode;
}

// A character of a document. Those that are escaped can only stand within its strings, so \u is right for them; a line
// feed can only stand between them.
std::string InDocument(const Character& character) {
  constexpr char32_t kPairs = 0x10000;
  if (character.shown || character.bytes == "\n") return std::string(character.bytes);
  if (character.code < kPairs) return WrittenOut(character.code);
  const char32_t code = character.code - kPairs;
  return WrittenOut(0xD800 + (code >> 10)) + WrittenOut(0xDC00 + (code & 0x3FF));
}

// Names are bytes. Those that are no UTF-8 are replaced here; the field name_hex has such a name in full.
void PutDocument(const Json& document, bool utf8) {
  Put(HarmlessDocument(document.dump(-1, ' ', false, Json::error_handler_t::replace), utf8) + "\n");
}

// ---- Porcelain: one record a line, its fields between tabs ----

// A character of a line, escaped so that the %b of printf gives it back.
std::string InLine(const Character& character) {
  if (character.bytes == "\t") return "\\t";
  if (character.bytes == "\n") return "\\n";
  if (character.bytes == "\\") return "\\\\";
  if (character.shown) return std::string(character.bytes);
  std::string octal;
  for (const char byte : character.bytes) {
    char szByte[sizeof "\\0033"];
    std::snprintf(szByte, sizeof szByte, "\\0%03o", static_cast<unsigned int>(static_cast<unsigned char>(byte)));
    octal += szByte;
  }
  return octal;
}

std::string LineOf(const Value& value, bool utf8) {
  return std::visit(Overloaded{[](std::nullptr_t) { return std::string(); },
                               [](bool held) { return std::string(held ? "yes" : "no"); },
                               [](std::int64_t held) { return std::to_string(held); },
                               [=](const std::string& held) { return Rewritten(held, utf8, InLine); }},
                    value);
}

void PutLines(const Table& table, bool utf8) {
  for (const auto& row : table.rows) {
    for (std::size_t i = 0; i < row.size(); ++i) {
      if (i > 0) Put("\t");
      Put(LineOf(row[i].value, utf8));
    }
    Put("\n");
  }
}

// ---- People ----

constexpr std::size_t kGap = 2;

std::string_view ColourOf(Tone tone) {
  switch (tone) {
    case Tone::kPlain:
      return "";
    case Tone::kGood:
      return "\x1b[32m";
    case Tone::kFair:
      return "\x1b[33m";
    case Tone::kBad:
      return "\x1b[31m";
    case Tone::kFaint:
      return "\x1b[2m";
  }
  return "";
}

// Removes the columns without a title, which are for machines alone.
void LeaveWhatIsShown(Table& table) {
  for (std::size_t i = table.columns.size(); i-- > 0;) {
    if (!table.columns[i].title.empty()) continue;
    const auto offset = static_cast<std::ptrdiff_t>(i);
    table.columns.erase(table.columns.begin() + offset);
    for (auto& row : table.rows) row.erase(row.begin() + offset);
  }
}

std::vector<std::size_t> WidthsOf(const Table& table, bool utf8) {
  std::vector<std::size_t> widths;
  for (std::size_t i = 0; i < table.columns.size(); ++i) {
    std::size_t width = table.columns[i].title.size();
    for (const auto& row : table.rows) width = std::max(width, WidthOf(row[i].shown.text, utf8));
    widths.push_back(width);
  }
  return widths;
}

// Makes the elastic columns narrower until the table fits the terminal; false when it does not.
bool Squeeze(const Table& table, std::vector<std::size_t>& widths, std::size_t room) {
  constexpr std::size_t kLeast = 8;  // of a name, say, so that something of it can be read
  const std::size_t total = std::accumulate(widths.begin(), widths.end(), kGap * (widths.size() - 1));
  if (room == 0 || total <= room) return true;
  std::size_t excess = total - room;
  for (std::size_t i = 0; i < widths.size(); ++i) {
    if (table.columns[i].layout != Layout::kElastic) continue;
    const std::size_t least = std::max(kLeast, table.columns[i].title.size());
    const std::size_t taken = std::min(excess, widths[i] - std::min(widths[i], least));
    widths[i] -= taken;
    excess -= taken;
  }
  return excess == 0;
}

// Titles of columns may be moved to the right by blanks.
std::string_view TitleOf(const Column& column) {
  return column.title.substr(column.title.find_first_not_of(' '));
}

std::size_t WidthOfTitles(const Table& table) {
  std::size_t width = 0;
  for (const Column& column : table.columns) width = std::max(width, TitleOf(column).size());
  return width;
}

// A value as it stands behind its title, or on lines of its own where a word of it has no room there.
std::string Beside(const std::string& value, std::size_t titles, std::size_t width, bool utf8) {
  constexpr std::size_t kIndent = 4;
  const std::size_t column = titles + kGap;
  if (width == 0 || column + WidthOf(value, utf8) <= width) return value;
  const std::string wrapped = Wrapped(std::string(column, ' ') + value, width, column, utf8);
  std::istringstream lines(wrapped);
  bool fits = true;
  for (std::string line; std::getline(lines, line);) fits = fits && WidthOf(line, utf8) <= width;
  if (fits) return wrapped.substr(column);
  return std::string(1, '\n').append(Wrapped(std::string(kIndent, ' ') + value, width, kIndent, utf8));
}

}  // namespace

std::string HarmlessDocument(std::string_view document, bool utf8) {
  return Rewritten(document, utf8, InDocument);
}

Shown Output::Show(const Value& value) const {
  return std::visit(Overloaded{[](std::nullptr_t) { return Shown{"-", Tone::kFaint}; },
                               [](bool held) { return Shown{held ? "yes" : "no"}; },
                               [](std::int64_t held) { return Shown{std::to_string(held)}; },
                               [&](const std::string& held) {
                                 return held.empty() ? Shown{"-", Tone::kFaint} : Shown{Harmless(held, terminal_.utf8)};
                               }},
                    value);
}

void Output::Put(const Shown& shown, std::size_t width, Layout layout, bool last) const {
  const std::string text = CutToWidth(shown.text, width, terminal_.utf8);
  const std::string blanks(width - std::min(width, WidthOf(text, terminal_.utf8)), ' ');
  const std::string_view colour = terminal_.colour ? ColourOf(shown.tone) : "";
  if (layout == Layout::kRight) ::Put(blanks);
  ::Put(colour);
  ::Put(text);
  if (!colour.empty()) ::Put("\x1b[0m");
  if (last) return;
  if (layout != Layout::kRight) ::Put(blanks);
  ::Put(std::string(kGap, ' '));
}

void Output::WriteColumns(const Table& table, const std::vector<std::size_t>& widths) const {
  const std::size_t last = table.columns.size() - 1;
  for (std::size_t i = 0; i <= last; ++i) {
    Put({std::string(table.columns[i].title), Tone::kFaint}, widths[i], table.columns[i].layout, i == last);
  }
  ::Put("\n");
  for (const auto& row : table.rows) {
    for (std::size_t i = 0; i <= last; ++i) Put(row[i].shown, widths[i], table.columns[i].layout, i == last);
    ::Put("\n");
  }
}

void Output::WritePairs(const Table& table, std::size_t row) const {
  const std::size_t titles = WidthOfTitles(table);
  for (std::size_t i = 0; i < table.columns.size(); ++i) {
    Shown shown = table.rows[row][i].shown;
    shown.text = Beside(shown.text, titles, terminal_.width, terminal_.utf8);
    Put({std::string(TitleOf(table.columns[i])), Tone::kFaint}, titles, Layout::kLeft, shown.text.starts_with('\n'));
    Put(shown, WidthOf(shown.text, terminal_.utf8), Layout::kLeft, true);
    ::Put("\n");
  }
}

// As a table, or one after the other where that is too wide.
void Output::WriteRecords(const Table& table) const {
  std::vector<std::size_t> widths = WidthsOf(table, terminal_.utf8);
  if (Squeeze(table, widths, terminal_.width)) return WriteColumns(table, widths);
  for (std::size_t row = 0; row < table.rows.size(); ++row) {
    if (row > 0) ::Put("\n");
    WritePairs(table, row);
  }
}

void Output::WriteList(std::string_view name, Table table, std::string_view none) const {
  if (form_ == Form::kPorcelain) return PutLines(table, MachinesSeeUtf8());
  if (form_ == Form::kJson) {
    Json records = Json::array();
    for (std::size_t row = 0; row < table.rows.size(); ++row) records.push_back(JsonOf(table, row));
    return PutDocument({{"result", "ok"}, {std::string(name), records}}, MachinesSeeUtf8());
  }
  if (table.rows.empty()) return Done(std::string(none));
  LeaveWhatIsShown(table);
  WriteRecords(table);
}

void Output::WriteOne(std::string_view name, Table table) const {
  if (form_ == Form::kPorcelain) return PutLines(table, MachinesSeeUtf8());
  if (form_ == Form::kJson)
    return PutDocument({{"result", "ok"}, {std::string(name), JsonOf(table, 0)}}, MachinesSeeUtf8());
  LeaveWhatIsShown(table);
  WritePairs(table, 0);
}

void Output::Picture(const std::string& lines) const {
  if (form_ == Form::kHuman) ::Put(lines);
}

void Output::Document(const std::string& document) const {
  if (form_ == Form::kJson) return PutDocument(Json::parse(document), MachinesSeeUtf8());
  ::Put(HarmlessDocument(document, MachinesSeeUtf8()));
}

void Output::Done(const std::string& sentence) const {
  if (form_ == Form::kHuman) ::Put(Wrapped(sentence, terminal_.width, kSentenceIndent, terminal_.utf8) + "\n");
  if (form_ == Form::kJson) PutDocument({{"result", "ok"}}, MachinesSeeUtf8());
}

void Output::Failed(const Failure& failure) const {
  if (form_ != Form::kJson) return;
  PutDocument({{"result", "failed"},
               {"code", static_cast<int>(failure.exit())},
               {"error", failure.what()},
               {"advice", failure.advice()},
               {"reason", WordOf(failure.exit())}},
              MachinesSeeUtf8());
}
