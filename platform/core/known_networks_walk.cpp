// The walk over the known networks.
//
// A caller that lists all networks asks for one after another, from the first to the last. To read the file again for
// each of them would take quadratic time, so its text is kept during such a walk, for as long as the file is provably
// the same. After the walk nothing of the file, least of all its secrets, stays in memory.
#include <sys/stat.h>

#include <cstdlib>
#include <ctime>
#include <new>

#include "common/paths.h"
#include "platform/base/failure.h"
#include "platform/base/file_read.h"
#include "platform/core/known_network.h"
#include "platform/core/section_index.h"

namespace {

// Differs when the file was replaced, or written to.
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

// Whether the next change of the file will show in its stamp. File times advance in ticks: a change in the tick of the
// change before it does not show.
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

// Counts a question for one of `total` sections. A walk begins when the first section is asked for, and ends after as
// many questions as the file has sections. It does not end with the last section's name, since that name may stand in
// the file twice, or be one that no caller can ask for.
void Advance(bool first, size_t total) {
  if (g_asked > 0 || first) ++g_asked;
  if (g_asked >= total) EndWalk();
}

// Keeps a text, if there is memory for it. Without, the next question takes longer.
void Keep(Bytes&& text, SectionIndex&& index, const FileStamp& stamp) {
  void* room = std::malloc(sizeof(KeptFile));
  if (room != nullptr) g_kept = new (room) KeptFile{std::move(text), stamp, std::move(index)};
}

bool IsFirst(std::string_view text, const SectionPlace& place) {
  Sections sections(text);
  return sections.Next() && sections.place().header == place.header;
}

Status ReadKept(const char* szSection, WIRELESS_NETWORK_CONFIG& config) {
  const std::string_view text = g_kept->text.view();
  const Status status = ReadKnownNetwork(text, g_kept->index.Find(text, szSection), config);
  Advance(false, g_kept->index.headers());
  return status;
}

Status ReadAnew(const char* szSection, const FileStamp& stamp, WIRELESS_NETWORK_CONFIG& config) {
  Result<Bytes> file = ReadFile(kKnownNetworksPath);
  if (!file.ok()) return file.status();
  const std::string_view text = file->view();
  const std::optional<SectionPlace> place = FindSection(text, szSection);
  const Status status = ReadKnownNetwork(text, place, config);

  const bool first = place && IsFirst(text, *place);
  if (g_asked == 0 && !first) return status;  // no walk
  if (!HasSettled(stamp)) return Advance(first, CountSections(text)), status;
  SectionIndex index;
  if (!index.Build(text)) return EndWalk(), status;
  Advance(first, index.headers());
  if (g_asked > 0) Keep(std::move(*file), std::move(index), stamp);
  return status;
}

// Fails with kNoSection when there is no such section, with ENOENT when there is no file.
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
