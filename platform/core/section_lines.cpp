// Single sections and lines of settings files: finding them, and writing them.
#include "platform/core/section_text.h"

namespace {

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

void EndLine(Bytes& to, std::string_view text) {
  if (!text.empty() && !text.ends_with('\n')) to.Append("\n");
}
