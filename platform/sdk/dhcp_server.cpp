// The files of a DHCP server: the configuration that dnsmasq reads, and beside it what dnsmasq has no word for.
#include <sys/stat.h>

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <cstring>
#include <iterator>

#include "common/text.h"
#include "platform/base/error.h"
#include "platform/base/file_edit.h"
#include "platform/base/file_read.h"
#include "platform/base/interface.h"

namespace {

constexpr char kDirectory[] = "/etc/dhcpd";
constexpr char kConfFormat[] = "/etc/dhcpd/dhcpd-%s-%s.conf";
constexpr char kInfoFormat[] = "/etc/dhcpd/dhcpd-%s-%s.info";

constexpr char kLineFormat[] = "%s=\"%s\"\n";
constexpr char kEnableKey[] = "enable";
constexpr char kAutoTimeKey[] = "auto_time";

constexpr char kHeading[] = "# Written from the DHCP server's record, and read back into it.\n";
constexpr char kEnding[] = "dhcp-authoritative\n";

enum class Kind {
  kWord,     // may stand in a list
  kText,     // reaches to the line's end
  kSeconds,  // a number; 0 is left out
};

// A field of the record, as a part of a line.
struct Part {
  const char* szName;  // what a report calls it; null behind the line's last part
  Kind kind;
  size_t offset;
  size_t size;
};

// A line: its beginning, then its parts with commas between them. The empty ones at its end are left out, and a line
// without any other is left out whole.
struct ConfLine {
  const char* szPrefix;
  Part parts[4];
};

// NOLINTNEXTLINE(bugprone-macro-parentheses): a member is no expression
#define FIELD(member) offsetof(MERO_DHCPD_CONF, member), sizeof(MERO_DHCPD_CONF::member)

constexpr ConfLine kLines[] = {
    {"interface=", {{"interface", Kind::kWord, FIELD(szInterface)}}},
    {"dhcp-range=",
     {{"first address", Kind::kWord, FIELD(szRangeStart)},
      {"last address", Kind::kWord, FIELD(szRangeEnd)},
      {"netmask", Kind::kWord, FIELD(szSubnet)},
      {"lease time", Kind::kSeconds, FIELD(leaseTime)}}},
    {"dhcp-option=option:router,", {{"router", Kind::kWord, FIELD(szRouter)}}},
    {"dhcp-option=option:dns-server,",
     {{"name server", Kind::kWord, FIELD(szDns)}, {"second name server", Kind::kWord, FIELD(szSDns)}}},
    {"domain=", {{"domain", Kind::kText, FIELD(szDomain)}}},
    {"dhcp-leasefile=", {{"lease file", Kind::kText, FIELD(szLeaseFile)}}},
};
constexpr Part kTag = {"tag", Kind::kWord, FIELD(szTag)};

#undef FIELD

// Calls `visit(part)` for each part of a line.
template <class Visit>
void ForEachPart(const ConfLine& line, Visit visit) {
  for (const Part& part : line.parts) {
    if (part.szName != nullptr) visit(part);
  }
}

// The path of a file of the server's.
class ServerFile {
 public:
  ServerFile(const char* szFormat, const char* szIfName, const char* szTag) {
    std::snprintf(szPath_, sizeof szPath_, szFormat, szIfName, szTag);
  }

  const char* c_str() const { return szPath_; }

