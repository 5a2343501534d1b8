// export: writes the known networks and the access point's settings into a document.
#include "commands/export.h"

#include <cstdint>
#include <optional>
#include <vector>

#include "base/whole_file.h"
#include "model/ap_settings.h"
#include "model/library.h"
#include "model/settings_document.h"

namespace {

struct Exported {
  std::string file;
  std::size_t networks;
  bool hasAp;
  bool hasSecrets;
};

constexpr Field<Exported> kFields[] = {
    {"file", "", [](const Exported& of) { return Value(of.file); }},
    {"networks", "", [](const Exported& of) { return Value(static_cast<std::int64_t>(of.networks)); }},
    {"access_point", "", [](const Exported& of) { return Value(of.hasAp); }},
    {"secrets", "", [](const Exported& of) { return Value(of.hasSecrets); }},
};

std::string SentenceOf(const Program& program, const Exported& exported) {
  const std::string networks =
      exported.networks == 1 ? "1 known network" : std::to_string(exported.networks) + " known networks";
  return program.output.Name(exported.file) + " holds " + networks +
         (exported.hasAp ? " and the access point's settings" : "") +
         (exported.hasSecrets ? ", with their secrets: whoever reads it can join" : ", without secrets");
}

// The settings of the adapter that is plugged in, if any were saved.
std::optional<ApConf> SavedAp() {
  if (AdapterModelOrNone().empty()) {
    Remark("merowireless: the access point's settings are left out, since no adapter has been announced");
    return std::nullopt;
  }
  ApConf conf{};
  return ReadSavedAp(conf) ? std::optional(conf) : std::nullopt;
}

}  // namespace

void Export(const Program& program, const SettingsToExport& wanted) {
  const std::vector<KnownNetwork> networks = Known(Order::kAsSaved);
  const std::optional<ApConf> ap = wanted.networksAlone ? std::nullopt : SavedAp();
  const std::string document = DocumentOf(networks, ap, wanted.secrets ? Secrets::kIncluded : Secrets::kLeftOut);
  if (wanted.file.empty() || wanted.file == "-") return program.output.Document(document);
  WriteForOwner(wanted.file, program.output.Name(wanted.file), HarmlessDocument(document, true));
  const Exported exported{wanted.file, networks.size(), ap.has_value(), wanted.secrets};
  program.output.Done<Exported>(SentenceOf(program, exported), "export", kFields, exported);
}
