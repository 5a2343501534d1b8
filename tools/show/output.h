// The three forms of the program's output, all from the same records: tables for people, JSON, and one record a line.
#ifndef MERO_TOOLS_OUTPUT_H
#define MERO_TOOLS_OUTPUT_H

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "base/failure.h"
#include "base/terminal.h"
#include "base/text.h"

enum class Form { kHuman, kJson, kPorcelain };

enum class Tone { kPlain, kGood, kFair, kBad, kFaint };

// An elastic column is cut when a table is too wide. When that does not help, each record has a line for each field.
enum class Layout { kLeft, kRight, kElastic };

// The value of a field, for machines. A field without one is null in JSON and empty in a porcelain line.
using Value = std::variant<std::nullptr_t, bool, std::int64_t, std::string>;

struct Shown {
  std::string text;
  Tone tone = Tone::kPlain;
};

// One field of a record. The order of a record's fields is that of its porcelain line, and never changes; new fields
// are added at the end.
template <class Record>
struct Field {
  std::string_view key;
  std::string_view title;  // for people; a field without one is not shown to them
  Value (*value)(const Record&);
  Layout layout = Layout::kLeft;
  Shown (*shown)(const Record&, bool utf8) = nullptr;  // for people, where that is not the value itself
};

struct Column {
  std::string_view key;
  std::string_view title;
  Layout layout;
};

struct Cell {
  Value value;
  Shown shown;
};

struct Table {
  std::vector<Column> columns;
  std::vector<std::vector<Cell>> rows;
};

// A JSON document with everything written out that neither terminals nor people should be given.
std::string HarmlessDocument(std::string_view document, bool utf8);

class Output {
 public:
  Output(Form form, const Terminal& terminal) : form_(form), terminal_(terminal) {}

  Form form() const { return form_; }
  const Terminal& terminal() const { return terminal_; }

  // Many records. When there are none, people get the sentence `none`.
  template <class Record>
  void List(std::string_view name, std::span<const Field<Record>> fields, const std::vector<Record>& records,
            std::string_view none) const {
    WriteList(name, TableOf<Record>(fields, records), none);
  }

  // One record.
  template <class Record>
  void One(std::string_view name, std::span<const Field<Record>> fields, const Record& record) const {
    WriteOne(name, TableOf<Record>(fields, {&record, 1}));
  }

  // One record; people get a sentence instead.
  template <class Record>
  void Done(const std::string& sentence, std::string_view name, std::span<const Field<Record>> fields,
            const Record& record) const {
    if (form_ == Form::kHuman) return Done(sentence);
    One(name, fields, record);
  }

  // Many records; people get a sentence instead.
  template <class Record>
  void ListDone(const std::string& sentence, std::string_view name, std::span<const Field<Record>> fields,
                const std::vector<Record>& records) const {
    if (form_ == Form::kHuman) return Done(sentence);
    List(name, fields, records, "");
  }

  // A picture, for people alone: lines that are shown as they are.
  void Picture(const std::string& lines) const;

  // A document that is the result itself, the same in all forms; for JSON it is one line.
  void Document(const std::string& document) const;

  // A command was done that has no records to show.
  void Done(const std::string& sentence) const;

  // A command failed. This is for JSON alone; people read the failure on the standard error output.
  void Failed(const Failure& failure) const;

  // A name from the air, for a sentence.
  std::string Name(std::string_view name) const { return Harmless(name, terminal_.utf8); }

 private:
  template <class Record>
  Table TableOf(std::span<const Field<Record>> fields, std::span<const Record> records) const {
    Table table;
    for (const auto& field : fields) table.columns.push_back({field.key, field.title, field.layout});
    for (const Record& record : records) {
      std::vector<Cell>& row = table.rows.emplace_back();
      for (const auto& field : fields) {
        Value value = field.value(record);
        Shown shown = field.shown != nullptr ? field.shown(record, terminal_.utf8) : Show(value);
        row.push_back({std::move(value), std::move(shown)});
      }
    }
    return table;
  }

  // Output for machines is the same in every locale. On a terminal it is not: one that is not UTF-8 may take its bytes
  // for control characters.
  bool MachinesSeeUtf8() const { return !terminal_.isTerminal || terminal_.utf8; }

  Shown Show(const Value& value) const;
  void WriteList(std::string_view name, Table table, std::string_view none) const;
  void WriteOne(std::string_view name, Table table) const;
  void WriteColumns(const Table& table, const std::vector<std::size_t>& widths) const;
  void WritePairs(const Table& table, std::size_t row) const;
  void WriteRecords(const Table& table) const;
  void Put(const Shown& shown, std::size_t width, Layout layout, bool last) const;

  Form form_;
  Terminal terminal_;
};

#endif  // MERO_TOOLS_OUTPUT_H
