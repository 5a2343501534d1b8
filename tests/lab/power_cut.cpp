// power-cut: a disk as a loss of power leaves it, and what was lost by that. The writes to the disk were recorded by
// the kernel's dm-log-writes, which tells in which order they were done, and what was flushed; marks say which call had
// returned.
//
//   power-cut list LOG
//       the places at which the power may go, one a line: how many entries of the log come before it, the last mark
//       among these, and how many writes follow until the next flush or mark
//   power-cut make LOG FIRST DISK PLACE WAY SEED
//       writes the disk, which began as FIRST: all that comes before the place, and of the writes that follow `none`,
//       `some` of them, or some and of these some blocks alone (`torn`), by chance
//   power-cut judge SEEN BEFORE AFTER
//       compares the settings files below three directories: as they were seen, as they were before the call that was
//       under way, and as it left them
//
// `judge` prints what else it saw: "old", "new" or "between", then "left" when temporary files lie about, and "damaged"
// when a file is that is written in place, and last a number that tells apart what was seen. It exits with 1, and names
// what was lost, when something was.
#include <fcntl.h>
#include <fnmatch.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <optional>
#include <random>
#include <set>
#include <span>
#include <sstream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "common/descriptor.h"

namespace {

namespace fs = std::filesystem;

[[noreturn]] void FailOf(const std::string& what) {
  throw std::system_error(errno, std::generic_category(), what);
}

std::uint64_t Number(std::string_view text) {
  std::uint64_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || end != text.data() + text.size())
    throw std::runtime_error("no number: " + std::string(text));
  return number;
}

// ---- The log -------------------------------------------------------------------------------------------------

// As the kernel writes it, in the order of bytes of every machine that the lab has.
struct LogHead {
  std::uint64_t magic;
  std::uint64_t version;
  std::uint64_t entries;
  std::uint32_t sectorSize;
};
constexpr std::uint64_t kMagic = 0x6a736677736872;
constexpr std::uint64_t kVersion = 1;

struct EntryHead {
  std::uint64_t sector;
  std::uint64_t sectors;
  std::uint64_t flags;
  std::uint64_t markSize;
};
enum Flag : std::uint64_t { kFlush = 1, kFua = 2, kDiscard = 4, kMark = 8 };

struct Entry {
  EntryHead head;
  std::string mark;
  std::string_view data;

  bool is(std::uint64_t flags) const { return (head.flags & flags) != 0; }
};

class Log {
 public:
  explicit Log(const char* path) {
    const Descriptor file(::open(path, O_RDONLY | O_CLOEXEC));
    if (!file.valid()) FailOf(path);
    const off_t size = ::lseek(file.get(), 0, SEEK_END);
    if (size < 0) FailOf(path);
    void* start = ::mmap(nullptr, static_cast<std::size_t>(size), PROT_READ, MAP_PRIVATE, file.get(), 0);
    if (start == MAP_FAILED) FailOf(path);
    text_ = {static_cast<const char*>(start), static_cast<std::size_t>(size)};
    ReadEntries();
  }

  std::span<const Entry> entries() const { return entries_; }
  std::uint64_t sectorSize() const { return sectorSize_; }

 private:
  std::string_view Bytes(std::uint64_t offset, std::uint64_t size) const {
    if (offset > text_.size() || size > text_.size() - offset) throw std::runtime_error("the log is cut short");
    return text_.substr(offset, size);
  }

  template <class Head>
  Head HeadAt(std::uint64_t offset) const {
    Head head;
    std::memcpy(&head, Bytes(offset, sizeof head).data(), sizeof head);
    return head;
  }

  // Each entry has a sector to itself, with the mark's text behind the head, and then its data.
  void ReadEntries() {
    const auto head = HeadAt<LogHead>(0);
    if (head.magic != kMagic || head.version != kVersion) throw std::runtime_error("this is no log of writes");
    sectorSize_ = head.sectorSize;
    std::uint64_t offset = sectorSize_;
    for (std::uint64_t i = 0; i < head.entries; ++i) {
      const auto entry = HeadAt<EntryHead>(offset);
      const bool hasData = (entry.flags & kDiscard) == 0;
      const std::uint64_t size = hasData ? entry.sectors * sectorSize_ : 0;
      entries_.push_back(
          {entry, std::string(Bytes(offset + sizeof entry, entry.markSize)), Bytes(offset + sectorSize_, size)});
      offset += sectorSize_ + size;
    }
  }

  std::string_view text_;
  std::uint64_t sectorSize_ = 0;
  std::vector<Entry> entries_;
};

// The writes that were done and not flushed when the power went: those up to the next flush or mark. One that is on the
// disk itself once it is done (FUA) is the last of them, since whoever asks for that waits for it; what was done before
// it and is logged behind it is not tried without it.
std::span<const Entry> WritesBehind(std::span<const Entry> entries, std::size_t place) {
  const auto behind = entries.subspan(place);
  const auto end = std::ranges::find_if(behind, [](const Entry& entry) { return entry.is(kFlush | kFua | kMark); });
  const bool isWrite = end != behind.end() && !end->is(kFlush | kMark);
  return behind.first(static_cast<std::size_t>(end - behind.begin()) + (isWrite ? 1 : 0));
}

