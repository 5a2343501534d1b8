// import: takes the known networks and the access point's settings from a document.
#include "commands/import.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <ctime>
#include <memory>
#include <optional>
#include <string_view>
#include <utility>
#include <vector>

#include "base/signals.h"
#include "base/whole_file.h"
#include "common/descriptor.h"
#include "common/known_networks_file.h"
#include "common/paths.h"
#include "common/text.h"
#include "model/ap_channels.h"
#include "model/ap_saving.h"
#include "model/ap_settings.h"
#include "model/network_extras.h"
#include "model/security.h"
#include "model/settings_change.h"
#include "model/settings_document.h"

namespace {

// ---- What is told ----

// What becomes of a network, or of the access point's settings.
struct Imported {
  const char* szWhat;
  std::string name;
  std::string address;
  const char* szChange;
  const char* szSecret;  // nothing where none is needed
};

constexpr char kAdded[] = "added";
constexpr char kChanged[] = "changed";
constexpr char kSame[] = "same";
constexpr char kTaken[] = "imported";
constexpr char kKept[] = "kept";
constexpr char kMissing[] = "missing";

constexpr Field<Imported> kFields[] = {
    {"what", "SETTINGS", [](const Imported& of) { return Value(of.szWhat); }},
    {"name", "NAME", [](const Imported& of) { return Value(of.name); }, Layout::kElastic},
    {"name_hex", "", [](const Imported& of) { return IsUtf8(of.name) ? Value(nullptr) : Value(Hex(of.name)); }},
    {"address", "ACCESS POINT", [](const Imported& of) { return Value(of.address); }},
    {"change", "CHANGE", [](const Imported& of) { return Value(of.szChange); }},
    {"secret", "SECRET", [](const Imported& of) { return Value(of.szSecret); }},
};

// ---- Networks ----

using Lines = std::vector<std::pair<const char*, std::string>>;

// The lines of a section, in the order of the file.
Lines LinesOf(const DocumentedNetwork& section) {
  const auto& [config, extras] = section;
  const Network& network = config.network;
  return {{kKeySecret, config.szKey},
          {kKeyAddress, config.szIp},
          {kKeyMask, config.szMask},
          {kKeyGateway, config.szGateway},
          {kKeyEssid, network.szEssid},
          {kKeyBssid, AddressText(network.bssid)},
          {kKeyMode, MEROWirelessOpmodeStringGet(network.opmode)},
          {kKeyAccessTime, std::to_string(config.atime)},
          {kKeyAuth, MEROWirelessAuthStringGet(network.auth)},
          {kKeyEncrypt, MEROWirelessEncryptStringGet(network.encrypt, 0)},
          {kKeyNameServers, extras.nameServers},
          {kKeyPriority, std::to_string(extras.priority)},
          {kKeyAutojoin, extras.autojoin ? "yes" : "no"}};
}

struct NetworkPlan {
  DocumentedNetwork wanted;
  std::optional<DocumentedNetwork> saved;
  const char* szSecret = "";

