// Reading one known network from its file.
//
// Callers that list all networks ask for one after another, from the first to the last. Reading the file anew for each
// would take quadratic time, so its text is kept during such a walk, for as long as the file is provably the same. The
// walk takes one reading, and nothing of the file, least of all its secrets, stays in memory behind it.
#include <sys/stat.h>

#include <algorithm>
#include <cstdlib>
#include <ctime>
#include <new>

#include "common/clock.h"
#include "common/known_networks_file.h"
#include "common/text.h"
#include "platform/base/failure.h"
#include "platform/base/file_read.h"
#include "platform/core/radio_texts.h"
#include "platform/core/section_index.h"

namespace {

constexpr int kNoSection = ENODATA;

// What tells a file that was replaced or written to from the one that was read.
struct FileStamp {
  dev_t device;
  ino_t inode;
  off_t size;
  timespec modified;
  timespec changed;
};

bool Equal(const timespec& a, const timespec& b) {
  return a.tv_sec == b.tv_sec && a.tv_nsec == b.tv_nsec;
}

bool Equal(const FileStamp& a, const FileStamp& b) {
  return a.device == b.device && a.inode == b.inode && a.size == b.size && Equal(a.modified, b.modified) &&
         Equal(a.changed, b.changed);
}

Result<FileStamp> StampOf(const char* szPath) {
  struct stat info;
  if (::stat(szPath, &info) < 0) return Status::Failed(errno);
  return FileStamp{info.st_dev, info.st_ino, info.st_size, info.st_mtim, info.st_ctim};
}

int64_t Nanoseconds(const timespec& time) {
  return int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

// Whether a change from now on is bound to show in the stamp: file times advance in ticks, and a second change within
// one tick does not.
bool HasSettled(const FileStamp& stamp) {
  constexpr int64_t kSeveralTicks = 50'000'000;
  timespec now;
  ::clock_gettime(CLOCK_REALTIME, &now);
  return Nanoseconds(now) - Nanoseconds(stamp.changed) > kSeveralTicks;
}

struct KeptFile {
  Bytes text;
  FileStamp stamp;
  SectionIndex index;
};

size_t g_asked = 0;  // how many sections were asked for since the first; 0 when no walk is under way
KeptFile* g_kept = nullptr;

void Drop() {
  if (g_kept == nullptr) return;
  g_kept->~KeptFile();
  std::free(g_kept);
  g_kept = nullptr;
}

void EndWalk() {
  g_asked = 0;
  Drop();
}

// Counts a question for a section, of `total` in the file. A walk begins with the first section, and goes on for as
// many questions as there are sections: by number, since one may stand in the file twice, or have a name that no
// question can give.
void Advance(bool first, size_t total) {
  if (g_asked > 0 || first) ++g_asked;
  if (g_asked >= total) EndWalk();
}

// Keeps a text, if there is memory for it; not to keep it only costs time.
void Keep(Bytes&& text, SectionIndex&& index, const FileStamp& stamp) {
  void* room = std::malloc(sizeof(KeptFile));
  if (room != nullptr) g_kept = new (room) KeptFile{std::move(text), stamp, std::move(index)};
}

// Seconds as a number; one beyond 32 bits is the nearest that has them, and 0 stands for what is none.
int32_t ParseTime(std::string_view text) {
  constexpr int64_t kMany = int64_t{1} << 40;
  const bool negative = text.starts_with('-');
  if (negative) text.remove_prefix(1);
  if (text.empty()) return 0;
  int64_t seconds = 0;
  for (const char c : text) {
    if (c < '0' || c > '9') return 0;
    seconds = std::min(10 * seconds + (c - '0'), kMany);
  }
  return SaturatedTime(negative ? -seconds : seconds);
}

void TakeBssid(std::string_view text, WIRELESS_NETWORK& network) {
  const Bssid bssid = ParseBssid(text).value_or(Bssid{});
  std::memcpy(network.bssid, bssid.octets, sizeof network.bssid);
}

// The value of a text in one of the enumerations.
template <class Value>
Value ParseWord(Value (*parse)(const char*), std::string_view text) {
  char szWord[32];  // longer than any word of an enumeration
  CopyText(szWord, text);
  return parse(szWord);
}

// Takes one pair of the section into the record; a pair of another program's is passed over.
void Take(const Pair& pair, WIRELESS_NETWORK_CONFIG& config) {
  const auto [key, value] = pair;
  WIRELESS_NETWORK& network = config.network;
  if (key == kKeySecret) return CopyText(config.szKey, value);
  if (key == kKeyAddress) return CopyText(config.szIp, value);
  if (key == kKeyMask) return CopyText(config.szMask, value);
  if (key == kKeyGateway) return CopyText(config.szGateway, value);
  if (key == kKeyEssid) return CopyText(network.szEssid, value);
  if (key == kKeyBssid) return TakeBssid(value, network);
  if (key == kKeyMode) network.opmode = ParseWord(ParseOpmode, value);
  if (key == kKeyAccessTime) config.atime = ParseTime(value);
  if (key == kKeyAuth) network.auth = ParseWord(MEROWirelessAuthParse, value);
  if (key == kKeyEncrypt) network.encrypt = ParseWord(MEROWirelessEncryptParse, value);
}

// Reads the network of a section in a text into the record; kNoSection, and the record as it was, when there is none.
Status TakeSection(std::string_view text, const std::optional<SectionPlace>& place, WIRELESS_NETWORK_CONFIG& config) {
  if (!place) return Status::Failed(kNoSection);
  config = {};
  config.network.opmode = WIRELESS_OPMODE_UNKNOWN;
  for (Lines lines = LinesOf(text, *place); lines.Next();) {
    const std::optional<Pair> pair = PairOfLine(lines.text(), ValueForm::kPlain);
    if (pair) Take(*pair, config);
  }
  return Status::Ok();
}

bool IsFirst(std::string_view text, const SectionPlace& place) {
  Sections sections(text);
  return sections.Next() && sections.place().header == place.header;
}

Status ReadKept(const char* szSection, WIRELESS_NETWORK_CONFIG& config) {
  const std::string_view text = g_kept->text.view();
  const Status status = TakeSection(text, g_kept->index.Find(text, szSection), config);
  Advance(false, g_kept->index.headers());
  return status;
}

Status ReadAnew(const char* szSection, const FileStamp& stamp, WIRELESS_NETWORK_CONFIG& config) {
  Result<Bytes> file = ReadFile(kKnownNetworksPath);
  if (!file.ok()) return file.status();
  const std::string_view text = file->view();
  const std::optional<SectionPlace> place = FindSection(text, szSection);
  const Status status = TakeSection(text, place, config);

  const bool first = place && IsFirst(text, *place);
  if (g_asked == 0 && !first) return status;  // no walk
  if (!HasSettled(stamp)) return Advance(first, CountSections(text)), status;
  SectionIndex index;
  if (!index.Build(text)) return EndWalk(), status;
  Advance(first, index.headers());
  if (g_asked > 0) Keep(std::move(*file), std::move(index), stamp);
  return status;
}

// kNoSection when there is no such section, ENOENT when there is no file.
Status Read(const char* szSection, WIRELESS_NETWORK_CONFIG& config) {
  Result<FileStamp> stamp = StampOf(kKnownNetworksPath);
  if (!stamp.ok()) return EndWalk(), stamp.status();
  if (g_kept != nullptr && !Equal(g_kept->stamp, *stamp)) Drop();
  if (g_kept == nullptr) return ReadAnew(szSection, *stamp, config);
  return ReadKept(szSection, config);
}

}  // namespace

int MEROWirelessConfGet(const char* szSection, WIRELESS_NETWORK_CONFIG* pNetCfg) {
  if (szSection == nullptr || pNetCfg == nullptr) return REFUSE_NULL(), -1;
  const Status status = Read(szSection, *pNetCfg);
  if (status.error() == ENOENT) return PLIBCErrSet(ERR_FILE_NOT_FOUND), -1;
  if (status.error() == kNoSection) return PLIBCErrSet(ERR_SECTION_NOT_FOUND), -1;
  if (!status.ok()) return FAIL(status.error(), "Failed to read %s", kKnownNetworksPath), -1;
  return 0;
}
