// The kit's scripts, and what becomes of them.
#include "tests/fault/scripts.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <set>
#include <sstream>

#include "tests/appliance/kit_sweep.h"
#include "tests/fault/machine_state.h"
#include "tests/support/processes.h"

namespace {

constexpr char kStart[] = "/etc/rc.network start wlan0 lbr0";
constexpr char kRestart[] = "/etc/rc.network restart wlan0 lbr0";
constexpr char kHotPlug[] = "/usr/mero/hotplug/usb.wireless.function ";
constexpr char kBound[] =
    "env interface=wlan0 ip=192.0.2.9 subnet=255.255.255.0 router=192.0.2.1 dns=192.0.2.53 domain=home.example "
    "/usr/mero/sbin/udhcpc.lease bound";

constexpr char kNote[] = "/tmp/wireless.info.";
constexpr char kSwitch[] = "/etc/hostapd/hostapd-wlan0.info.";
constexpr char kResolver[] = "/etc/resolv.conf.new.";

// A row: what is run, and what leads to the state before. Each is a command of the shell.
struct KitScript {
  const char* szName;
  std::string prepare;  // once
  std::string bring;
  std::string words;
  std::string left = "";  // how a new file begins that a kill leaves: its name cannot be foreseen, nobody looks for it
  std::string kept = "";  // a note that a run leaves to the next one when it fails
};

// An adapter whose device and radio are files, as there is no radio.
constexpr char kPlugIn[] =
    "mkdir -p /tmp/adapters/wlan0/phy80211 /tmp/usb/device; echo 'RT [5370' >/tmp/usb/product; "
    "echo phy0 >/tmp/adapters/wlan0/phy80211/name; "
    "sed -i -e 's,/sys/class/net/\\*/phy80211,/tmp/adapters/*/phy80211,' "
    "-e 's,/sys/class/net/$1/phy80211/name,/tmp/phy,' /usr/mero/lib/network/adapter.sh; "
    "printf '#!/bin/sh\\necho /tmp/usb/device\\n' >/tmp/bin/readlink; chmod 755 /tmp/bin/readlink; "
    "printf '#!/bin/sh\\ncase \"$*\" in *info) printf \"\\\\tSupported interface modes:\\\\n\\\\t\\\\t * AP\\\\n\" ;; "
    "esac\\n' >/tmp/bin/iw";

// A bridge that takes over the address and the way out of its first member.
constexpr char kWiredBridge[] =
    "printf 'DEVICE=br0\\nTYPE=Bridge\\nPRIMARY=eth0\\nBOOTPROTO=static\\nIPADDR=192.0.2.9\\n"
    "NETMASK=255.255.255.0\\nONBOOT=no\\n' >/etc/sysconfig/network-scripts/ifcfg-br0";
constexpr char kWire[] =
    "/etc/rc.network restart wlan0 br0; ip link delete br0; ip address flush dev eth0; "
    "ip link set wire up; ip link set eth0 up; until grep -qx up /sys/class/net/eth0/operstate; do sleep 0.02; done; "
    "ip address add 192.0.2.9/24 dev eth0; ip route replace default via 192.0.2.1 metric 7";

constexpr char kInstallLease[] = "cp " APPLIANCE_KIT
                                 "/sbin/udhcpc.lease /usr/mero/sbin/udhcpc.lease; ip link set wlan0 up; "
                                 "echo 'nameserver 192.0.2.2' >/etc/resolv.conf";

const std::vector<KitScript>& AllScripts() {
  static const std::string hotPlug = kHotPlug;
  static const std::vector<KitScript> all = {
      {"rc.network start", "", kRestart, kStart},
      {"rc.network start with a wire", kWiredBridge, kWire, "/etc/rc.network start wlan0 br0"},
      {"rc.network start with a wire without a cable", kWiredBridge,
       std::string(kWire) + "; ip link set wire down; until ip route | grep -q linkdown; do sleep 0.02; done",
       "/etc/rc.network start wlan0 br0"},
      {"rc.network restart", "", kStart, kRestart},
      {"rc.network schedule", "", std::string("echo 00 >/tmp/hour; ") + kStart + "; echo 01 >/tmp/hour",
       "/etc/rc.network schedule wlan0", "", "/run/rc.network/late-wlan0"},
      {"rc.network boot",
       "printf "
       "'TYPE=Bridge\\nPRIMARY=eth0\\nBOOTPROTO=static\\nIPADDR=192.0.2.1\\nNETMASK=255.255.255.0\\nONBOOT=yes\\n' "
       ">/etc/sysconfig/network-scripts/ifcfg-abr0",
       "ip link delete lbr0; ip link delete abr0; ip link set dev eth0 down", "/etc/rc.network boot"},
      {"usb.wireless.function add", kPlugIn, std::string(kRestart) + "; rm -f /tmp/wireless.info", hotPlug + "add",
       kNote},
      {"usb.wireless.function remove", "",
       std::string("ip link show wlan0 || ip link add wlan0 type veth peer name air; echo 'PRODUCT=\"RT [5370\"' "
                   ">/tmp/wireless.info; ") +
           kStart + "; ip link delete wlan0",
       hotPlug + "remove", kNote},
      {"usb.wireless.function change-mode ap", kPlugIn, hotPlug + "change-mode client", hotPlug + "change-mode ap",
       kSwitch},
      {"usb.wireless.function change-mode client", kPlugIn, hotPlug + "change-mode ap", hotPlug + "change-mode client",
       kSwitch},
      {"udhcpc.lease bound", kInstallLease, "interface=wlan0 /usr/mero/sbin/udhcpc.lease deconfig", kBound, kResolver},
      {"udhcpc.lease deconfig", kInstallLease, kBound, "env interface=wlan0 /usr/mero/sbin/udhcpc.lease deconfig",
       kResolver},
      {"udhcpc.lease left", kInstallLease, kBound, "/usr/mero/sbin/udhcpc.lease left wlan0", kResolver},
  };
  return all;
}

constexpr char kNextBoot[] = "what a script that was killed has not renamed yet is removed when the machine starts";

class ScriptTrial : public CountedKit {
 public:
  ScriptTrial(const KitScript& script, const Share& share) : script_(script), share_(share) {
    RunInShell(script_.prepare);
    Bring();
    base_ = StateOfMachine();
    const Ran ran = RunWithTurn(0, script_.words);
    if (ran.status != 0) Lose("without a fault", "it has failed: " + ran.out);
    to_ = WholeState();
    good_ = StateOfMachine();
    calls_ = CountIn("/tmp/count");
    std::istringstream programs(ReadText("/tmp/ran"));
    for (std::string program; programs >> program;) programs_.insert(program);
    for (const std::string& again : Leftovers()) Lose("without a fault", again + " was left over");
  }

