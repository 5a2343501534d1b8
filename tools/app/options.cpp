// The command line.
#include "app/options.h"

#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <algorithm>
#include <chrono>
#include <limits>
#include <memory>
#include <optional>
#include <span>
#include <sstream>
#include <string_view>
#include <vector>

#include "app/spelling.h"
#include "base/choices.h"
#include "base/failure.h"
#include "base/text.h"
#include "commands/access_point.h"
#include "commands/adapter.h"
#include "commands/addressing.h"
#include "commands/channels.h"
#include "commands/connection.h"
#include "commands/country.h"
#include "commands/edit.h"
#include "commands/export.h"
#include "commands/import.h"
#include "commands/keep.h"
#include "commands/networks.h"
#include "commands/share.h"
#include "commands/stations.h"
#include "commands/watch.h"
#include "model/ap_settings.h"
#include "model/library.h"

namespace {

// What the program is for, and what its exit statuses mean.
std::string About() {
  std::string statuses;
  for (const ExitMeaning& meaning : kExitMeanings) {
    statuses += (statuses.empty() ? "" : ", ") + std::to_string(static_cast<int>(meaning.exit)) + " ";
    statuses += meaning.text;
  }
  return "Manages the appliance's wireless networking.\n\nExit status: " + statuses + ".";
}

// Adds commands: a name, a sentence of help, the function that describes the options, and the one that acts on their
// values. The values live as long as the action, which holds them. To describe the options of all commands takes longer
// than most of what a command does, so they are described of those alone whose name stands among the arguments: no
// other can be the one that is given.
class Commands {
 public:
  Commands(CLI::App& app, Options& options, std::span<const char* const> arguments)
      : app_(app), options_(options), arguments_(arguments) {}

  template <class Values = std::nullptr_t>
  CLI::App* Add(CLI::App& parent, const char* szName, const char* szHelp,
                const std::function<void(CLI::App&, Values&)>& describe,
                const std::function<void(const Program&, const Values&)>& act) {
    CLI::App* command = parent.add_subcommand(szName, szHelp);
    const auto values = std::make_shared<Values>();
    if (describe && IsNamed(szName)) describe(*command, *values);
    command->callback(
        [this, values, act] { options_.command = [values, act](const Program& program) { act(program, *values); }; });
    return command;
  }

  template <class Values = std::nullptr_t>
  CLI::App* Add(const char* szName, const char* szHelp, const std::function<void(CLI::App&, Values&)>& describe,
                const std::function<void(const Program&, const Values&)>& act) {
    return Add<Values>(app_, szName, szHelp, describe, act);
  }

  CLI::App* AddPlain(CLI::App& parent, const char* szName, const char* szHelp,
                     const std::function<void(const Program&)>& act) {
    return Add<std::nullptr_t>(parent, szName, szHelp, nullptr,
                               [act](const Program& program, const std::nullptr_t&) { act(program); });
  }

  CLI::App* AddPlain(const char* szName, const char* szHelp, const std::function<void(const Program&)>& act) {
    return AddPlain(app_, szName, szHelp, act);
  }

 private:
  bool IsNamed(std::string_view name) const { return std::ranges::find(arguments_, name) != arguments_.end(); }

  CLI::App& app_;
  Options& options_;
  std::span<const char* const> arguments_;
};

// What needs an adapter says at once that there is none: before it waits for one, and before it asks for a secret.
template <class... Values>
std::function<void(const Program&, const Values&...)> WithAdapter(void (*act)(const Program&, const Values&...)) {
  return [act](const Program& program, const Values&... values) {
    RequireAdapter();
    act(program, values...);
  };
}

// No file has an empty name, which a script gives whose variable is not set; and what looks like an option is one. The
// answer is a complaint, or empty.
std::string HasName(const std::string& file) {
  return file.empty() || file.starts_with("--") ? "it is no name" : "";
}

void DescribeSecret(CLI::App& command, SecretSource& source) {
  auto* file =
      command.add_option("--key-file", source.file, "read the secret from FILE")->option_text("FILE")->check(HasName);
  command.add_flag("--key-stdin", source.standardInput, "read the secret from the standard input")->excludes(file);
}

void DescribeMask(CLI::App& command, Addressing& addressing) {
  command.add_option("--mask", addressing.mask, "netmask of a static address")->option_text("A.B.C.D");
}

// ---- Networks ----

struct Scanning {
  bool cached = false;
  bool renew = false;

