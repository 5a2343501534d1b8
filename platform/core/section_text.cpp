// The text of settings files.
#include "platform/core/section_text.h"

#include "common/text.h"

namespace {

std::string_view Unquoted(std::string_view value) {
  const bool quoted =
      value.size() >= 2 && value.front() == value.back() && (value.front() == '"' || value.front() == '\'');
  if (!quoted) return value;
  value.remove_prefix(1);
  value.remove_suffix(1);
  return value;
}

}  // namespace

std::optional<Pair> PairOfLine(std::string_view line, ValueForm form) {
  const size_t equals = line.find('=');
  if (equals == std::string_view::npos) return std::nullopt;
  const std::string_view key = Trim(Slice(line, 0, equals));
  if (key.empty() || key.front() == '#' || key.front() == ';') return std::nullopt;
  // No caller could name such a key, and up to the NUL it would be another one.
  if (key.find('\0') != std::string_view::npos) return std::nullopt;
  if (key.front() == '[' && SectionOfLine(line)) return std::nullopt;
  const std::string_view value = Slice(line, equals + 1);
  return Pair{key, form == ValueForm::kShell ? Unquoted(Trim(value)) : value};
}

std::optional<std::string_view> SectionOfLine(std::string_view line) {
  line = Trim(line);
  if (line.size() < 2 || line.front() != '[' || line.back() != ']') return std::nullopt;
  return Trim(Slice(line, 1, line.size() - 1));
}

LineEnds LineEndsOf(std::string_view text, const SectionPlace& place) {
  std::string_view header = Slice(text, place.header, place.body);
  if (header.ends_with('\n')) header.remove_suffix(1);
  return header.ends_with('\r') ? LineEnds::kCrLf : LineEnds::kLf;
}

// Looks for brackets, which are rare, so that most lines are never looked at one by one.
std::optional<Sections::Header> Sections::HeaderFrom(size_t line) const {
  for (size_t bracket = text_.find('[', line); bracket != std::string_view::npos; bracket = text_.find('[', line)) {
    size_t begin = bracket;
    while (begin > line && text_[begin - 1] != '\n' && IsSpace(text_[begin - 1])) --begin;
    const bool first = begin == line || text_[begin - 1] == '\n';
    line = LineEnd(text_, bracket);
    if (!first) continue;
    if (const auto name = SectionOfLine(Slice(text_, begin, line))) return Header{*name, begin, line};
  }
  return std::nullopt;
}

bool Sections::Next() {
  if (!next_) return false;
  const Header header = *next_;
  next_ = HeaderFrom(header.end);
  name_ = header.name;
  place_ = {header.begin, header.end, next_ ? next_->begin : text_.size()};
  return true;
}
