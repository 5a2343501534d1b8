// Where the sections of a text stand.
#include "platform/core/section_index.h"

#include <bit>
#include <cstdlib>

#include "common/text.h"

namespace {

uint32_t HashOfName(std::string_view name) {
  uint32_t hash = 2166136261u;
  for (const char c : name) hash = (hash ^ static_cast<unsigned char>(ToLower(c))) * 16777619u;
  return hash;
}

bool IsFree(const SectionPlace& place) {
  return place.body == 0;  // no body begins a text: its header does
}

std::string_view NameAt(std::string_view text, const SectionPlace& place) {
  return *SectionOfLine(Slice(text, place.header, place.body));
}

}  // namespace

SectionIndex::~SectionIndex() {
  std::free(places_);
}

// The slot of a name: where it stands, or the free one where it would.
SectionPlace* SectionIndex::Slot(std::string_view text, std::string_view name) const {
  size_t slot = HashOfName(name) & (nPlaces_ - 1);
  while (!IsFree(places_[slot]) && !EqualIgnoringCase(NameAt(text, places_[slot]), name)) {
    slot = (slot + 1) & (nPlaces_ - 1);
  }
  return &places_[slot];
}

// Of a repeated section the first stays.
void SectionIndex::Add(std::string_view text, const SectionPlace& place) {
  SectionPlace* slot = Slot(text, NameAt(text, place));
  if (IsFree(*slot)) *slot = place;
}

bool SectionIndex::Build(std::string_view text) {
  *this = SectionIndex();
  nHeaders_ = CountSections(text);
  nPlaces_ = std::bit_ceil(2 * nHeaders_ + 1);
  places_ = static_cast<SectionPlace*>(std::calloc(nPlaces_, sizeof(SectionPlace)));
  if (places_ == nullptr) return false;

  std::optional<SectionPlace> open;
  for (Lines lines(text); lines.Next();) {
    if (!SectionOfLine(lines.text())) continue;
    if (open) Add(text, {open->header, open->body, lines.begin()});
    open = SectionPlace{lines.begin(), lines.end(), text.size()};
  }
  if (open) Add(text, *open);
  return true;
}

std::optional<SectionPlace> SectionIndex::Find(std::string_view text, std::string_view name) const {
  const SectionPlace& place = *Slot(text, name);
  return IsFree(place) ? std::nullopt : std::optional<SectionPlace>(place);
}
