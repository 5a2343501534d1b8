// Section files.
#include <cstring>

#include "common/paths.h"
#include "common/text.h"
#include "platform/base/failure.h"
#include "platform/core/section_text.h"
#include "platform/core/settings_file.h"
#include "platform/core/text_hash.h"
#include "platform/core/text_list.h"

namespace {

constexpr mode_t kMode = 0600;  // sections hold settings, and secrets among them

// The pairs that a section is to hold, and the form of their lines.
struct NewPairs {
  const PLIBSZHASH* hash;
  const char* szFormat;
};

bool IsPair(const Lines& lines) {
  return PairOfLine(lines.text(), ValueForm::kPlain).has_value();
}

// Where in a section's body its pairs begin, and where they end; both at the start when there are none.
LinePlace PlaceOfPairs(std::string_view body) {
  std::optional<LinePlace> place;
  for (Lines lines(body); lines.Next();) {
    if (IsPair(lines)) place = LinePlace{place ? place->begin : lines.begin(), lines.end()};
  }
  return place.value_or(LinePlace{0, 0});
}

void AppendPairs(Bytes& content, const NewPairs& pairs, LineEnds ends) {
  for (const HashEntry* entry = pairs.hash->first; entry != nullptr; entry = entry->next) {
    AppendPair(content, pairs.szFormat, {entry->szKey, entry->szValue}, ValueForm::kPlain, ends);
  }
}

void AppendAllButPairs(Bytes& content, std::string_view text) {
  for (Lines lines(text); lines.Next();) {
    if (!IsPair(lines)) content.Append(lines.whole());
  }
}

// The text and, behind it, the header of a new section.
void ComposeNewHeader(std::string_view text, const char* szSection, Revision& revision) {
  revision.before = text;
  EndLine(revision.content, text);
  AppendHeader(revision.content, szSection);
}

// The text with the pairs of one section replaced, and its header when it gets a new name.
void ComposeReplaced(std::string_view text, const SectionPlace& place, const char* szNewName, const NewPairs& pairs,
                     Revision& revision) {
  const std::string_view body = Slice(text, place.body, place.end);
  const LinePlace old = PlaceOfPairs(body);

  Bytes& content = revision.content;
  revision.before = Slice(text, 0, place.header);
  if (szNewName != nullptr) {
    AppendHeader(content, szNewName);
  } else {
    content.Append(Slice(text, place.header, place.body));
  }
  content.Append(Slice(body, 0, old.begin));
  EndLine(content, content.view());
  AppendPairs(content, pairs, szNewName != nullptr ? LineEnds::kLf : LineEndsOf(text, place));
  AppendAllButPairs(content, Slice(body, old.begin));
  revision.behind = Slice(text, place.end);
}

void ComposeSection(std::string_view text, const char* szSection, const char* szNewName, const NewPairs& pairs,
                    Revision& revision) {
  const std::optional<SectionPlace> place = FindSection(text, szSection);
  if (place) return ComposeReplaced(text, *place, szNewName, pairs, revision);
  ComposeNewHeader(text, szNewName != nullptr ? szNewName : szSection, revision);
  AppendPairs(revision.content, pairs, LineEnds::kLf);
}

// Where the line of a key is to stand in a text: in place of the old one, or behind the section's last pair.
LinePlace PlaceOfKey(std::string_view text, const SectionPlace& section, std::string_view key) {
  const std::string_view body = Slice(text, section.body, section.end);
  const size_t behindPairs = PlaceOfPairs(body).end;
  const LinePlace place = FindKey(body, key, ValueForm::kPlain).value_or(LinePlace{behindPairs, behindPairs});
  return {section.body + place.begin, section.body + place.end};
}

void ComposeValue(std::string_view text, const char* szSection, const Pair& pair, const char* szFormat,
                  Revision& revision) {
  const std::optional<SectionPlace> section = FindSection(text, szSection);
  if (!section) {
    ComposeNewHeader(text, szSection, revision);
    return AppendPair(revision.content, szFormat, pair, ValueForm::kPlain);
  }

  const LinePlace place = PlaceOfKey(text, *section, pair.key);
  revision.before = Slice(text, 0, place.begin);
  EndLine(revision.content, revision.before);
  AppendPair(revision.content, szFormat, pair, ValueForm::kPlain, LineEndsOf(text, *section));
  revision.behind = Slice(text, place.end);
}

// Appends a text without its sections of a name.
void AppendWithout(Bytes& content, std::string_view text, std::string_view name) {
  size_t copied = 0;
  for (Sections sections(text); sections.Next();) {
    if (!EqualIgnoringCase(sections.name(), name)) continue;
    const SectionPlace& place = sections.place();
    content.Append(Slice(text, copied, place.header));
    copied = place.end;
  }
  content.Append(Slice(text, copied));
}

int WriteSection(const char* szPath, const char* szSection, const char* szNewName, const NewPairs& pairs) {
  if (pairs.hash->lacksPair) {
    LOG("%s is not written: a pair of [%s] found no memory", szPath, szSection);
    return PLIBCErrSet(ERR_OUT_OF_MEMORY), -1;
  }
  return ChangeSettings(szPath, kMode, [&](std::string_view text, Revision& revision) {
    ComposeSection(text, szSection, szNewName, pairs, revision);
  });
}

}  // namespace