void List(const Log& log) {
  std::string mark = "-";
  for (std::size_t i = 0; i < log.entries().size(); ++i) {
    const Entry& entry = log.entries()[i];
    if (entry.is(kMark)) mark = entry.mark;
    if (!entry.is(kFlush | kFua | kMark)) continue;
    std::printf("%zu %s %zu\n", i + 1, mark.c_str(), WritesBehind(log.entries(), i + 1).size());
  }
}

// ---- The disk ------------------------------------------------------------------------------------------------

// What a disk writes whole or not at all.
constexpr std::size_t kBlock = 4096;

class Disk {
 public:
  Disk(const char* path, const char* first)
      : file_(::open(path, O_RDWR | O_CREAT | O_TRUNC | O_CLOEXEC, 0600)), path_(path) {
    const Descriptor from(::open(first, O_RDONLY | O_CLOEXEC));
    if (!file_.valid() || !from.valid()) FailOf(path_);
    const off_t size = ::lseek(from.get(), 0, SEEK_END);
    if (size < 0 || ::ftruncate(file_.get(), size) < 0) FailOf(path_);
    // A disk is empty for the most part, and what is empty is not copied.
    for (off_t end = 0, start; (start = ::lseek(from.get(), end, SEEK_DATA)) >= 0;) {
      end = ::lseek(from.get(), start, SEEK_HOLE);
      std::string bytes(static_cast<std::size_t>(end - start), '\0');
      if (::pread(from.get(), bytes.data(), bytes.size(), start) != end - start) FailOf(first);
      Write(start, bytes);
    }
  }

  void Write(off_t offset, std::string_view bytes) {
    const ssize_t put = ::pwrite(file_.get(), bytes.data(), bytes.size(), offset);
    if (put < 0 || static_cast<std::size_t>(put) != bytes.size()) FailOf(path_);
  }

  void Discard(off_t offset, off_t size) {
    constexpr int kHole = FALLOC_FL_PUNCH_HOLE | FALLOC_FL_KEEP_SIZE;
    if (size > 0 && ::fallocate(file_.get(), kHole, offset, size) < 0) FailOf(path_);
  }

 private:
  Descriptor file_;
  const char* path_;
};

enum class Way { kNone, kSome, kTorn };

Way WayOf(std::string_view text) {
  if (text == "none") return Way::kNone;
  if (text == "some") return Way::kSome;
  if (text == "torn") return Way::kTorn;
  throw std::runtime_error("neither none, some nor torn: " + std::string(text));
}

class Cut {
 public:
  Cut(const Log& log, Disk& disk, std::uint64_t seed) : log_(log), disk_(disk), chance_(seed) {}

  void Make(std::size_t place, Way way) {
    for (const Entry& entry : log_.entries().first(place)) Do(entry);
    if (way == Way::kNone) return;
    for (const Entry& entry : WritesBehind(log_.entries(), place)) {
      if (Happens()) way == Way::kTorn ? Tear(entry) : Do(entry);
    }
  }

 private:
  bool Happens() { return (chance_() & 1) != 0; }

  off_t OffsetOf(const Entry& entry) const { return static_cast<off_t>(entry.head.sector * log_.sectorSize()); }

  void Do(const Entry& entry) {
    if (!entry.is(kDiscard)) return disk_.Write(OffsetOf(entry), entry.data);
    disk_.Discard(OffsetOf(entry), static_cast<off_t>(entry.head.sectors * log_.sectorSize()));
  }

  void Tear(const Entry& entry) {
    if (entry.data.size() <= kBlock) return Do(entry);
    for (std::size_t start = 0; start < entry.data.size(); start += kBlock) {
      if (Happens()) disk_.Write(OffsetOf(entry) + static_cast<off_t>(start), entry.data.substr(start, kBlock));
    }
  }

  const Log& log_;
  Disk& disk_;
  std::mt19937_64 chance_;
};

// ---- The settings --------------------------------------------------------------------------------------------

// What becomes of a file when it is changed.
enum class Kind {
  kReplaced,  // in one step by each call: it is the old one or the new one
  kByKeys,    // in one step for each key: each line is an old one or a new one
  kInPlace,   // written by steps that are promised, or a copy: it may be anything, and the next call makes it anew
  kLeft,      // a file beside another one, which was to take its place
};

// The first row that fits is a file's.
constexpr struct {
  const char* pattern;
  Kind kind;
} kKinds[] = {
    {"*/.*", Kind::kLeft},
    {"*.??????????", Kind::kLeft},
    {"*.??????", Kind::kLeft},
    {"usr/mero/etc/wpa_supplicant.conf", Kind::kInPlace},
    {"etc/hostapd/hostapd-*-host.conf", Kind::kInPlace},
    {"etc/hostapd/hostapd-*-guest.*", Kind::kInPlace},
    {"etc/resolv.conf.wireless.bak", Kind::kInPlace},
    {"usr/mero/etc/*", Kind::kReplaced},
    {"etc/resolv.conf", Kind::kReplaced},
    {"*", Kind::kByKeys},
};