  Results results() const { return cached ? Results::kThoseThereAre : renew ? Results::kNew : Results::kUsable; }
};

void DescribeScanning(CLI::App& command, Scanning& values) {
  auto* cached = command.add_flag("--cached", values.cached, "show the last results, however old");
  command.add_flag("--renew", values.renew, "scan, however new the last results are")->excludes(cached);
}

struct Listing {
  bool byTime = false;
  bool showSecrets = false;
};

void DescribeListing(CLI::App& command, Listing& values) {
  command.add_flag("--by-time", values.byTime, "the one saved last first");
  command.add_flag("--show-secrets", values.showSecrets, "show the secrets too");
}

void DescribeNetwork(CLI::App& command, std::string& name) {
  command.add_option("network", name, "its name, or the address of its access point")
      ->required()
      ->option_text("NAME|ADDRESS");
}

void DescribeSaving(CLI::App& command, NetworkToSave& values) {
  DescribeNetwork(command, values.name);
  DescribeSecret(command, values.secret);
  command.add_option("--ip", values.addressing.ip, "DHCP (the default), a static address, or none")
      ->option_text("DHCP|A.B.C.D|none");
  DescribeMask(command, values.addressing);
  command.add_option("--gateway", values.addressing.gateway, "default gateway of a static address")
      ->option_text("A.B.C.D");
  auto* security = command.add_option("--security", values.security, "how a network that hides is protected")
                       ->option_text("open|wep|wpa|wpa2|wpa-eap|wpa2-eap");
  auto* bssid = command.add_option("--bssid", values.address, "access point of a network that hides its name")
                    ->option_text("ADDRESS")
                    ->needs(security);
  security->needs(bssid);  // a network that does not hide tells how it is protected
}

void DescribeSharing(CLI::App& command, NetworkToShare& values) {
  command
      .add_option("network", values.name, "a known network, or ap; without it the one that is joined, or on the air")
      ->option_text("[NAME|ADDRESS|ap]");
  command.add_flag("--guest", values.guests, "the access point's guest network");
  command.add_option("--png", values.png, "write the picture to FILE")->option_text("FILE")->check(HasName);
  command.add_option("--svg", values.svg, "write the drawing to FILE")->option_text("FILE")->check(HasName);
  command.add_flag("--hidden", values.isHidden, "the network hides its name");
  command.add_flag("--show-secrets", values.showSecrets, "show the code's text, with the secret, too");
}

// An option whose value stays absent when it is not given.
CLI::Option* AddChange(CLI::App& command, const char* szName, std::optional<std::string>& value, const char* szHelp) {
  return command.add_option_function<std::string>(szName, [&value](const std::string& text) { value = text; }, szHelp);
}

void DescribeEditing(CLI::App& command, NetworkToEdit& values) {
  DescribeNetwork(command, values.name);
  AddChange(command, "--ip", values.ip, "DHCP, a static address, or none")->option_text("DHCP|A.B.C.D|none");
  AddChange(command, "--mask", values.mask, "netmask of a static address")->option_text("A.B.C.D");
  AddChange(command, "--gateway", values.gateway, "default gateway of a static address")->option_text("A.B.C.D|none");
  AddChange(command, "--dns", values.nameServers, "up to three name servers, in place of the DHCP server's; or none")
      ->option_text("A.B.C.D,...|none");
  AddChange(command, "--priority", values.priority, "0 to 1000: the network with the greatest is tried first")
      ->option_text("N");
  AddChange(command, "--auto", values.autojoin, "no: it is joined only when asked for")->option_text("yes|no");
  auto* ask = command.add_flag("--key", values.askSecret, "ask for the secret");
  DescribeSecret(command, values.secret);
  ask->excludes("--key-file", "--key-stdin");
}

void DescribeExporting(CLI::App& command, SettingsToExport& values) {
  command.add_option("file", values.file, "where to write it; without it, or with -, the standard output")
      ->option_text("[FILE|-]")
      ->check(HasName);
  command.add_flag("--secrets", values.secrets, "write the secrets too");
  command.add_flag("--networks", values.networksAlone, "leave the access point's settings out");
}

void DescribeImporting(CLI::App& command, SettingsToImport& values) {
  command.add_option("file", values.file, "a document of export, or - for the standard input")
      ->required()
      ->option_text("FILE|-")
      ->check(HasName);
  command.add_flag("--networks", values.networksAlone, "leave the access point's settings as they are");
  command.add_flag("--dry-run", values.dryRun, "show what would change, and change nothing");
}

void AddNetworkCommands(Commands& commands) {
  commands.Add<Scanning>("scan", "List the networks in range", DescribeScanning,
                         [](const Program& program, const Scanning& values) { Scan(program, values.results()); });
  commands.Add<Scanning>(
      "channels", "Show what is on the air, channel by channel", DescribeScanning,
      [](const Program& program, const Scanning& values) { ShowChannels(program, values.results()); });
  commands.Add<Listing>(
      "known", "List the networks that have been saved", DescribeListing,
      [](const Program& program, const Listing& values) { ListKnown(program, values.byTime, values.showSecrets); });
  commands.Add<NetworkToSave>("save", "Save a network, so that it can be joined", DescribeSaving, Save);
  commands.Add<NetworkToEdit>("edit", "Change what was saved of a network; the rest stays", DescribeEditing, Edit);
  commands.Add<std::string>("forget", "Forget a network that has been saved", DescribeNetwork, Forget);
  commands.Add<NetworkToShare>("share", "Draw the code by which a phone joins a network", DescribeSharing, Share);
  commands.Add<SettingsToExport>("export", "Write the settings into a document", DescribeExporting, Export);
  commands.Add<SettingsToImport>("import", "Take settings from such a document", DescribeImporting, Import);
}

// ---- The connection ----

void DescribeJoining(CLI::App& command, NetworkToJoin& values) {
  DescribeNetwork(command, values.name);
  DescribeSecret(command, values.secret);
  command.add_option("--user", values.user, "who you are, for networks with EAP")->option_text("NAME");
  command.add_flag("--any-ap", values.anyAccessPoint, "with ADDRESS: through any other of the name, too");
  command.add_flag("--no-address", values.noAddress, "only join; leave the addresses alone");
  command.add_flag("--changed", values.isChanged, "though it is not protected any more as it was saved");
  command.add_flag("--no-save", values.noSave, "save nothing, though the network was joined");
  command.add_option("--wait", values.wait, "wait up to N seconds for the network, or the adapter")->option_text("N");
}

struct AutoJoining {
  bool keep = false;
  std::string patience;
  std::string longestPause;
};

void DescribeAutoJoining(CLI::App& command, AutoJoining& values) {
  auto* keep = command.add_flag("--keep", values.keep, "stay, and join again after each loss");
  command.add_option("--patience", values.patience, "the supplicant has N seconds to find it again (30)")
      ->option_text("N")
      ->needs(keep);
  command.add_option("--longest-pause", values.longestPause, "N seconds between attempts at most (300)")
      ->option_text("N")
      ->needs(keep);
}

void AutoConnectOrKeep(const Program& program, const AutoJoining& values) {
  constexpr int kDay = 86400;
  if (!values.keep) return AutoConnect(program);
  Keeping keeping;
  if (!values.patience.empty()) keeping.patience = std::chrono::seconds(NumberOf(values.patience, 0, kDay, "patience"));
  if (!values.longestPause.empty()) {
    keeping.longestPause = std::chrono::seconds(NumberOf(values.longestPause, 1, kDay, "longest-pause"));
  }
  KeepConnected(program, keeping);
}

struct Watching {
  std::string times;
};

void DescribeWatching(CLI::App& command, Watching& values) {
  command.add_option("--count", values.times, "end after so many")->option_text("N");
}

void WatchSoOften(const Program& program, const Watching& values) {
  constexpr int kMost = std::numeric_limits<int>::max();
  Watch(program, values.times.empty() ? 0 : NumberOf(values.times, 1, kMost, "count"));
}

void DescribeAddress(CLI::App& command, Addressing& values) {
  command.add_option("address", values.ip, "DHCP or a static address")->required()->option_text("DHCP|A.B.C.D");
  DescribeMask(command, values);
}

void DescribeGateway(CLI::App& command, std::string& gateway) {
  command.add_option("gateway", gateway, "its address")->required()->option_text("A.B.C.D");
}

void DescribeCell(CLI::App& command, CellToMake& values) {
  command.add_option("name", values.name, "the cell's name")->required()->option_text("NAME");
  command.add_flag("--wep", values.wep, "encrypt, with a secret");
  DescribeSecret(command, values.secret);
}

void AddConnectionCommands(Commands& commands) {
  commands.Add<NetworkToJoin>("connect", "Join a network and take an address in it", DescribeJoining,
                              WithAdapter(Connect));
  // Without WithAdapter: who keeps a connection waits for the adapter, too.
  commands.Add<AutoJoining>("autoconnect", "Join the newest known network that can be joined", DescribeAutoJoining,
                            AutoConnectOrKeep);
  commands.AddPlain("disconnect", "End the connection", Disconnect);
  commands.AddPlain("status", "Show the state of the connection", ShowStatus);
  commands.Add<Watching>("watch", "Show the connection's state whenever it changes", DescribeWatching, WatchSoOften);
  commands.Add<Addressing>("address", "Give the interface an address", DescribeAddress, WithAdapter(SetAddress));
  commands.Add<std::string>("gateway", "Add a default gateway", DescribeGateway, WithAdapter(SetGateway));
  commands.Add<CellToMake>("adhoc", "Start or join an ad-hoc cell", DescribeCell, WithAdapter(MakeCell));
}

// ---- The access point and the adapter ----

void DescribeApChanges(CLI::App& command, ApChanges& values) {
  for (const ApSetting& setting : ApSettings()) {
    if (!setting.hasOption()) continue;
    command
        .add_option_function<std::string>(
            "--" + OptionOf(setting.field.key),
            [&values, &setting](const std::string& text) { values.settings[setting.field.key] = text; }, setting.szHelp)
        ->option_text(setting.szValue);
  }
  DescribeSecret(command, values.secret);
  command.add_option("--guest-net-key-file", values.guestKeyFile, "read the guest network's secret from FILE")
      ->option_text("FILE")
      ->check(HasName);
}

void AddApCommands(Commands& commands, CLI::App& app) {
  CLI::App* ap = app.add_subcommand("ap", "Show, change and switch the access point");
  ap->require_subcommand(1);
  ap->fallthrough();

  struct Showing {
    bool secrets = false;
  };
  commands.Add<Showing>(
      *ap, "show", "Show the settings",
      [](CLI::App& command, Showing& values) {
        command.add_flag("--show-secrets", values.secrets, "show the secrets too");
      },
      [](const Program& program, const Showing& values) { ShowAp(program, values.secrets); });
  commands.Add<ApChanges>(*ap, "set", "Change settings; the others stay", DescribeApChanges, SetAp);
  commands.AddPlain(*ap, "enable", "Put the access point on the air", WithAdapter(EnableAp));
  commands.AddPlain(*ap, "disable", "Take the access point down", DisableAp);
  commands.AddPlain(*ap, "status", "Show whether the access point is on the air", ShowApStatus);
  commands.AddPlain(*ap, "stations", "List the stations of the access point", WithAdapter(ShowStations));
  commands.Add<std::string>(
      *ap, "kick", "Make a station leave, which may come back",
      [](CLI::App& command, std::string& address) {
        command.add_option("station", address, "its address")->required()->option_text("ADDRESS");
      },
      WithAdapter(KickStation));
}

void ChangeModeTo(const Program& program, const std::string& mode) {
  ChangeMode(program, Lower(mode));
}

void AddAdapterCommands(Commands& commands) {
  commands.Add<std::string>(
      "mode", "Make the adapter an access point's or a client's",
      [](CLI::App& command, std::string& mode) {
        command.add_option("mode", mode, "ap or client")->required()->option_text("ap|client");
      },
      WithAdapter(ChangeModeTo));
  commands.Add<std::string>(
      "radio", "Show whether the radio may be used, or switch it",
      [](CLI::App& command, std::string& state) {
        command.add_option("state", state, "on or off; nothing shows it")->option_text("[on|off]");
      },
      [](const Program& program, const std::string& state) {
        state.empty() ? ShowRadio(program) : SwitchRadio(program, Lower(state));
      });
  commands.Add<std::optional<std::string>>(
      "country", "Show the country of the radio's rules, or set it",
      [](CLI::App& command, std::optional<std::string>& country) {
        command.add_option("country", country, "its two letters, or none; nothing shows it")->option_text("[CC|none]");
      },
      [](const Program& program, const std::optional<std::string>& country) {
        country ? SetCountry(program, *country) : ShowCountry(program);
      });
}

// Lets the options of the program itself stand behind a command too, and its help tell of them.
void FallThrough(CLI::App& app, const std::string& footer) {
  for (CLI::App* command : app.get_subcommands([](CLI::App*) { return true; })) {
    command->fallthrough();
    command->footer(footer);
    FallThrough(*command, footer);
  }
}

std::string HelpOfOptions(std::initializer_list<const CLI::Option*> options) {
  const CLI::Formatter formatter;
  std::string help = "Options of every command:\n";
  for (const CLI::Option* option : options) help += formatter.make_option(option, false);
  help.pop_back();  // the last line end
  return help;
}

// ---- Command lines that cannot be understood ----
//
// What is said of them repeats none of the arguments but the names of options: any other may be a secret at a wrong
// place.

bool LacksCommand(const CLI::App& app) {
  const auto given = app.get_subcommands();
  return given.empty() ? app.get_require_subcommand_min() > 0 : LacksCommand(*given.front());
}

// The commands that are given, such as "ap set", each with those above it: the program itself is the first.
std::vector<const CLI::App*> GivenCommands(const CLI::App& app) {
  std::vector<const CLI::App*> commands{&app};
  while (!commands.back()->get_subcommands().empty()) commands.push_back(commands.back()->get_subcommands().front());
  return commands;
}

std::string HelpOf(const std::vector<const CLI::App*>& commands) {
  std::string help = "`";
  for (const CLI::App* command : commands) help += command->get_name() + " ";
  return help + "--help`";
}

std::vector<std::string> OptionsOf(const std::vector<const CLI::App*>& commands) {
  std::vector<std::string> options;
  for (const CLI::App* command : commands) {
    for (const CLI::Option* option :
         command->get_options([](const CLI::Option* each) { return each->nonpositional(); })) {
      std::istringstream names(option->get_name(false, true));
      for (std::string name; std::getline(names, name, ',');) {
        if (name.starts_with("--")) options.push_back(name);
      }
    }
  }
  return options;
}

std::vector<std::string> CommandsOf(const CLI::App& app) {
  std::vector<std::string> names;
  for (const CLI::App* command : app.get_subcommands([](const CLI::App*) { return true; })) {
    names.push_back(command->get_name());
  }
  return names;
}

// The first argument that is written as an option and is none, without its value; empty when all are.
std::string UnknownOption(const std::vector<std::string>& unexpected) {
  for (const std::string& argument : unexpected) {
    if (argument == "--") break;
    if (argument.starts_with("--")) return argument.substr(0, argument.find('='));
    if (argument.size() > 1 && argument.starts_with('-')) return argument.substr(0, 2);
  }
  return "";
}

// `tells` says what the help is good for.
std::string Advice(const std::string& meant, const std::vector<const CLI::App*>& commands, const std::string& tells) {
  return (meant.empty() ? "" : "is " + meant + " meant? ") + HelpOf(commands) + " " + tells;
}

Failure NoSuchOption(const std::string& option, const std::vector<const CLI::App*>& commands) {
  return Wrong("there is no option " + Harmless(option, false),
               Advice(Nearest(option, OptionsOf(commands)), commands, "lists those that there are"));
}

// There is no word when none was given.
Failure NoSuchCommand(const std::vector<std::string>& unexpected, const std::vector<const CLI::App*>& commands) {
  if (unexpected.empty()) return Wrong("a command is missing", Advice("", commands, "lists them"));
  return Wrong("there is no such command",
               Advice(Nearest(unexpected.front(), CommandsOf(*commands.back())), commands, "lists them"));
}

// The option that an error begins with: "--key-file: 1 required TEXT missing".
const CLI::Option* OptionIn(const std::string& error, const std::vector<const CLI::App*>& commands) {
  const std::string name = error.substr(0, error.find(':'));
  for (const CLI::App* command : commands) {
    if (const CLI::Option* option = command->get_option_no_throw(name)) return option;
  }
  return nullptr;
}

Failure LacksValue(const CLI::Option& option) {
  const std::string name = option.get_name();
  return Wrong(name + " is given without its value", "write " + name + " " + option.get_option_text());
}

Failure Complaint(const CLI::App& app, const CLI::ParseError& error) {
  const auto unexpected = app.remaining(true);
  const auto commands = GivenCommands(app);
  if (const auto option = UnknownOption(unexpected); !option.empty()) return NoSuchOption(option, commands);
  if (LacksCommand(app)) return NoSuchCommand(unexpected, commands);
  const std::string more = Advice("", commands, "tells more");
  if (dynamic_cast<const CLI::ExtrasError*>(&error) != nullptr) {
    return Wrong("there are more arguments than were expected", more);
  }
  if (dynamic_cast<const CLI::ConversionError*>(&error) != nullptr) {
    return Wrong("an option takes no value and was given one", more);
  }
  if (dynamic_cast<const CLI::ArgumentMismatch*>(&error) != nullptr ||
      dynamic_cast<const CLI::ValidationError*>(&error) != nullptr) {
    if (const CLI::Option* option = OptionIn(error.what(), commands)) return LacksValue(*option);
  }
  return Wrong(Harmless(error.what(), false), more);
}

}  // namespace

