// mero-settings: tells scripts what settings hold, as the libraries read them. The usage below says what can be asked.
//
// A line is told for each thing asked for, in order, and nothing at all after a failure. No value holds a line feed.
#include <algorithm>
#include <cstdio>
#include <cstring>
#include <exception>
#include <iterator>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>

#include "common/ap_settings.h"
#include "common/paths.h"
#include "common/text.h"
#include "platform.h"
#include "wireless.h"

namespace {

constexpr char kUsage[] =
    R"(usage: mero-settings access-point KEY...       settings of the access point, for the adapter that is plugged in
       mero-settings bridge BRIDGE VALUE...    nat, at-boot, static, address, mask, member, hardware-address
       mero-settings file FILE KEY...          values in a key/value file
       mero-settings check FILE KEY VALUE      whether a key/value file holds a key with exactly that value
       mero-settings section-name              the settings' section for the adapter's name on standard input, which
                                               access-point behind it tells the settings of

Tells a line for each thing asked for; several requests can follow each other, with -- between them. What the settings
of the access point lack has its default; secrets are not told. What else is missing is an empty line.

Exit status: 0 all is there; 1 something is missing, or not as checked; 2 wrong usage, or settings that cannot be read.
)";

enum Status : int { kThere = 0, kMissing = 1, kFailed = 2 };

struct WrongUsage : std::runtime_error {
  using std::runtime_error::runtime_error;
};

struct Unreadable : std::runtime_error {
  explicit Unreadable(const char* szPath)
      : std::runtime_error("cannot read " + std::string(szPath) + "; the system log has the reason") {}
};

using Words = std::span<char* const>;

// The lines that are printed, all at once, and the exit status.
class Answers {
 public:
  // The section that section-name has told of. What is asked of the access point behind it is that section's.
  std::optional<std::string> section;

  void Add(std::string_view line) { (text_ += line) += '\n'; }
  void AddMissing() {
    Add("");
    status_ = kMissing;
  }
  void AddYesNo(bool yes) { Add(yes ? "yes" : "no"); }
  void AddCheck(bool passed) {
    AddYesNo(passed);
    if (!passed) status_ = kMissing;
  }

  // Writes all of it out.
  [[nodiscard]] Status Tell() const {
    const bool written = std::fwrite(text_.data(), 1, text_.size(), stdout) == text_.size();
    if (written && std::fflush(stdout) == 0) return status_;
    return std::perror("mero-settings: cannot write"), kFailed;
  }

 private:
  std::string text_;
  Status status_ = kThere;
};

// ---- The access point --------------------------------------------------------------------------------------------

// The section of the adapter that is plugged in; none where there is no adapter.
std::optional<std::string> SectionOfAdapter() {
  if (PLIBCFileExist(kAdapterInfoPath) == 0) return std::nullopt;
  char szSection[1024];
  if (MEROWirelessApConfigSecNameGet(szSection, sizeof szSection) != FALSE) return szSection;
  if (PLIBCErrGet() == ERR_KEY_NOT_FOUND) return std::nullopt;
  throw Unreadable(kAdapterInfoPath);
}

// The settings in a section; none where there is no such section.
std::optional<MERO_AP_CONF> ReadAccessPoint(const std::optional<std::string>& section) {
  if (!section) return std::nullopt;
  MERO_AP_CONF conf;
  const int found = MEROWirelessGetAPConfig(section->c_str(), &conf);
  if (found < 0) throw Unreadable(kApSettingsPath);
  return found > 0 ? std::optional(conf) : std::nullopt;
}

// The row of a key; never that of a secret, since those have a table of their own.
const Setting& SettingOf(std::string_view key) {
  for (const auto& [turn, setting] : kSettingRows) {
    const bool read = setting.szKey != nullptr && setting.kind != SettingKind::kTextOnlyWritten;
    if (read && setting.szKey == key) return setting;
  }
  throw WrongUsage("there is no setting '" + std::string(key) + "' to be told");
}

