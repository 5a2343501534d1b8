#include "unit_test.h"

#include <filesystem>
#include <fstream>
#include <iterator>

namespace {

size_t CountDescriptors() {
  using std::filesystem::directory_iterator;
  return static_cast<size_t>(std::distance(directory_iterator("/proc/self/fd"), directory_iterator()));
}

}  // namespace

UnitTest::UnitTest() : nDescriptors_(CountDescriptors()) {
  fake::Begin();
  fake::sleep.Returns(0);
}

UnitTest::~UnitTest() {
  fake::End();
  EXPECT_EQ(CountDescriptors(), nDescriptors_) << "descriptors are left open";
  EXPECT_EQ(memory::Held(), 0u) << "memory is left allocated";
}

std::string ReadText(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

void WriteText(const std::string& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}

void WriteScript(const std::string& path, const std::string& text) {
  WriteText(path, "#!/bin/sh\n" + text);
  std::filesystem::permissions(path, std::filesystem::perms(0755));
}
