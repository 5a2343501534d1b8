// Codes that cameras read, as pictures.
#ifndef MERO_TOOLS_CODE_PICTURE_H
#define MERO_TOOLS_CODE_PICTURE_H

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "base/terminal.h"

// A square of light and dark fields, with the light border that cameras look for.
class CodePicture {
 public:
  // The code of these bytes, up to some two thousand.
  explicit CodePicture(std::string_view bytes);

  std::size_t size() const { return size_; }  // of a side, in fields

  // The columns that it takes on a terminal.
  std::size_t WidthOn(const Terminal& terminal) const { return terminal.utf8 ? size_ : 2 * size_; }

  // In lines. A terminal that takes colours gets them, also where none are wanted, since only dark fields on light ones
  // are read by every camera. Elsewhere the light fields are drawn, as is right for light letters on dark ground.
  std::string On(const Terminal& terminal) const;

  std::string Svg() const;
  std::string Png() const;

 private:
  bool IsDark(std::size_t row, std::size_t column) const;

  std::size_t size_;
  std::vector<bool> dark_;  // row by row, without the border
};

#endif  // MERO_TOOLS_CODE_PICTURE_H
