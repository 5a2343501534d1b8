// Codes that cameras read, as pictures.
#include "show/code_picture.h"

#include <png.h>
#include <qrencode.h>

#include <algorithm>
#include <memory>
#include <new>

#include "base/failure.h"
#include "base/loaded_library.h"
#include "base/text.h"

namespace {

constexpr std::size_t kBorder = 4;  // fields on each side

// ---- The libraries ----
//
// They are loaded with the first picture, and not with each start of the program.

// What makes codes. Its header does not tell the SONAME.
struct CodeLibrary : LoadedLibrary {
  CodeLibrary() : LoadedLibrary("libqrencode.so.4") {}

  decltype(QRinput_new2)* newInput = Find<decltype(QRinput_new2)>("QRinput_new2");
  decltype(QRinput_appendECIheader)* addEncoding = Find<decltype(QRinput_appendECIheader)>("QRinput_appendECIheader");
  decltype(QRinput_append)* addBytes = Find<decltype(QRinput_append)>("QRinput_append");
  decltype(QRcode_encodeInput)* encode = Find<decltype(QRcode_encodeInput)>("QRcode_encodeInput");
  decltype(QRinput_free)* freeInput = Find<decltype(QRinput_free)>("QRinput_free");
  decltype(QRcode_free)* freeCode = Find<decltype(QRcode_free)>("QRcode_free");
};

const CodeLibrary& Codes() {
  try {
    static const CodeLibrary library;
    return library;
  } catch (const NotLoaded& missing) {
    throw Failure(Exit::kFailed, std::string("no code can be drawn: ") + missing.what(), "install that library");
  }
}

// What writes pictures.
struct PictureLibrary : LoadedLibrary {
  static_assert(PNG_LIBPNG_VER_SONUM == 16, "load the library of this header");
  PictureLibrary() : LoadedLibrary("libpng16.so.16") {}

  decltype(png_image_write_to_memory)* write = Find<decltype(png_image_write_to_memory)>("png_image_write_to_memory");
};

const PictureLibrary& Pictures() {
  try {
    static const PictureLibrary library;
    return library;
  } catch (const NotLoaded& missing) {
    throw Failure(Exit::kFailed, std::string("no picture can be written: ") + missing.what(),
                  "install that library, or take --svg");
  }
}

// ---- The code ----

using Code = std::unique_ptr<QRcode, void (*)(QRcode*)>;
using Input = std::unique_ptr<QRinput, void (*)(QRinput*)>;

bool IsAscii(std::string_view bytes) {
  return std::ranges::all_of(bytes, [](unsigned char c) { return c < 0x80; });
}

// A code says when its bytes are UTF-8, since readers guess wrong elsewhere.
Code Encode(std::string_view bytes) {
  constexpr unsigned kUtf8 = 26;
  const CodeLibrary& library = Codes();
  const auto* data = reinterpret_cast<const unsigned char*>(bytes.data());
  const Input input(library.newInput(0, QR_ECLEVEL_M), library.freeInput);
  const bool says = !IsAscii(bytes) && IsUtf8(bytes);
  Code code(nullptr, library.freeCode);
  if (input && (!says || library.addEncoding(input.get(), kUtf8) == 0) &&
      library.addBytes(input.get(), QR_MODE_8, static_cast<int>(bytes.size()), data) == 0) {
    code.reset(library.encode(input.get()));
  }
  if (!code) throw std::bad_alloc();  // a code has room for far more than a name and a secret
  return code;
}

// ---- The picture ----

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
  if (Pictures().write(&image, png.data(), &size, 0, dots.data(), 0, nullptr) == 0) throw std::bad_alloc();
  png.resize(size);
  return png;
}
