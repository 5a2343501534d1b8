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

// Whether a text is one whole line.
bool IsOneLine(std::string_view text) {
  return text.ends_with('\n') && text.find('\n') == text.size() - 1;
}

// Expands the two "%s" of a line format; fails with EINVAL when it has another number of them, or any other conversion.
void Expand(Bytes& to, std::string_view format, Pair pair, LineEnds ends) {
  const std::string_view values[] = {pair.key, pair.value};
  size_t used = 0;
  while (!format.empty()) {
    const size_t percent = std::min(format.find('%'), format.size());
    to.Append(Slice(format, 0, percent));
    format.remove_prefix(percent);
    if (format.empty()) break;
    if (Slice(format, 0, 2) != "%s" || used == std::size(values)) return to.Fail(EINVAL);
    const std::string_view value = values[used++];
    to.Append(value);
    format.remove_prefix(2);
    const bool wouldBeCut = ends == LineEnds::kCrLf && value.ends_with('\r') && format == "\n";
    if (wouldBeCut) to.Append("\r");
  }
  if (used < std::size(values)) to.Fail(EINVAL);
}

}  // namespace

std::optional<Pair> PairOfLine(std::string_view line, ValueForm form) {
  const size_t equals = line.find('=');
  if (equals == std::string_view::npos) return std::nullopt;
  const std::string_view key = Trim(Slice(line, 0, equals));
  if (key.empty() || key.front() == '#' || key.front() == ';') return std::nullopt;
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

std::optional<SectionPlace> FindSection(std::string_view text, std::string_view name) {
  for (Sections sections(text); sections.Next();) {
    if (EqualIgnoringCase(sections.name(), name)) return sections.place();
  }
  return std::nullopt;
}

std::optional<LinePlace> FindKey(std::string_view text, std::string_view key, ValueForm form) {
  std::optional<LinePlace> place;
  for (Lines lines(text); lines.Next();) {
    const std::optional<Pair> pair = PairOfLine(lines.text(), form);
    if (pair && pair->key == key) place = LinePlace{lines.begin(), lines.end()};
  }
  return place;
}

void AppendPair(Bytes& to, const char* szFormat, Pair pair, ValueForm form, LineEnds ends) {
  const size_t begin = to.view().size();
  Expand(to, szFormat, pair, ends);

  const std::string_view written = Slice(to.view(), begin);
  Lines line(written, ends);
  const bool one = IsOneLine(written) && line.Next();
  const std::optional<Pair> read = one ? PairOfLine(line.text(), form) : std::nullopt;
  const bool same = read && read->key == pair.key && read->value == pair.value;
  if (!same) to.Fail(EINVAL);
}

void AppendHeader(Bytes& to, std::string_view name) {
  const size_t begin = to.view().size();
  to.Append("[");
  to.Append(name);
  to.Append("]\n");

  const std::string_view written = Slice(to.view(), begin);
  Lines line(written);
  const bool one = IsOneLine(written) && line.Next();
  if (!one || SectionOfLine(line.text()) != name) to.Fail(EINVAL);
}

void EndLine(Bytes& to) {
  if (!to.view().empty() && !to.view().ends_with('\n')) to.Append("\n");
}