// Without a section a setting is what it is in a section that lacks it. The record has other defaults then, which would
// let guests into the LAN.
void AddSetting(Answers& answers, const Setting& setting, const std::optional<MERO_AP_CONF>& conf) {
  if (setting.kind == SettingKind::kText) {
    return answers.Add(conf ? reinterpret_cast<const char*>(&*conf) + setting.offset : setting.szMissing);
  }
  const int value = conf ? NumberIn(&*conf, setting) : setting.missing;
  if (setting.kind == SettingKind::kSwitch) return answers.AddYesNo(value != FALSE);
  answers.Add(std::to_string(value));
}

void TellAccessPoint(Answers& answers, Words keys) {
  if (keys.empty()) throw WrongUsage("access-point needs a KEY");
  const std::optional<MERO_AP_CONF> conf = ReadAccessPoint(answers.section ? answers.section : SectionOfAdapter());
  for (const char* szKey : keys) AddSetting(answers, SettingOf(szKey), conf);
}

// ---- Key/value files ---------------------------------------------------------------------------------------------

std::optional<std::string> ValueOf(const char* szPath, const char* szKey) {
  std::string value(1024, '\0');
  while (true) {
    const int found = PLIBCFileGetKeyValue(szPath, szKey, value.data(), value.size(), 0);
    if (found < 0) throw Unreadable(szPath);
    if (found == 0) return std::nullopt;
    const size_t size = std::strlen(value.c_str());
    const bool whole = size + 1 < value.size();
    value.resize(whole ? size : 2 * value.size());
    if (whole) return value;
  }
}

void TellFile(Answers& answers, Words words) {
  if (words.size() < 2) throw WrongUsage("file needs a FILE and a KEY");
  for (const char* szKey : words.subspan(1)) {
    const std::optional<std::string> value = ValueOf(words[0], szKey);
    value ? answers.Add(*value) : answers.AddMissing();
  }
}

void TellCheck(Answers& answers, Words words) {
  if (words.size() != 3) throw WrongUsage("check needs a FILE, a KEY and a VALUE");
  // Fails for a file that cannot be read, which the check does not tell from one that has another value.
  (void)ValueOf(words[0], words[1]);
  answers.AddCheck(PLIBCFileCheckKeyValue(words[0], words[1], words[2], 0) != 0);
}

// ---- Bridges -----------------------------------------------------------------------------------------------------

struct Bridge {
  NETINFO netInfo;
  BRIDGE_INFO bridgeInfo;
};

void AddHardwareAddress(Answers& answers, const NETINFO& netInfo) {
  const bool known = std::any_of(std::begin(netInfo.rgbMac), std::end(netInfo.rgbMac), [](auto b) { return b != 0; });
  char szAddress[sizeof "00:00:00:00:00:00"] = "";
  if (known) MEROWirelessBssidStringGet(netInfo.rgbMac, szAddress, sizeof szAddress);
  answers.Add(szAddress);
}

constexpr struct {
  std::string_view name;
  void (*add)(Answers&, const Bridge&);
} kBridgeValues[] = {
    {"nat",
     [](Answers& answers, const Bridge& bridge) { answers.AddYesNo(bridge.bridgeInfo.type == TYPE_NAT_MASTER); }},
    {"at-boot", [](Answers& answers, const Bridge& bridge) { answers.AddYesNo(bridge.netInfo.blActive != FALSE); }},
    {"static", [](Answers& answers, const Bridge& bridge) { answers.AddYesNo(bridge.netInfo.blManual != FALSE); }},
    {"address", [](Answers& answers, const Bridge& bridge) { answers.Add(bridge.netInfo.szIp); }},
    {"mask", [](Answers& answers, const Bridge& bridge) { answers.Add(bridge.netInfo.szMask); }},
    {"member", [](Answers& answers, const Bridge& bridge) { answers.Add(bridge.bridgeInfo.info.szPrimary); }},
    {"hardware-address", [](Answers& answers, const Bridge& bridge) { AddHardwareAddress(answers, bridge.netInfo); }},
};

// None where no bridge is configured.
std::optional<Bridge> ReadBridge(const char* szBridge) {
  Bridge bridge{};
  if (MERONetGetBridgeConfig(szBridge, &bridge.netInfo, &bridge.bridgeInfo) >= 0) return bridge;
  // Fails for a file that cannot be read.
  (void)ValueOf(InterfacePath(kInterfaceScriptFormat, szBridge).c_str(), "TYPE");
  return std::nullopt;
}