Options ParseOptions(int argc, const char* const* argv) {
  Options options;
  CLI::App app(About(), "merowireless");
  bool json = false;
  bool porcelain = false;
  auto* jsonFlag = app.add_flag("--json", json, "write one JSON document");
  auto* porcelainFlag =
      app.add_flag("--porcelain", porcelain, "write one record a line, fields between tabs")->excludes(jsonFlag);
  auto* verboseFlag = app.add_flag("-v,--verbose", options.verbose, "show what the library reports");
  app.set_version_flag("--version", "merowireless " MERO_VERSION, "tell the version of this program");
  app.require_subcommand(1);

  Commands commands(app, options, std::span(argv, static_cast<std::size_t>(argc)));
  AddNetworkCommands(commands);
  AddConnectionCommands(commands);
  AddApCommands(commands, app);
  AddAdapterCommands(commands);
  FallThrough(app, HelpOfOptions({jsonFlag, porcelainFlag, verboseFlag}));

  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& error) {
    std::ostringstream help;
    if (error.get_exit_code() == 0) {
      app.exit(error, help, help);
      throw Help{help.str()};
    }
    throw WrongUsage{jsonFlag->count() > 0 ? Form::kJson : Form::kHuman, Complaint(app, error)};
  }
  options.form = json ? Form::kJson : porcelain ? Form::kPorcelain : Form::kHuman;
  return options;
}
