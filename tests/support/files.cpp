// Files as a test writes and finds them.
#include "tests/support/files.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <thread>

namespace fs = std::filesystem;

void WriteText(const std::string& path, std::string_view text, mode_t mode) {
  if (const fs::path above = fs::path(path).parent_path(); !above.empty()) fs::create_directories(above);
  const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, mode);
  ASSERT_GE(fd, 0) << path;
  ASSERT_EQ(::write(fd, text.data(), text.size()), static_cast<ssize_t>(text.size())) << path;
  ASSERT_EQ(::fchmod(fd, mode), 0) << path;
  ASSERT_EQ(::close(fd), 0) << path;
}

void WriteScript(const std::string& path, const std::string& text) {
  WriteText(path, "#!/bin/sh\n" + text, 0755);
}

std::string ReadText(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  EXPECT_TRUE(file.is_open()) << path;
  return {std::istreambuf_iterator<char>(file), {}};
}

std::string TextOrNothing(const std::string& path) {
  return Exists(path) ? ReadText(path) : "";
}

bool Exists(const std::string& path) {
  return fs::exists(fs::symlink_status(path));
}

mode_t ModeOf(const std::string& path) {
  struct stat info = {};
  EXPECT_EQ(::lstat(path.c_str(), &info), 0) << path;
  return info.st_mode & 07777;
}

std::vector<std::string> NamesIn(const std::string& directory) {
  std::vector<std::string> names;
  for (const auto& entry : fs::directory_iterator(directory)) names.push_back(entry.path().filename());
  std::ranges::sort(names);
  return names;
}

void LetSettle(const std::string& path) {
  using std::chrono_literals::operator""ms;
  while (fs::file_time_type::clock::now() - fs::last_write_time(path) < 100ms) std::this_thread::sleep_for(5ms);
}