  const char* change() const { return !saved ? kAdded : LinesOf(wanted) == LinesOf(*saved) ? kSame : kChanged; }
};

bool HasAddressOf(const KnownNetwork& one, const KnownNetwork& other) {
  return std::ranges::equal(one.network.bssid, other.network.bssid);
}

// The secret that was saved for the network: with this access point, or else with another one of it.
const KnownNetwork* FindSecret(const std::vector<KnownNetwork>& known, const KnownNetwork& wanted) {
  const KnownNetwork* found = nullptr;
  for (const KnownNetwork& each : known) {
    const bool isOfNetwork = std::string_view(each.network.szEssid) == wanted.network.szEssid &&
                             IsProtectedAlike(each.network, wanted.network) && each.szKey[0] != '\0';
    if (isOfNetwork && (found == nullptr || HasAddressOf(each, wanted))) found = &each;
  }
  return found;
}

NetworkPlan PlanFor(DocumentedNetwork wanted, const std::vector<KnownNetwork>& known, const std::string& place) {
  NetworkPlan plan{.wanted = std::move(wanted), .saved = std::nullopt};
  KnownNetwork& config = plan.wanted.network;
  const auto saved = std::ranges::find_if(known, [&](const KnownNetwork& each) { return HasAddressOf(each, config); });
  if (saved != known.end()) {
    if (!HasSection(*saved)) {
      throw WrongAt(place, Failed("the network is saved in a section that is not named by its address",
                                  "look at it in " + std::string(kKnownNetworksPath)));
    }
    plan.saved = {.network = *saved, .extras = ExtrasOf(*saved)};
  }
  if (config.atime == 0)
    config.atime = saved != known.end() ? saved->atime : static_cast<std::int32_t>(std::time(nullptr));
  if (!NeedsSecret(config.network.auth)) return plan;
  const bool isGiven = config.szKey[0] != '\0';
  const KnownNetwork* kept = isGiven ? nullptr : FindSecret(known, config);
  if (kept != nullptr) CopyText(config.szKey, kept->szKey);
  plan.szSecret = isGiven ? kTaken : kept != nullptr ? kKept : kMissing;
  return plan;
}

std::vector<NetworkPlan> PlanFor(const SettingsDocument& document) {
  const std::vector<KnownNetwork> known = Known(Order::kAsSaved);
  std::vector<NetworkPlan> plans;
  plans.reserve(document.networks.size());
  for (const DocumentedNetwork& network : document.networks) {
    plans.push_back(PlanFor(network, known, PlaceOfNetwork(plans.size())));
  }
  return plans;
}

// Keys of the program's own stand only where they say something.
void Add(const SettingsChange& change, const NetworkPlan& plan) {
  constexpr int kSizeHint = 16;
  PPLIBSZHASH hash = PLIBCSzHashAlloc(kSizeHint);
  const Lines nothing = LinesOf({});
  const Lines lines = LinesOf(plan.wanted);
  for (std::size_t i = 0; hash != nullptr && i < lines.size(); ++i) {
    const auto& [szKey, value] = lines[i];
    const bool isOwn = szKey == kKeyNameServers || szKey == kKeyPriority || szKey == kKeyAutojoin;
    if (!isOwn || value != nothing[i].second) (void)PLIBCSzHashSetValue(&hash, szKey, value.c_str());
  }
  const std::unique_ptr<PLIBSZHASH, decltype(&PLIBCSzHashFree)> section(hash, PLIBCSzHashFree);
  const std::string name = AddressText(plan.wanted.network.network.bssid);
  if (hash == nullptr || PLIBCFileAddSection(change.copy(), name.c_str(), hash, kSectionLineFormat) <= 0) {
    throw Failed("a network could not be added, and nothing was imported", "is there room on the disk? -v shows more");
  }
}

void Write(const SettingsChange& change, const NetworkPlan& plan) {
  if (!plan.saved) return Add(change, plan);
  const Lines before = LinesOf(*plan.saved);
  const Lines after = LinesOf(plan.wanted);
  for (std::size_t i = 0; i < after.size(); ++i) {
    const auto& [szKey, value] = after[i];
    if (value != before[i].second) change.Set(AddressText(plan.wanted.network.network.bssid), szKey, value);
  }
}

// ---- The access point ----

struct ApPlan {
  ApConf conf;
  const char* szChange;
  const char* szSecret;
  bool isChecked;
};

bool IsSame(const ApConf& one, const ApConf& other) {
  return std::ranges::all_of(ApFields(true),
                             [&](const Field<ApConf>& field) { return field.value(one) == field.value(other); });
}

bool Has(const DocumentedAp& documented, std::string_view key) {
  return std::ranges::any_of(documented, [&](const auto& setting) {
    return setting.first == key && !std::holds_alternative<std::nullptr_t>(setting.second);
  });
}

ApPlan PlanForAp(const DocumentedAp& documented) {
  if (AdapterModelOrNone().empty()) {
    throw Failure(MEROWirelessAdapterNum() <= 0 ? Exit::kNoAdapter : Exit::kFailed,
                  "the access point's settings are an adapter's, and none has been announced",
                  "plug it in, or import the networks alone with --networks");
  }
  ApConf before{};
  const bool wasSaved = ReadSavedAp(before);
  ApPlan plan{.conf = ReadApSettings(), .szChange = kAdded, .szSecret = "", .isChecked = true};
  SetBridgeDefault(plan.conf);
  SetAp(plan.conf, documented);
  if (wasSaved) plan.szChange = IsSame(before, plan.conf) ? kSame : kChanged;
  if (plan.conf.hostapConf.encryption != AP_ENCRYPT_OPEN) plan.szSecret = Has(documented, "secret") ? kTaken : kKept;
  if (Has(documented, "channel") || Has(documented, "band") || Has(documented, "hw_mode")) {
    plan.isChecked = CheckChannel(plan.conf) == ChannelCheck::kPassed;
  }
  return plan;
}

// The file of the access point's settings as it was.
class FormerSettings {
 public:
  FormerSettings() : text_(TextOfFile(kApSettingsPath)) {
    struct stat status{};
    if (text_ ? ::stat(kApSettingsPath, &status) == 0 : errno == ENOENT) {
      mode_ = status.st_mode & ALLPERMS;
      return;
    }
    throw Failed("the access point's settings cannot be read, and nothing was imported", "-v shows more");
  }