  // Commands that fail are swept by the level `platform` as it is.
  Tally Run() {
    if (share_.most == 0) {
      Turns(Turn::kFails, " fails", tally_.commands);
      Turns(Turn::kTakesLong, " takes long", tally_.commands);
    }
    Turns(Turn::kKills, ": killed", tally_.kills);
    RunWithoutPrograms();
    if (share_.most == 0 && !script_.left.empty() && tally_.staying == 0) {
      Lose("all faults", "none has left a file " + script_.left);
    }
    return std::move(tally_);
  }

 private:
  void TestBody() override {}

  int StepOf(size_t count) const {
    if (share_.most == 0) return 1;
    return (static_cast<int>(count) + share_.most - 1) / share_.most;
  }

  void Turns(Turn what, const char* szText, int& count) {
    const int step = StepOf(static_cast<size_t>(calls_));
    for (int turn = 1 + step / 2; turn <= calls_; turn += step) {
      Bring();
      const Ran ran = RunWithTurn(turn, script_.words, what);
      if (Failed().empty()) continue;
      ++count;
      Judge("call " + std::to_string(turn) + ", '" + Failed().substr(0, Failed().find('\n')) + "'" + szText, what, ran);
    }
  }

  void RunWithoutPrograms() {
    const int step = StepOf(programs_.size());
    int number = step / 2;
    for (const std::string& program : programs_) {
      if (number++ % step != 0) continue;
      Bring();
      const Ran ran = RunWithout(program, script_.words);
      ++tally_.commands;
      Judge(program + " is missing", Turn::kFails, ran);
    }
  }

  void Bring() { RunInShell("PATH=/tmp/bin:$PATH; " + script_.bring); }

  // ---- Judging ----

  void Judge(const std::string& fault, Turn what, const Ran& ran) {
    CheckNothingRuns(fault);
    CheckRules(fault);
    const std::string state = WholeState();
    if (what == Turn::kKills) {
      ++tally_.cutShort;
    } else if (ran.status == 0) {
      ++tally_.done;
      if (state != to_) Lose(fault, "it has succeeded, and the state is\n" + Difference(state) + ran.out);
    } else {
      ++tally_.failed;
      if (what == Turn::kTakesLong) Lose(fault, "it has failed: " + ran.out);
      if (ran.out.empty()) Lose(fault, "it has failed without a word");
    }
    const std::set<std::string> left = Leftovers();
    if (!left.empty()) ++tally_.left;
    if (what != Turn::kKills) CheckNothingLeft(fault, left, ran.status != 0);
    const bool wasRunAgain = CheckAgain(fault, state);
    CheckLeftovers(fault, what == Turn::kKills, wasRunAgain);
  }

