// The files of a DHCP server: the configuration that dnsmasq reads, and the settings that dnsmasq does not have.
#include <cstdio>
#include <cstring>
#include <iterator>
#include <optional>

#include "common/paths.h"
#include "common/text.h"
#include "platform/base/directory.h"
#include "platform/base/failure.h"
#include "platform/base/file_edit.h"
#include "platform/base/file_read.h"
#include "platform/base/interface.h"
#include "platform/base/number.h"

namespace {

constexpr char kLineFormat[] = "%s=\"%s\"\n";
constexpr char kEnableKey[] = "enable";
constexpr char kAutoTimeKey[] = "auto_time";

constexpr char kInfiniteTime[] = "infinite";
constexpr int kInfinite = -1;

constexpr char kHeading[] = "# Written from the DHCP server's record, and read back into it.\n";
constexpr char kEnding[] = "dhcp-authoritative\n";

enum class Kind : uint8_t {
  kWord,     // may stand in a list
  kTagged,   // a word, and before it there may be tags, which the record has no field for
  kMask,     // a word that may be left out before a lease time
  kSeconds,  // a lease time; 0 is left out, and before it there may be a broadcast address
  kText,     // reaches to the line's end
};

// A field of the record, as a part of a line.
struct Part {
  const char* szName;  // what a report calls it; null behind the line's last part
  Kind kind;
  uint16_t offset;
  uint16_t size;
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
     {{"first address", Kind::kTagged, FIELD(szRangeStart)},
      {"last address", Kind::kWord, FIELD(szRangeEnd)},
      {"netmask", Kind::kMask, FIELD(szSubnet)},
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

bool IsTagWord(std::string_view word) {
  const std::string_view beginning = Slice(word, 0, 4);
  return beginning == "set:" || beginning == "tag:";
}

// The seconds of a lease time, as the server reads it; none when it is anything else.
std::optional<int> SecondsOf(std::string_view text) {
  constexpr std::string_view kUnits = "smhdw";
  constexpr int kSecondsOfUnit[] = {1, 60, 60 * 60, 24 * 60 * 60, 7 * 24 * 60 * 60};
  if (text == kInfiniteTime) return kInfinite;
  std::optional<int> number = TakeNumber(text);
  const size_t unit = text.empty() ? 0 : kUnits.find(ToLower(text.front()));
  if (!number || text.size() > 1 || unit == std::string_view::npos) return std::nullopt;
  return __builtin_mul_overflow(*number, kSecondsOfUnit[unit], &*number) ? std::nullopt : number;
}

bool CanWrite(std::string_view text, const Part& part) {
  if (text.size() == part.size) return false;  // it does not end
  if (part.kind != Kind::kText && text.find(',') != std::string_view::npos) return false;
  if (part.kind == Kind::kTagged && IsTagWord(text)) return false;
  if (part.kind == Kind::kMask && SecondsOf(text)) return false;
  return All(text, IsOrdinary);
}

bool IsTag(std::string_view tag) {
  return !tag.empty() && tag.size() < sizeof(MERO_DHCPD_CONF::szTag) && tag.find('/') == std::string_view::npos;
}

// Whether the record names its files.
bool HasNames(const MERO_DHCPD_CONF& conf) {
  return IsInterfaceName(TextIn(conf, kLines[0].parts[0])) && IsTag(TextIn(conf, kTag));
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
    if (seconds == kInfinite) {
      text_ = kInfiniteTime;
    } else if (seconds != 0) {
      text_ = {szSeconds_, static_cast<size_t>(std::snprintf(szSeconds_, sizeof szSeconds_, "%ds", seconds))};
    }
  }
  // Blanks at the ends count in quotes only.
  std::string_view quote() const { return text_.front() == ' ' || text_.back() == ' ' ? "\"" : ""; }

  PartText(const PartText&) = delete;
  PartText& operator=(const PartText&) = delete;

  std::string_view view() const { return text_; }

 private:
  char szSeconds_[16];
  std::string_view text_;
};

// Appends a line. The separators of empty parts wait until a part that is not empty needs them.
void AppendLine(Bytes& content, const ConfLine& line, const MERO_DHCPD_CONF& conf) {
  bool begun = false;
  size_t separators = 0;
  ForEachPart(line, [&](const Part& part) {
    const PartText text(conf, part);
    if (!text.view().empty()) {
      if (!begun) content.Append(line.szPrefix);
      begun = true;
      for (; separators > 0; --separators) content.Append(",");
      content.Append(text.quote());
      content.Append(text.view());
      content.Append(text.quote());
    }
    ++separators;
  });
  if (begun) content.Append("\n");
}

Status WriteConf(const char* szPath, const MERO_DHCPD_CONF& conf) {
  return EditFile(szPath, 0644, [&](std::string_view, Revision& revision) {
    revision.content.Append(kHeading);
    for (const ConfLine& line : kLines) AppendLine(revision.content, line, conf);
    revision.content.Append(kEnding);
  });
}

bool WriteSwitch(const MERO_DHCPD_CONF& conf, bool enable) {
  const InterfacePath path(kDhcpInfoFormat, conf.szInterface, conf.szTag);
  return PLIBCFileSetKeyValue(path.c_str(), kEnableKey, enable ? "yes" : "no", kLineFormat) > 0;
}

bool WriteAutoTime(const MERO_DHCPD_CONF& conf) {
  const InterfacePath path(kDhcpInfoFormat, conf.szInterface, conf.szTag);
  char szAutoTime[16];
  std::snprintf(szAutoTime, sizeof szAutoTime, "%d", conf.autoTime);
  return PLIBCFileSetKeyValue(path.c_str(), kAutoTimeKey, szAutoTime, kLineFormat) > 0;
}

// The configuration is written behind the time, since by it the server counts as known, and is only switched on then.
// The switch is written last, so that no server is switched on before its other settings are there.
bool WriteFiles(const MERO_DHCPD_CONF& conf, bool enable) {
  const InterfacePath path(kDhcpConfFormat, conf.szInterface, conf.szTag);
  const Status made = MakeDirectory(kDhcpDirectory);
  if (made.ok() && !WriteAutoTime(conf)) return false;
  if (const Status status = made.ok() ? WriteConf(path.c_str(), conf) : made; !status.ok()) {
    return FAIL(status.error(), "Failed to write %s", path.c_str()), false;
  }
  return WriteSwitch(conf, enable);
}

// ---- Reading ----

// The number that a text is; 0 when it is none.
int NumberOf(std::string_view text) {
  const int number = TakeNumber(text).value_or(0);
  return text.empty() ? number : 0;
}

// A line without its comment, which a '#' at its beginning or behind white space begins, outside of quotes.
std::string_view WithoutComment(std::string_view line) {
  bool quoted = false;
  for (size_t i = 0; i < line.size(); ++i) {
    if (line[i] == '"') quoted = !quoted;
    if (line[i] == '\\' && quoted) ++i;
    if (!quoted && line[i] == '#' && (i == 0 || IsSpace(line[i - 1]))) return Slice(line, 0, i);
  }
  return line;
}

// Takes the beginning of a line, which may have blanks around its "=" and ","; false when the line begins otherwise.
bool TakePrefix(std::string_view& rest, std::string_view prefix) {
  for (const char c : prefix) {
    if (c == '=' || c == ',') rest = Trim(rest);
    if (rest.empty() || rest.front() != c) return false;
    rest.remove_prefix(1);
    if (c == '=') rest = Trim(rest);
  }
  return true;
}

// Takes a word of a list, or a text that reaches to the line's end: without quotes, and without blanks around it.
void TakeValue(std::string_view& rest, bool isText, char* szValue, size_t cbValue) {
  rest = Trim(rest);
  size_t used = 0;
  size_t size = 0;
  size_t sizeWithoutBlanks = 0;
  bool quoted = false;
  for (; used < rest.size(); ++used) {
    char c = rest[used];
    if (c == ',' && !quoted && !isText) break;
    if (c == '"') {
      quoted = !quoted;
      continue;
    }
    if (quoted && c == '\\' && used + 1 < rest.size()) c = rest[++used];
    if (size + 1 < cbValue) szValue[size++] = c;
    if (quoted || !IsSpace(c)) sizeWithoutBlanks = size;
  }
  szValue[sizeWithoutBlanks] = '\0';
  rest = Slice(rest, used + 1);
}

void ReadPart(std::string_view& rest, const Part& part, MERO_DHCPD_CONF& conf) {
  char* const szField = FieldOf(conf, part);
  if (part.kind == Kind::kSeconds) {
    char szTime[20];
    std::optional<int> seconds;
    do {
      TakeValue(rest, false, szTime, sizeof szTime);
      seconds = SecondsOf(szTime);
    } while (!seconds && !rest.empty());
    const int known = seconds.value_or(0);
    std::memcpy(szField, &known, sizeof known);
    return;
  }
  const std::string_view before = rest;
  do {
    TakeValue(rest, part.kind == Kind::kText, szField, part.size);
  } while (part.kind == Kind::kTagged && IsTagWord(szField));
  if (part.kind == Kind::kMask && SecondsOf(szField)) {
    szField[0] = '\0';
    rest = before;
  }
}

void ReadLine(std::string_view text, MERO_DHCPD_CONF& conf) {
  for (const ConfLine& line : kLines) {
    std::string_view rest = Trim(WithoutComment(text));
    if (!TakePrefix(rest, line.szPrefix)) continue;
    ForEachPart(line, [&](const Part& part) { ReadPart(rest, part, conf); });
  }
}

void ReadText(std::string_view text, MERO_DHCPD_CONF& conf) {
  while (!text.empty()) {
    const size_t feed = text.find('\n');
    ReadLine(Slice(text, 0, feed), conf);
    text = feed == std::string_view::npos ? std::string_view() : Slice(text, feed + 1);
  }
}

Status ReadConf(const char* szPath, std::string_view ifName, MERO_DHCPD_CONF& conf) {
  Result<Bytes> file = ReadFile(szPath);
  if (!file.ok()) return file.status();
  ReadText(file->view(), conf);
  CopyText(conf.szInterface, ifName);
  return Status::Ok();
}

// False when there is an information file that cannot be read.
bool ReadInfo(const char* szPath, MERO_DHCPD_CONF& conf) {
  char szEnable[8] = "";
  char szAutoTime[16] = "";
  if (PLIBCFileGetKeyValue(szPath, kEnableKey, szEnable, sizeof szEnable, 0) < 0) return false;
  if (PLIBCFileGetKeyValue(szPath, kAutoTimeKey, szAutoTime, sizeof szAutoTime, 0) < 0) return false;
  conf.blEnable = std::strcmp(szEnable, "yes") == 0 ? TRUE : FALSE;
  conf.autoTime = NumberOf(szAutoTime);
  return true;
}

// ---- Giving back ----

bool Same(const MERO_DHCPD_CONF& a, const MERO_DHCPD_CONF& b) {
  bool same = a.leaseTime == b.leaseTime && a.autoTime == b.autoTime;
  for (const ConfLine& line : kLines) {
    ForEachPart(line, [&](const Part& part) {
      same = same && (part.kind == Kind::kSeconds || TextIn(a, part) == TextIn(b, part));
    });
  }
  return same;
}

// Whether the files of a record, as they are, read as the record.
bool IsWritten(const MERO_DHCPD_CONF& conf) {
  const InterfacePath path(kDhcpConfFormat, conf.szInterface, conf.szTag);
  const InterfacePath info(kDhcpInfoFormat, conf.szInterface, conf.szTag);
  MERO_DHCPD_CONF written{};
  return ReadConf(path.c_str(), conf.szInterface, written).ok() && ReadInfo(info.c_str(), written) &&
         Same(written, conf);
}

}  // namespace

int MERONetGetDhcpServerConf(const char* szIfName, const char* szTag, PMERO_DHCPD_CONF pConf) {
  if (szIfName == nullptr || szTag == nullptr || pConf == nullptr) return REFUSE_NULL(), 0;
  if (!IsInterfaceName(szIfName) || !IsTag(szTag)) return PLIBCErrSet(ERR_FILE_NOT_FOUND), 0;

  const InterfacePath path(kDhcpConfFormat, szIfName, szTag);
  MERO_DHCPD_CONF conf{};
  const Status status = ReadConf(path.c_str(), szIfName, conf);
  if (status.error() == ENOENT) return PLIBCErrSet(ERR_FILE_NOT_FOUND), 0;
  if (!status.ok()) return FAIL(status.error(), "Failed to read %s", path.c_str()), 0;
  if (!ReadInfo(InterfacePath(kDhcpInfoFormat, szIfName, szTag).c_str(), conf)) return 0;
  CopyText(conf.szTag, szTag);
  *pConf = conf;
  return 1;
}

int MERONetSetDhcpServerConfigFiles(const MERO_DHCPD_CONF* pConf, int enable) {
  if (pConf == nullptr) return REFUSE_NULL(), 0;
  // The files may say more than the record has fields for. That stays when the record as such has not changed.
  if (HasNames(*pConf) && IsWritten(*pConf)) return WriteSwitch(*pConf, enable != 0) ? 1 : 0;
  if (!Check(*pConf)) return PLIBCErrSet(ERR_BAD_PARAMETERS), 0;
  return WriteFiles(*pConf, enable != 0) ? 1 : 0;
}