 private:
  char szPath_[sizeof kConfFormat + sizeof(MERO_DHCPD_CONF::szInterface) + sizeof(MERO_DHCPD_CONF::szTag)];
};

const char* FieldOf(const MERO_DHCPD_CONF& conf, const Part& part) {
  return reinterpret_cast<const char*>(&conf) + part.offset;
}

char* FieldOf(MERO_DHCPD_CONF& conf, const Part& part) {
  return reinterpret_cast<char*>(&conf) + part.offset;
}

std::string_view TextIn(const MERO_DHCPD_CONF& conf, const Part& part) {
  const char* szField = FieldOf(conf, part);
  return {szField, ::strnlen(szField, part.size)};
}

// ---- What can be written ----

// Whether a character means itself, wherever it stands on a line that dnsmasq reads.
bool IsOrdinary(char c) {
  return static_cast<unsigned char>(c) >= ' ' && c != '\x7f' && c != '"' && c != '\\' && c != '#';
}

bool CanWrite(std::string_view text, const Part& part) {
  if (text.size() == part.size) return false;  // it does not end
  if (part.kind == Kind::kWord && text.find(',') != std::string_view::npos) return false;
  return std::all_of(text.begin(), text.end(), IsOrdinary);
}

bool IsTag(std::string_view tag) {
  return !tag.empty() && tag.size() < sizeof(MERO_DHCPD_CONF::szTag) && tag.find('/') == std::string_view::npos;
}

bool CheckPart(const MERO_DHCPD_CONF& conf, const Part& part) {
  if (part.kind == Kind::kSeconds) return true;
  const std::string_view text = TextIn(conf, part);
  if (CanWrite(text, part)) return true;
  return LOG("A DHCP server's %s cannot be '%.*s'", part.szName, static_cast<int>(text.size()), text.data()), false;
}

// Whether the record can be written; false after a report.
bool Check(const MERO_DHCPD_CONF& conf) {
  bool good = CheckPart(conf, kTag);
  for (const ConfLine& line : kLines) {
    ForEachPart(line, [&](const Part& part) { good = good && CheckPart(conf, part); });
  }
  if (!good) return false;
  if (!IsInterfaceName(conf.szInterface)) return LOG("'%s' is no interface to serve", conf.szInterface), false;
  if (!IsTag(conf.szTag)) return LOG("'%s' is no tag of a DHCP server", conf.szTag), false;
  return true;
}

// ---- Writing ----

// The text of a part.
class PartText {
 public:
  PartText(const MERO_DHCPD_CONF& conf, const Part& part) : text_(TextIn(conf, part)) {
    if (part.kind != Kind::kSeconds) return;
    int seconds;
    std::memcpy(&seconds, FieldOf(conf, part), sizeof seconds);
    const int size = seconds != 0 ? std::snprintf(szSeconds_, sizeof szSeconds_, "%ds", seconds) : 0;
    text_ = {szSeconds_, static_cast<size_t>(size)};
  }
  PartText(const PartText&) = delete;
  PartText& operator=(const PartText&) = delete;

  std::string_view view() const { return text_; }

