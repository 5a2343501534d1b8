// The access point's settings: those that are saved are loaded as they were, whatever the file held before; those that
// are refused change nothing; and what any file holds is loaded into a record whose texts end.
//
// Runs: 6000
// Covers: lib/obsolete/wireless_ap_conf_get.cpp lib/obsolete/wireless_ap_conf_set.cpp
#include <cstdio>
#include <cstring>
#include <memory>

#include "common/ap_settings.h"
#include "common/paths.h"
#include "platform.h"
#include "tests/fuzz/support.h"

namespace {

bool g_finds = false;

// A setting's field, as text.
std::string TextOf(const Setting& setting, const void* record) {
  switch (setting.kind) {
    case SettingKind::kSwitch:
      return NumberIn(record, setting) != FALSE ? "yes" : "no";
    case SettingKind::kInteger:
      return std::to_string(NumberIn(record, setting));
    default:
      return EndedText(static_cast<const char*>(record) + setting.offset, setting.size);
  }
}

// Calls `visit(setting, record)` for every setting that a record has and a file gives back; `record` is what the
// setting's field is in.
template <class Record, class Visit>
void ForEachKept(Record& conf, Visit visit) {
  const auto secrets = [&](MERO_AP_ENCRYPT encryption, BOOL blGuest, auto& record) {
    ForEachSecret(encryption, blGuest, [&](const char*, const Setting& setting) { visit(setting, &record); });
  };
  auto& main = conf.hostapConf;
  ForEachRead([&](const Setting& setting) {
    if (setting.kind == SettingKind::kMainSecrets) {
      secrets(main.encryption, FALSE, main.encryptInfo);
    } else if (setting.kind == SettingKind::kGuestSecrets) {
      secrets(main.guestNet.encryption, TRUE, main.guestNet.encryptInfo);
    } else {
      visit(setting, &conf);
    }
  });
}

std::string Described(const MERO_AP_CONF& conf) {
  std::string text;
  ForEachKept(conf, [&](const Setting& setting, const void* record) {
    text += std::string(setting.szKey) + "=" + TextOf(setting, record) + "\n";
  });
  return text;
}

void Take(Fields& fields, const Setting& setting, void* record) {
  if (setting.kind == SettingKind::kSwitch || setting.kind == SettingKind::kInteger) {
    return PutNumber(record, setting, fields.Number());
  }
  char* szField = static_cast<char*>(record) + setting.offset;
  std::strncpy(szField, fields.Text().c_str(), setting.size - 1U);
}

std::string Loaded(const char* szName, MERO_AP_CONF& conf) {
  Require(MEROWirelessGetAPConfig(szName, &conf) >= 0, "settings are loaded");
  EndedText(conf.szSecName);
  return Described(conf);
}

}  // namespace

// Whether the file has the section, the library asks a command. Whatever it says, what is saved is saved.
extern "C" FILE* popen(const char* szCommand, const char*) {
  Require(std::strncmp(szCommand, "grep -i \"", 9) == 0, "nothing else is run", {szCommand});
  static char szFound[] = "found\n";
  return ::fmemopen(szFound, g_finds ? sizeof szFound - 1 : 1, "r");
}

extern "C" int pclose(FILE* stream) {
  return std::fclose(stream);
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Fields fields(data, size);
  const auto conf = std::make_unique<MERO_AP_CONF>();
  g_finds = fields.Flag();
  fields.FillEnded(conf->szSecName);
  ForEachKept(*conf, [&](const Setting& setting, void* record) { Take(fields, setting, record); });
  const std::string text = fields.Rest();
  PutFile(kApSettingsPath, text);

  const auto loaded = std::make_unique<MERO_AP_CONF>();
  const std::string before = Loaded(conf->szSecName, *loaded);
  const bool saved = MEROWirelessSetAPConfig(conf.get()) != FALSE;
  const std::string content = FileAt(kApSettingsPath).value_or("");
  const std::string after = Loaded(conf->szSecName, *loaded);
  if (!saved) {
    Require(content == text, "what is refused leaves the file as it is", {text, content});
  } else if (conf->blEnable != FALSE) {
    Require(after == Described(*conf), "what is saved is loaded", {Described(*conf), after});
  } else {
    Require(loaded->blEnable == FALSE, "an access point is switched off", {content});
    const bool had = before.starts_with("enable=yes\n");
    Require(!had || after == "enable=no\n" + before.substr(before.find('\n') + 1), "the other settings stay",
            {before, after});
  }
  return 0;
}
