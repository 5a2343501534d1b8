// Where the sections of a text stand.
#include "platform/core/section_index.h"

#include <bit>
#include <cstdlib>
#include <cstring>

#include "common/text.h"

namespace {

constexpr size_t kWord = sizeof(uint64_t);

// Eight bytes of a name, the same in any case of their letters.
uint64_t WordAt(const char* text) {
  uint64_t word;
  std::memcpy(&word, text, kWord);
  return word | 0x2020202020202020;
}

uint64_t Mix(uint64_t hash, uint64_t word) {
  return (std::rotl(hash, 32) ^ word) * 0x9E3779B97F4A7C15;
}

// The same for names that differ only in the case of their letters.
size_t HashOfName(std::string_view name) {
  uint64_t hash = name.size();
  if (name.size() < kWord) {
    for (const char c : name) hash = Mix(hash, static_cast<unsigned char>(ToLower(c)));
  } else {
    const char* last = name.data() + name.size() - kWord;  // may overlap the word before it
    for (const char* at = name.data(); at < last; at += kWord) hash = Mix(hash, WordAt(at));
    hash = Mix(hash, WordAt(last));
  }
  return static_cast<size_t>(Mix(hash, 0) >> 32);  // the middle of the product, which depends on all that went in
}

bool IsSameName(std::string_view a, std::string_view b) {
  return a == b || EqualIgnoringCase(a, b);
}

bool IsFree(const SectionPlace& place) {
  return place.body == 0;  // a section's body comes after its header, so that it never begins at 0
}

std::string_view NameAt(std::string_view text, const SectionPlace& place) {
  return *SectionOfLine(Slice(text, place.header, place.body));
}

// At least the number of sections; faster than to count them, which would look at each header.
size_t MostSections(std::string_view text) {
  size_t brackets = 0;
  for (size_t at = text.find('['); at != std::string_view::npos; at = text.find('[', at + 1)) ++brackets;
  return brackets;
}

}  // namespace

SectionIndex::~SectionIndex() {
  std::free(places_);
}

// The slot that holds a name, or the free slot that would take it.
SectionPlace* SectionIndex::Slot(std::string_view text, std::string_view name) const {
  size_t slot = HashOfName(name) & (nPlaces_ - 1);
  while (!IsFree(places_[slot]) && !IsSameName(NameAt(text, places_[slot]), name)) {
    slot = (slot + 1) & (nPlaces_ - 1);
  }
  return &places_[slot];
}

bool SectionIndex::Build(std::string_view text) {
  *this = SectionIndex();
  nPlaces_ = std::bit_ceil(2 * MostSections(text) + 1);
  places_ = static_cast<SectionPlace*>(std::calloc(nPlaces_, sizeof(SectionPlace)));
  if (places_ == nullptr) return false;

  for (Sections sections(text); sections.Next(); ++nHeaders_) {
    SectionPlace* slot = Slot(text, sections.name());
    if (IsFree(*slot)) *slot = sections.place();  // of a repeated section the first stays
  }
  return true;
}

std::optional<SectionPlace> SectionIndex::Find(std::string_view text, std::string_view name) const {
  const SectionPlace& place = *Slot(text, name);
  return IsFree(place) ? std::nullopt : std::optional<SectionPlace>(place);
}