int PLIBCFileEnumSection(const char* szPath, PPLIBSZLIST* ppslList) {
  if (szPath == nullptr || ppslList == nullptr || *ppslList == nullptr) return REFUSE_NULL(), -1;

  Bytes text;
  if (const int result = ReadSettings(szPath, text); result <= 0) return result;

  PLIBSZLIST& list = **ppslList;
  const int before = list.nItem;
  const bool keep = CanKeepFile(list) && std::strcmp(szPath, kKnownNetworksPath) == 0;
  for (Sections sections(text.view()); sections.Next();) {
    // No name leads to such a section, and up to the NUL its name may be another one's.
    if (sections.name().find('\0') != std::string_view::npos) continue;
    if (!AppendToList(list, sections.name(), keep ? sections.whole() : std::string_view())) {
      TruncateList(list, before);
      return FAIL(ENOMEM, "Failed to read %s", szPath), -1;
    }
  }
  if (keep) KeepFile(list, std::move(text));
  return list.nItem - before;
}

int PLIBCFileGetSection(const char* szPath, const char* szSection, PPLIBSZHASH* ppshHash) {
  if (szPath == nullptr || szSection == nullptr || ppshHash == nullptr || *ppshHash == nullptr) {
    return REFUSE_NULL(), -1;
  }

  Bytes text;
  if (const int result = ReadSettings(szPath, text); result <= 0) return result;

  const std::optional<SectionPlace> place = FindSection(text.view(), szSection);
  if (!place) return PLIBCErrSet(ERR_SECTION_NOT_FOUND), 0;
  for (Lines lines = LinesOf(text.view(), *place); lines.Next();) {
    const std::optional<Pair> pair = PairOfLine(lines.text(), ValueForm::kPlain);
    if (pair && !SetInHash(**ppshHash, pair->key, pair->value)) return FAIL(ENOMEM, "Failed to read %s", szPath), -1;
  }
  return 1;
}

int PLIBCFileAddSection(const char* szPath, const char* szSection, const PLIBSZHASH* pshHash, const char* szFormat) {
  if (szPath == nullptr || szSection == nullptr || pshHash == nullptr || szFormat == nullptr) return REFUSE_NULL(), -1;
  return WriteSection(szPath, szSection, nullptr, {pshHash, szFormat});
}

int PLIBCFileSetSection(const char* szPath, const char* szSection, const char* szNewName, const PLIBSZHASH* pshHash,
                        const char* szFormat) {
  if (szPath == nullptr || szSection == nullptr || pshHash == nullptr || szFormat == nullptr) return REFUSE_NULL(), -1;
  return WriteSection(szPath, szSection, szNewName, {pshHash, szFormat});
}

int PLIBCFileSetSectionValue(const char* szPath, const char* szSection, const char* szKey, const char* szValue,
                             const char* szFormat) {
  if (szPath == nullptr || szSection == nullptr || szKey == nullptr || szValue == nullptr || szFormat == nullptr) {
    return REFUSE_NULL(), -1;
  }
  const int result = ChangeSettings(szPath, kMode, [&](std::string_view text, Revision& revision) {
    ComposeValue(text, szSection, {szKey, szValue}, szFormat, revision);
  });
  return result > 0 ? 0 : result;
}

int PLIBCFileRemoveSection(const char* szPath, const char* szSection) {
  if (szPath == nullptr || szSection == nullptr) return REFUSE_NULL(), -1;
  return ShortenSettings(szPath, ERR_SECTION_NOT_FOUND, [&](std::string_view text, Revision& revision) {
    AppendWithout(revision.content, text, szSection);
  });
}