Kind KindOf(const std::string& name) {
  for (const auto& [pattern, kind] : kKinds) {
    if (::fnmatch(pattern, name.c_str(), 0) == 0) return kind;
  }
  return Kind::kByKeys;
}

using Files = std::map<std::string, std::string>;

Files FilesBelow(const char* directory) {
  Files files;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(directory)) {
    if (!fs::is_regular_file(entry.symlink_status())) continue;
    std::ifstream file(entry.path(), std::ios::binary);
    std::ostringstream text;
    text << file.rdbuf();
    if (!file) throw std::runtime_error("cannot read " + entry.path().string());
    files[fs::relative(entry.path(), directory).string()] = text.str();
  }
  return files;
}

std::size_t SumOf(const Files& files) {
  std::string all;
  for (const auto& [name, text] : files) all.append(name).append("\0", 1).append(text).append("\0", 1);
  return std::hash<std::string>()(all);
}

using Text = std::optional<std::string>;  // none when there is no file

Text TextOf(const Files& files, const std::string& name) {
  const auto found = files.find(name);
  return found == files.end() ? Text() : Text(found->second);
}

std::vector<std::string> LinesOf(const Text& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text.value_or(""));
  for (std::string line; std::getline(stream, line);) lines.push_back(line);
  return lines;
}

std::set<std::string> KeysOf(const Text& text) {
  std::set<std::string> keys;
  for (const std::string& line : LinesOf(text)) keys.insert(line.substr(0, line.find('=')));
  return keys;
}

class Judgement {
 public:
  Judgement(const char* seen, const char* before, const char* after)
      : seen_(FilesBelow(seen)), before_(FilesBelow(before)), after_(FilesBelow(after)) {}

  bool Make() {
    std::set<std::string> names;
    for (const Files* files : {&seen_, &before_, &after_}) {
      for (const auto& [name, text] : *files) names.insert(name);
    }
    for (const std::string& name : names) Look(name, KindOf(name));
    std::printf("%s%s%s %zx\n", old_ ? "old" : (new_ ? "new" : "between"), left_ ? " left" : "",
                damaged_ ? " damaged" : "", SumOf(seen_));
    return good_;
  }

 private:
  void Look(const std::string& name, Kind kind) {
    const Text seen = TextOf(seen_, name), before = TextOf(before_, name), after = TextOf(after_, name);
    if (kind == Kind::kLeft) {
      left_ = true;
      return;
    }
    if (kind == Kind::kInPlace) {
      damaged_ = damaged_ || (seen != before && seen != after);
      return;
    }
    old_ = old_ && seen == before;
    new_ = new_ && seen == after;
    // A file that was not there is touched first, and empty until it is replaced.
    const bool isJustMade = !before && seen && seen->empty();
    if (seen == before || seen == after || isJustMade) return;
    kind == Kind::kByKeys ? LookAtLines(name, seen, before, after)
                          : Tell(name, "is neither the old one nor the new one");
  }

  void LookAtLines(const std::string& name, const Text& seen, const Text& before, const Text& after) {
    if (before && after && !seen) return Tell(name, "is gone");
    if (seen && !seen->empty() && seen->back() != '\n') Tell(name, "does not end");
    std::set<std::string> known;
    for (const Text* text : {&before, &after}) {
      for (const std::string& line : LinesOf(*text)) known.insert(line);
    }
    std::set<std::string> lines;
    for (const std::string& line : LinesOf(seen)) {
      if (!known.contains(line)) Tell(name, "has a line that never was");
      if (!lines.insert(line).second) Tell(name, "has a line twice");
    }
    const std::set<std::string> keys = KeysOf(seen), keysAfter = KeysOf(after);
    for (const std::string& key : KeysOf(before)) {
      if (keysAfter.contains(key) && !keys.contains(key)) Tell(name, "has lost " + key);
    }
  }

  void Tell(const std::string& name, const std::string& what) {
    std::fprintf(stderr, "%s %s\n", name.c_str(), what.c_str());
    good_ = false;
  }

  Files seen_, before_, after_;
  bool old_ = true, new_ = true, left_ = false, damaged_ = false, good_ = true;
};

int Run(std::span<char*> words) {
  const std::string_view command = words.size() > 1 ? words[1] : "";
  if (command == "list" && words.size() == 3) return List(Log(words[2])), 0;
  if (command == "make" && words.size() == 8) {
    const Log log(words[2]);
    const std::uint64_t place = Number(words[5]);
    if (place > log.entries().size()) throw std::runtime_error("the log has no such place");
    Disk disk(words[4], words[3]);
    Cut(log, disk, Number(words[7])).Make(place, WayOf(words[6]));
    return 0;
  }
  if (command == "judge" && words.size() == 5) return Judgement(words[2], words[3], words[4]).Make() ? 0 : 1;
  throw std::runtime_error("wrong words: its first comment tells the right ones");
}

}  // namespace

int main(int count, char** words) {
  try {
    return Run({words, static_cast<std::size_t>(count)});
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "power-cut: %s\n", failure.what());
    return 2;
  }
}