  // A run that comes to its end leaves nothing that the next one would have to remove, if it can remove anything.
  void CheckNothingLeft(const std::string& fault, const std::set<std::string>& left, bool hasFailed) {
    if (fault == "rm is missing") return;
    for (const std::string& path : left) {
      if (hasFailed && path == script_.kept) continue;
      Lose(fault, path + " was left over by a run that was not killed");
    }
  }

  // One more run makes everything good: it is made once for each state that it meets. False where it was made before.
  bool CheckAgain(const std::string& fault, const std::string& state) {
    if (!met_.insert(state).second) return false;
    const Ran again = RunWithTurn(0, script_.words);
    if (again.status != 0) Lose(fault, "the next run has failed: " + again.out);
    const std::string after = WholeState();
    if (after != to_) Lose(fault, "behind the next run the state is\n" + Difference(after));
    return true;
  }

  // What a kill leaves may be excused; a run that fails leaves nothing, and no run leaves anything behind the next one.
  void CheckLeftovers(const std::string& fault, bool killed, bool wasRunAgain) {
    bool stays = false;
    for (const std::string& path : Leftovers()) {
      const bool excused = IsExcused(path);
      if (!(excused ? killed : !wasRunAgain)) Lose(fault, path + " was left over");
      if (!excused) continue;
      stays = true;
      fs::remove(path);
    }
    if (!stays || !killed) return;
    ++tally_.staying;
    ++tally_.reasons[kNextBoot];
  }

  bool IsExcused(const std::string& path) const { return !script_.left.empty() && path.starts_with(script_.left); }

  // Nobody is on the air without the rules that the settings ask for.
  void CheckRules(const std::string& fault) {
    const bool onAir = Daemons().find("hostapd") != std::string::npos;
    const bool rules = TextOrNothing("/tmp/rules").find("mero_ap {") != std::string::npos;
    if (onAir && !rules) Lose(fault, "an access point is on the air without its rules");
  }

  // Daemons are not among these: setsid(1) starts them.
  void CheckNothingRuns(const std::string& fault) {
    const int session = std::atoi(TextOrNothing("/tmp/session").c_str());
    if (!Soon([&] { return !IsAnyIn(session); }, 2)) Lose(fault, "a process stayed");
  }

  static bool IsAnyIn(int session) {
    for (const auto& entry : fs::directory_iterator("/proc")) {
      if (std::atoi(entry.path().filename().c_str()) == 0) continue;
      std::string text;
      std::getline(std::ifstream(entry.path() / "stat"), text);  // none of a process that has ended meanwhile
      const size_t name = text.rfind(") ");
      if (name == std::string::npos) continue;
      std::istringstream rest(text.substr(name + 2));
      char state = 0;
      int parent = 0, group = 0, own = 0;
      rest >> state >> parent >> group >> own;
      if (own == session && state != 'Z') return true;
    }
    return false;
  }

  // Without what the machine's next start removes. How a gateway was found is all the same.
  std::string WholeState() const {
    std::istringstream state(State() + RunInShell("cat /etc/resolv.conf; ip -4 route | sed 's/ onlink//'").out);
    std::string text;
    for (std::string line; std::getline(state, line);) text += IsExcused(line) ? "" : line + "\n";
    return text;
  }

  // The lines that are not as without a fault.
  std::string Difference(const std::string& state) const {
    std::istringstream is(state);
    std::string text;
    for (std::string line; std::getline(is, line);) {
      if (to_.find(line + "\n") == std::string::npos) text += "    + " + line + "\n";
    }
    std::istringstream wanted(to_);
    for (std::string line; std::getline(wanted, line);) {
      if (state.find(line + "\n") == std::string::npos) text += "    - " + line + "\n";
    }
    return text;
  }

  // Files that are there neither before a run nor behind it, but for those of the trial.
  std::set<std::string> Leftovers() const {
    std::set<std::string> paths;
    for (const auto& [path, described] : StateOfMachine()) {
      if (base_.contains(path) || good_.contains(path) || path == "/tmp/failed") continue;
      paths.insert(path);
    }
    return paths;
  }

  static int CountIn(const std::string& path) {
    const std::string text = ReadText(path);
    return static_cast<int>(std::ranges::count(text, '\n'));
  }

  void Lose(const std::string& fault, const std::string& what) { tally_.losses.push_back(fault + ": " + what); }

  const KitScript& script_;
  const Share share_;
  Tally tally_;
  MachineState base_;
  MachineState good_;
  std::string to_;
  int calls_ = 0;
  std::set<std::string> programs_;
  std::set<std::string> met_;
};

}  // namespace

std::vector<std::string> ScriptNames() {
  std::vector<std::string> names;
  for (const KitScript& script : AllScripts()) names.emplace_back(script.szName);
  return names;
}

Tally TryScript(const std::string& name, const Share& share) {
  const auto script =
      std::ranges::find(AllScripts(), name, [](const KitScript& one) { return std::string(one.szName); });
  return ScriptTrial(*script, share).Run();
}