void TellBridge(Answers& answers, Words words) {
  if (words.size() < 2) throw WrongUsage("bridge needs a BRIDGE and a VALUE");
  const std::optional<Bridge> bridge = ReadBridge(words[0]);
  for (const std::string_view name : words.subspan(1)) {
    const auto value = std::find_if(std::begin(kBridgeValues), std::end(kBridgeValues),
                                    [name](const auto& candidate) { return candidate.name == name; });
    if (value == std::end(kBridgeValues)) throw WrongUsage("a bridge has no '" + std::string(name) + "'");
    bridge ? value->add(answers, *bridge) : answers.AddMissing();
  }
}

// ---- The name of a section ---------------------------------------------------------------------------------------

// Whether a byte can stand in the header of a section, and between the quotes of a key/value line.
bool CanBeInName(char c) {
  constexpr std::string_view kNotInName = "\"[]\x7f";
  return static_cast<unsigned char>(c) >= ' ' && kNotInName.find(c) == std::string_view::npos;
}

// The beginning of a text that has room in so many bytes, without a part of a UTF-8 character at its end.
std::string_view Cut(std::string_view text, size_t most) {
  if (text.size() <= most) return text;
  constexpr size_t kMostContinued = 3;
  const auto is_continued = [text](size_t at) { return (static_cast<unsigned char>(text[at]) & 0xC0) == 0x80; };
  size_t end = most;
  while (end > most - kMostContinued && is_continued(end)) --end;
  return Slice(text, 0, end);
}

// The name of the section for an adapter of that name: one that the settings' record and both files give back as it is.
std::string SectionName(std::string_view product) {
  std::string name;
  std::copy_if(product.begin(), product.end(), std::back_inserter(name), CanBeInName);
  return std::string(TrimEnd(Cut(Trim(name), sizeof MERO_AP_CONF::szSecName - 1)));
}

void TellSectionName(Answers& answers, Words words) {
  if (!words.empty()) throw WrongUsage("section-name takes no more words");
  char text[64 * 1024];
  const std::string name = SectionName({text, std::fread(text, 1, sizeof text, stdin)});
  if (std::ferror(stdin) != 0) throw std::runtime_error("cannot read the adapter's name");
  if (name.empty()) return answers.AddMissing();
  answers.Add(name);
  answers.section = name;
}

// ---- Requests ----------------------------------------------------------------------------------------------------

constexpr struct {
  std::string_view name;
  void (*tell)(Answers&, Words);
} kRequests[] = {
    {"access-point", TellAccessPoint}, {"bridge", TellBridge}, {"file", TellFile}, {"check", TellCheck},
    {"section-name", TellSectionName},
};

void TellRequest(Answers& answers, Words words) {
  if (words.empty()) throw WrongUsage("a request is missing");
  for (const auto& request : kRequests) {
    if (words[0] == request.name) return request.tell(answers, words.subspan(1));
  }
  throw WrongUsage("there is no request '" + std::string(words[0]) + "'");
}

Status TellAll(Words words) {
  Answers answers;
  while (true) {
    const auto end = std::find(words.begin(), words.end(), std::string_view("--"));
    TellRequest(answers, Words(words.begin(), end));
    if (end == words.end()) return answers.Tell();
    words = Words(end + 1, words.end());
  }
}

bool AsksForHelp(Words words) {
  constexpr std::string_view kHelp[] = {"help", "-h", "--help"};
  return words.size() == 1 && std::find(std::begin(kHelp), std::end(kHelp), words[0]) != std::end(kHelp);
}

}  // namespace

int main(int argc, char* argv[]) {
  const Words words = Words(argv, static_cast<size_t>(argc)).subspan(1);
  try {
    if (AsksForHelp(words)) return std::fputs(kUsage, stdout) >= 0 && std::fflush(stdout) == 0 ? kThere : kFailed;
    return TellAll(words);
  } catch (const WrongUsage& wrong) {
    std::fprintf(stderr, "mero-settings: %s\n%s", wrong.what(), kUsage);
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "mero-settings: %s\n", failure.what());
  }
  return kFailed;
}