  void PutBack() const {
    const bool back = text_ ? ReplaceSettings(kApSettingsPath, *text_, mode_) : RemoveSettings(kApSettingsPath);
    if (back) return;
    throw Failed("the networks could not be imported, and the access point's settings not be put back",
                 "`merowireless ap show` shows those that there are now");
  }

 private:
  std::optional<std::string> text_;
  mode_t mode_ = 0;
};

// ---- All of it ----

std::string ReadDocument(const Program& program, const std::string& path) {
  const bool isStandardInput = path == "-";
  const Descriptor file(isStandardInput ? -1 : ::open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (isStandardInput || file.valid()) {
    const auto text = TextOf(isStandardInput ? STDIN_FILENO : file.get(), kLongestDocument);
    if (text) return *text;
  }
  const std::string shown = isStandardInput ? "the standard input" : program.output.Name(path);
  throw Failure(Exit::kFailed, "the document cannot be read from " + shown + ": " + std::strerror(errno),
                "check the file");
}

// The settings of the access point are saved by the library, and the networks after them in one step.
void WriteAll(SettingsChange* change, const std::vector<NetworkPlan>& plans, const std::optional<ApPlan>& ap) {
  if (change != nullptr) {
    for (const NetworkPlan& plan : plans) Write(*change, plan);
  }
  if (!ap || ap->szChange == kSame) {
    if (change != nullptr) change->Commit();
    return;
  }
  const FormerSettings former;
  try {
    SaveApKeepingSwitch(ap->conf);
    if (change != nullptr) change->Commit();
  } catch (const MayBeLost&) {
    throw;  // the networks are imported, and what goes with them stays
  } catch (const Failure&) {
    former.PutBack();
    throw;
  }
}

std::vector<Imported> Report(const std::vector<NetworkPlan>& plans, const std::optional<ApPlan>& ap) {
  std::vector<Imported> imported;
  for (const NetworkPlan& plan : plans) {
    const Network& network = plan.wanted.network.network;
    imported.push_back({"network", network.szEssid, AddressText(network.bssid), plan.change(), plan.szSecret});
  }
  if (ap) imported.push_back({"access-point", ap->conf.hostapConf.szSSID, "", ap->szChange, ap->szSecret});
  return imported;
}

void Explain(const std::vector<Imported>& imported, const std::optional<ApPlan>& ap, bool dryRun) {
  if (std::ranges::any_of(imported, [](const Imported& each) { return each.szSecret == kMissing; })) {
    Remark("merowireless: a network whose secret is missing needs it from `merowireless edit NAME --key`");
  }
  if (ap && !ap->isChecked)
    Remark("merowireless: the imported channel could not be checked: no radio is there to tell");
  if (dryRun) return Remark("merowireless: nothing was changed: this is what would be imported");
  if (ap) Remark("merowireless: `merowireless ap enable` puts the imported settings on the air");
}

}  // namespace

void Import(const Program& program, const SettingsToImport& wanted) {
  SettingsDocument document = DocumentIn(ReadDocument(program, wanted.file));
  if (wanted.networksAlone) document.ap.reset();
  if (document.networks.empty() && !document.ap) throw Wrong("the document has nothing to import", "look at it");

  const Signals signals;  // none ends the program while a copy of the secrets lies beside them
  std::optional<SettingsChange> change;
  if (!wanted.dryRun && !document.networks.empty()) change.emplace(kKnownNetworksPath);
  const std::vector<NetworkPlan> plans = PlanFor(document);
  const std::optional<ApPlan> ap = document.ap ? std::optional(PlanForAp(*document.ap)) : std::nullopt;
  if (!wanted.dryRun) WriteAll(change ? &*change : nullptr, plans, ap);
  const std::vector<Imported> imported = Report(plans, ap);
  program.output.List<Imported>("imported", kFields, imported, "");
  Explain(imported, ap, wanted.dryRun);
}
