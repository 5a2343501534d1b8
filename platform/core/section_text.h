// The text of settings files: lines, KEY=value pairs, and sections. Nothing here copies; all is views of the text.
#ifndef MERO_PLATFORM_SECTION_TEXT_H
#define MERO_PLATFORM_SECTION_TEXT_H

#include <optional>
#include <string_view>

#include "common/text.h"
#include "platform/base/bytes.h"

// Where the line of the byte at `offset` ends: behind its line feed, or at the end of the text.
inline size_t LineEnd(std::string_view text, size_t offset) {
  const size_t feed = text.find('\n', offset);
  return feed == std::string_view::npos ? text.size() : feed + 1;
}

// The ends of the lines of a text.
enum class LineEnds {
  kLf,    // a carriage return before the line feed is a byte of the line
  kCrLf,  // a carriage return before the line feed, or at the end of the text, is not; a line need not have one
};

// Walks a text line by line.
class Lines {
 public:
  explicit Lines(std::string_view text, LineEnds ends = LineEnds::kLf) : text_(text), ends_(ends) {}

  // Moves on to the next line; false at the end.
  bool Next() {
    begin_ = end_;
    if (begin_ == text_.size()) return false;
    end_ = LineEnd(text_, begin_);
    return true;
  }

  std::string_view whole() const { return Slice(text_, begin_, end_); }  // with its line end
  std::string_view text() const {                                        // without
    std::string_view line = whole();
    if (line.ends_with('\n')) line.remove_suffix(1);
    if (ends_ == LineEnds::kCrLf && line.ends_with('\r')) line.remove_suffix(1);
    return line;
  }
  size_t begin() const { return begin_; }
  size_t end() const { return end_; }

 private:
  std::string_view text_;
  LineEnds ends_;
  size_t begin_ = 0;
  size_t end_ = 0;
};

struct Pair {
  std::string_view key;
  std::string_view value;
};

// How a file's values stand behind the "=".
enum class ValueForm {
  kPlain,  // every byte counts
  kShell,  // white space around them does not, nor do quotes
};

// The pair on a line, given without its end; none on a comment, a section's header, or any other line.
std::optional<Pair> PairOfLine(std::string_view line, ValueForm form);

// The name on a section's header; none on any other line.
std::optional<std::string_view> SectionOfLine(std::string_view line);

// Where a section stands in its file, as offsets.
struct SectionPlace {
  size_t header;
  size_t body;
  size_t end;
};

// The ends of the lines of a section: as that of its header.
LineEnds LineEndsOf(std::string_view text, const SectionPlace& place);

// The lines of a section's body.
inline Lines LinesOf(std::string_view text, const SectionPlace& place) {
  return Lines(Slice(text, place.body, place.end), LineEndsOf(text, place));
}

// Walks a text section by section.
class Sections {
 public:
  explicit Sections(std::string_view text) : text_(text), next_(HeaderFrom(0)) {}

  // Moves on to the next section; false at the end.
  bool Next();

  std::string_view name() const { return name_; }
  std::string_view whole() const { return Slice(text_, place_.header, place_.end); }  // with its header
  const SectionPlace& place() const { return place_; }

 private:
  struct Header {
    std::string_view name;
    size_t begin;
    size_t end;
  };

  // The first header from the line on that begins at this offset.
  std::optional<Header> HeaderFrom(size_t line) const;

  std::string_view text_;
  std::optional<Header> next_;
  std::string_view name_;
  SectionPlace place_{};
};

// The first section of that name; none when absent. Names compare without regard to ASCII case.
std::optional<SectionPlace> FindSection(std::string_view text, std::string_view name);

// Where a key's line stands in a text, as offsets. When the key stands there several times, its last line counts. None
// when the key is absent.
struct LinePlace {
  size_t begin;
  size_t end;
};
std::optional<LinePlace> FindKey(std::string_view text, std::string_view key, ValueForm form);

// Appends the line of a pair in the format of the caller ("%s" twice). Among lines that end in CR LF, a value that ends
// in a carriage return gets one more, since that line's end takes one away. Fails with EINVAL when the format is
// another, or when the line would not read back as that pair in that form.
void AppendPair(Bytes& to, const char* szFormat, Pair pair, ValueForm form, LineEnds ends = LineEnds::kLf);

// Appends a section's header; fails with EINVAL when it would not read back as that name.
void AppendHeader(Bytes& to, std::string_view name);

// Ends the last line of the text that `to` stands behind, if it has no end yet, so that a line can follow.
void EndLine(Bytes& to, std::string_view text);

#endif  // MERO_PLATFORM_SECTION_TEXT_H
