// What the fuzz targets share. A target is one source file here: LLVMFuzzerTestOneInput() gives one input to the code
// under test, and Require() ends the program where a promise does not hold. Each runs on a private machine
// (tests/support/private_machine.h), so that files have their real paths and nothing outside is touched.
#ifndef MERO_TESTS_FUZZ_SUPPORT_H
#define MERO_TESTS_FUZZ_SUPPORT_H

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

// Ends the program unless a promise holds, after it has said which and shown what is wrong.
void Require(bool holds, const char* szPromise, std::initializer_list<std::string_view> shown = {});

// An input as texts that end with NUL, one after the other, since most of what a caller gives is such a text. A file,
// which may hold any byte, is what is left.
class Fields {
 public:
  Fields(const std::uint8_t* data, std::size_t size) : left_(reinterpret_cast<const char*>(data), size) {}

  std::string Text();
  int Number();  // of a decimal text; 0 for any other
  bool Flag() { return Number() % 2 != 0; }
  std::string Rest() const { return std::string(left_); }

  // Fills a field of a record; it does not end when the text is as long as the field or longer.
  template <std::size_t kSize>
  void Fill(char (&szField)[kSize]) {
    Fill(szField, kSize);
  }

  // The same of a text that is cut to end within the field.
  template <std::size_t kSize>
  void FillEnded(char (&szField)[kSize]) {
    Fill(szField, kSize - 1);
  }

 private:
  void Fill(char* szField, std::size_t size);

  std::string_view left_;
};

// The text of a field of a record, which has to end within it.
std::string EndedText(const char* szField, std::size_t size);

template <std::size_t kSize>
std::string EndedText(const char (&szField)[kSize]) {
  return EndedText(szField, kSize);
}

// What the code under test makes of texts by its own rules, made once more in a plain way: without white space around,
// and line by line, without line feeds.
std::string Trimmed(const std::string& text);
std::vector<std::string> LinesOf(const std::string& text);

// A file as an input has it, and as the code under test leaves it.
void PutFile(const char* szPath, std::string_view content);
void RemoveFile(const char* szPath);
std::optional<std::string> FileAt(const char* szPath);

// Files of no appliance's.
inline constexpr char kScratchPath[] = "/mnt/scratch";

#endif  // MERO_TESTS_FUZZ_SUPPORT_H
