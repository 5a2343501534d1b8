// Where the sections of a text stand, for many look-ups in one text.
#ifndef MERO_PLATFORM_SECTION_INDEX_H
#define MERO_PLATFORM_SECTION_INDEX_H

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>
#include <utility>

#include "platform/core/section_text.h"

class SectionIndex {
 public:
  SectionIndex() = default;
  SectionIndex(SectionIndex&& other) noexcept
      : places_(std::exchange(other.places_, nullptr)),
        nPlaces_(std::exchange(other.nPlaces_, 0)),
        nHeaders_(std::exchange(other.nHeaders_, 0)) {}
  SectionIndex& operator=(SectionIndex&& other) noexcept {
    std::swap(places_, other.places_);
    std::swap(nPlaces_, other.nPlaces_);
    std::swap(nHeaders_, other.nHeaders_);
    return *this;
  }
  ~SectionIndex();

  // Takes linear time. False when memory ran out.
  [[nodiscard]] bool Build(std::string_view text);

  // How many sections there are, those included that stand twice.
  size_t headers() const { return nHeaders_; }

  // As FindSection() on the text that the index was built from, in constant time.
  std::optional<SectionPlace> Find(std::string_view text, std::string_view name) const;

 private:
  SectionPlace* Slot(std::string_view text, std::string_view name) const;

  SectionPlace* places_ = nullptr;  // an open-addressing table; a place without a body is a free slot
  size_t nPlaces_ = 0;              // a power of two, at least twice the number of sections
  size_t nHeaders_ = 0;
};

#endif  // MERO_PLATFORM_SECTION_INDEX_H
