// Codes that cameras read, as pictures.
#include "show/code_picture.h"

#include <png.h>
#include <qrencode.h>

#include <algorithm>
#include <memory>
#include <new>

#include "base/text.h"

namespace {

constexpr std::size_t kBorder = 4;  // fields on each side

using Code = std::unique_ptr<QRcode, void (*)(QRcode*)>;
using Input = std::unique_ptr<QRinput, void (*)(QRinput*)>;

bool IsAscii(std::string_view bytes) {
  return std::ranges::all_of(bytes, [](unsigned char c) { return c < 0x80; });
}

// A code says when its bytes are UTF-8, since readers guess wrong elsewhere.
Code Encode(std::string_view bytes) {
  constexpr unsigned kUtf8 = 26;
  const auto* data = reinterpret_cast<const unsigned char*>(bytes.data());
  const Input input(QRinput_new2(0, QR_ECLEVEL_M), QRinput_free);
  const bool says = !IsAscii(bytes) && IsUtf8(bytes);
  Code code(nullptr, QRcode_free);
  if (input && (!says || QRinput_appendECIheader(input.get(), kUtf8) == 0) &&
      QRinput_append(input.get(), QR_MODE_8, static_cast<int>(bytes.size()), data) == 0) {
    code.reset(QRcode_encodeInput(input.get()));
  }
  if (!code) throw std::bad_alloc();  // a code has room for far more than a name and a secret
  return code;
}

// Two fields, one above the other, by the light ones.
std::string_view HalfBlocks(bool upperIsDark, bool lowerIsDark) {
  if (upperIsDark) return lowerIsDark ? " " : "▄";
  return lowerIsDark ? "▀" : "█";
}

// The letters are white, and so are the fields that they draw.
std::string Line(const std::string& fields, const Terminal& terminal) {
  return terminal.obeys ? "\x1b[1;37;40m" + fields + "\x1b[0m\n" : fields + "\n";
}

}  // namespace

CodePicture::CodePicture(std::string_view bytes) : size_(0) {
  const auto code = Encode(bytes);
  const auto width = static_cast<std::size_t>(code->width);
  size_ = width + 2 * kBorder;
  dark_.reserve(width * width);
  for (std::size_t i = 0; i < width * width; ++i) dark_.push_back((code->data[i] & 1) != 0);
}

bool CodePicture::IsDark(std::size_t row, std::size_t column) const {
  const std::size_t width = size_ - 2 * kBorder;
  row -= kBorder;  // a great number within the border above, like the column
  column -= kBorder;
  return row < width && column < width && dark_[row * width + column];
}

std::string CodePicture::On(const Terminal& terminal) const {
  std::string lines;
  for (std::size_t row = 0; row < size_; row += terminal.utf8 ? 2 : 1) {
    std::string fields;
    for (std::size_t column = 0; column < size_; ++column) {
      fields += terminal.utf8         ? HalfBlocks(IsDark(row, column), row + 1 == size_ || IsDark(row + 1, column))
                : IsDark(row, column) ? "  "
                                      : "##";
    }
    lines += Line(fields, terminal);
  }
  return lines;
}

// Each run of dark fields in a row is a rectangle of the path.
std::string CodePicture::Svg() const {
  const std::string side = std::to_string(size_);
  std::string path;
  for (std::size_t row = 0; row < size_; ++row) {
    for (std::size_t column = 0; column < size_; ++column) {
      if (!IsDark(row, column)) continue;
      const std::size_t first = column;
      while (IsDark(row, column)) ++column;
      path.append("M").append(std::to_string(first)).append(" ").append(std::to_string(row));
      const std::string run = std::to_string(column - first);
      path.append("h").append(run).append("v1h-").append(run).append("z");
    }
  }
  return "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 " + side + " " + side +
         "\" shape-rendering=\"crispEdges\">\n<rect width=\"" + side + "\" height=\"" + side +
         "\" fill=\"#fff\"/>\n<path d=\"" + path + "\"/>\n</svg>\n";
}

std::string CodePicture::Png() const {
  constexpr std::size_t kScale = 8;  // dots for the side of a field
  const std::size_t side = kScale * size_;
  std::string dots;
  dots.reserve(side * side);
  for (std::size_t i = 0; i < side * side; ++i) {
    dots += IsDark(i / side / kScale, i % side / kScale) ? '\x00' : '\xff';
  }
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  image.format = PNG_FORMAT_GRAY;
  image.width = image.height = static_cast<png_uint_32>(side);
  std::string png(PNG_IMAGE_PNG_SIZE_MAX(image), '\0');
  png_alloc_size_t size = png.size();
  if (png_image_write_to_memory(&image, png.data(), &size, 0, dots.data(), 0, nullptr) == 0) throw std::bad_alloc();
  png.resize(size);
  return png;
}