 private:
  char szSeconds_[16];
  std::string_view text_;
};

// Appends a line. The separators of empty parts wait until a part that is not empty needs them.
bool AppendLine(Bytes& content, const ConfLine& line, const MERO_DHCPD_CONF& conf) {
  bool begun = false;
  bool good = true;
  size_t separators = 0;
  ForEachPart(line, [&](const Part& part) {
    const PartText text(conf, part);
    if (!text.view().empty()) {
      if (!begun) good = good && content.Append(line.szPrefix);
      begun = true;
      for (; separators > 0; --separators) good = good && content.Append(",");
      good = good && content.Append(text.view());
    }
    ++separators;
  });
  return !begun || (good && content.Append("\n"));
}

bool Compose(Bytes& content, const MERO_DHCPD_CONF& conf) {
  return content.Append(kHeading) &&
         std::all_of(std::begin(kLines), std::end(kLines),
                     [&](const ConfLine& line) { return AppendLine(content, line, conf); }) &&
         content.Append(kEnding);
}

Status WriteConf(const char* szPath, const MERO_DHCPD_CONF& conf) {
  if (::mkdir(kDirectory, 0755) < 0 && errno != EEXIST) return Status::Failed(errno);
  return EditFile(szPath, 0644, [&](std::string_view, Bytes& content) {
    return Compose(content, conf) ? Status::Ok() : Status::Failed(ENOMEM);
  });
}

// Whether both keys were set; the switch comes last, so that it never runs ahead of the rest.
bool WriteInfo(const char* szPath, const MERO_DHCPD_CONF& conf, bool enable) {
  char szAutoTime[16];
  std::snprintf(szAutoTime, sizeof szAutoTime, "%d", conf.autoTime);
  return PLIBCFileSetKeyValue(szPath, kAutoTimeKey, szAutoTime, kLineFormat) > 0 &&
         PLIBCFileSetKeyValue(szPath, kEnableKey, enable ? "yes" : "no", kLineFormat) > 0;
}

// ---- Reading ----

// The number that a text begins with, if `unit` is all that follows; else 0.
int NumberOf(std::string_view text, std::string_view unit) {
  int number = 0;
  const char* const end = text.data() + text.size();
  const auto [rest, error] = std::from_chars(text.data(), end, number);
  const bool whole = error == std::errc() && std::string_view(rest, static_cast<size_t>(end - rest)) == unit;
  return whole ? number : 0;
}

void ReadPart(std::string_view text, const Part& part, MERO_DHCPD_CONF& conf) {
  char* const szField = FieldOf(conf, part);
  if (part.kind != Kind::kSeconds) return CopyText(szField, part.size, text);
  const int seconds = NumberOf(text, "s");
  std::memcpy(szField, &seconds, sizeof seconds);
}

// Takes from `rest` what belongs to a part.
std::string_view NextPart(std::string_view& rest, const Part& part) {
  const size_t size = part.kind == Kind::kText ? rest.size() : std::min(rest.find(','), rest.size());
  const std::string_view text = Slice(rest, 0, size);
  rest = Slice(rest, size + 1);
  return text;
}

void ReadLine(std::string_view text, MERO_DHCPD_CONF& conf) {
  for (const ConfLine& line : kLines) {
    const std::string_view prefix = line.szPrefix;
    if (Slice(text, 0, prefix.size()) != prefix) continue;
    std::string_view rest = Slice(text, prefix.size());
    ForEachPart(line, [&](const Part& part) { ReadPart(NextPart(rest, part), part, conf); });
  }
}

void ReadConf(std::string_view text, MERO_DHCPD_CONF& conf) {
  while (!text.empty()) {
    const size_t feed = text.find('\n');
    ReadLine(Slice(text, 0, feed), conf);
    text = feed == std::string_view::npos ? std::string_view() : Slice(text, feed + 1);
  }
}

// False when there is an information file that cannot be read.
bool ReadInfo(const char* szPath, MERO_DHCPD_CONF& conf) {
  char szEnable[8] = "";
  char szAutoTime[16] = "";
  if (PLIBCFileGetKeyValue(szPath, kEnableKey, szEnable, sizeof szEnable, 0) < 0) return false;
  if (PLIBCFileGetKeyValue(szPath, kAutoTimeKey, szAutoTime, sizeof szAutoTime, 0) < 0) return false;
  conf.blEnable = std::strcmp(szEnable, "yes") == 0 ? TRUE : FALSE;
  conf.autoTime = NumberOf(szAutoTime, "");
  return true;
}

}  // namespace

int MERONetGetDhcpServerConf(const char* szIfName, const char* szTag, PMERO_DHCPD_CONF pConf) {
  if (szIfName == nullptr || szTag == nullptr || pConf == nullptr) return REFUSE_NULL(), 0;
  if (!IsInterfaceName(szIfName) || !IsTag(szTag)) return PLIBCErrSet(ERR_FILE_NOT_FOUND), 0;

  const ServerFile path(kConfFormat, szIfName, szTag);
  Result<Bytes> file = ReadFile(path.c_str());
  if (file.error() == ENOENT) return PLIBCErrSet(ERR_FILE_NOT_FOUND), 0;
  if (!file.ok()) return FAIL(file.error(), "read", path.c_str()), 0;

  MERO_DHCPD_CONF conf{};
  ReadConf(file->view(), conf);
  if (!ReadInfo(ServerFile(kInfoFormat, szIfName, szTag).c_str(), conf)) return 0;
  CopyText(conf.szInterface, szIfName);
  CopyText(conf.szTag, szTag);
  *pConf = conf;
  return 1;
}

int MERONetSetDhcpServerConfigFiles(const MERO_DHCPD_CONF* pConf, int enable) {
  if (pConf == nullptr) return REFUSE_NULL(), 0;
  if (!Check(*pConf)) return PLIBCErrSet(ERR_BAD_PARAMETERS), 0;

  const ServerFile path(kConfFormat, pConf->szInterface, pConf->szTag);
  if (Status status = WriteConf(path.c_str(), *pConf); !status.ok()) {
    return FAIL(status.error(), "write", path.c_str()), 0;
  }
  const ServerFile info(kInfoFormat, pConf->szInterface, pConf->szTag);
  return WriteInfo(info.c_str(), *pConf, enable != 0) ? 1 : 0;
}
