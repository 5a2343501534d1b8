// An access point of the kit where there is no radio: its interface is a wire, and the programs that would want more
// of it, or of the kernel, are stood in for. What they were called with is in /tmp/calls.
#ifndef MERO_TESTS_KIT_RADIO_H
#define MERO_TESTS_KIT_RADIO_H

#include <gmock/gmock.h>

#include "kit.h"

// The programs that the scripts may run. `logger` runs where something has failed already; the shell has the rest.
inline constexpr const char* kTools[] = {
    "awk",  "basename", "busybox",  "cat",         "chmod", "chown", "cut",  "cp",   "date",  "dnsmasq",
    "find", "flock",    "hostapd",  "hostapd_cli", "id",    "ip",    "iw",   "ls",   "mkdir", "mktemp",
    "mv",   "nft",      "readlink", "rm",          "sed",   "sleep", "stat", "sync", "tr",    "wc"};

class KitRadio : public Kit {
 protected:
  KitRadio() {
    // Daemons bear their names, and somebody waits for their end, as init does.
    RunInShell("mkdir -p /tmp/daemons; for name in hostapd dnsmasq; do cp /bin/sleep /tmp/daemons/$name; done");
    StandIn("hostapd", Daemon("hostapd", "-P"));
    StandIn("hostapd_cli", "echo state=ENABLED\n");
    StandIn("dnsmasq", "for word; do case $word in --pid-file=*) file=${word#*=} ;; esac; done\n" + Launch("dnsmasq"));
    StandIn("nft",
            "[ \"$1\" = list ] || exec cat >/tmp/rules\n"
            "grep -q -F 'mero_ap {' /tmp/rules && exec cat /tmp/rules || { echo 'Error: No such file or directory' "
            ">&2; exit 1; }\n");
    StandIn("iw", "");
    StandInForIp();
    RunInShell("echo phy0 >/tmp/phy; sed -i 's,/sys/class/net/$1/phy80211/name,/tmp/phy,' /usr/mero/lib/network/*.sh");
    RunInShell("ip link add wlan0 type veth peer name air; ip link add eth0 type veth peer name wire");
    WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"yes\"\n");
    WriteText("/etc/hostapd/hostapd-wlan0-host.conf",
              "interface=wlan0\nssid=home\nwpa=2\nwpa_passphrase=deux croissants\n");
    WriteText("/etc/sysconfig/network-scripts/ifcfg-wlan0", "DEVICE=wlan0\nBRIDGE=lbr0\n");
    SetBridge("NAT=yes");
    WriteText("/etc/dhcpd/dhcpd-lbr0-lbr0.info", "enable=\"yes\"\n");
    WriteText("/etc/dhcpd/dhcpd-lbr0-lbr0.conf", "interface=lbr0\n");
  }

  ~KitRadio() override { RunInShell("for file in /run/rc.network/*.pid; do kill $(cat $file); done"); }

  // A program whose calls are noted, and which fails while it is broken.
  static void StandIn(const std::string& name, const std::string& script) {
    Install(name, "echo \"" + name + " $*\" >>/tmp/calls\nbroken=/tmp/broken." + name + R"(
if [ -e $broken ] && read -r often calls <$broken; then
	case $* in
	*"$calls"*)
		[ "$often" = always ] || rm $broken
		echo "${0##*/} is broken" >&2
		exit 3
		;;
	esac
fi
)" + script);
  }

  // The commands of a batch are noted, and fail, each by itself.
  static void StandInForIp() {
    StandIn("ip", R"(case " $* " in
*' -batch '*) ;;
*) exec /usr/sbin/ip "$@" ;;
esac
done='' n=0
while IFS= read -r line; do
	n=$((n + 1))
	echo "ip $line" >>/tmp/calls
	if [ -e $broken ] && read -r often calls <$broken; then
		case $line in
		*"$calls"*)
			[ "$often" = always ] || rm $broken
			printf '%s' "$done" | /usr/sbin/ip "$@"
			printf 'ip is broken\nCommand failed -:%s\n' $n >&2
			exit 1
			;;
		esac
	fi
	done="$done$line
"
done
printf '%s' "$done" | /usr/sbin/ip "$@"
)");
  }

  // A daemon is started apart from the script, and is noted when it bears its name.
  static std::string Launch(const std::string& name) {
    return "setsid sh -c '/tmp/daemons/" + name + " 60 & until read -r name </proc/$!/comm && [ \"$name\" = " + name +
           " ]; do :; done; echo $! >\"$0\"; wait' \"$file\" >/dev/null 2>&1 &\nuntil [ -s $file ]; do :; done\n";
  }

  static std::string Daemon(const std::string& name, const std::string& option) {
    return "while [ $# -gt 1 ]; do [ \"$1\" != " + option + " ] || file=$2; shift; done\n" + Launch(name);
  }

  static void SetBridge(const std::string& more) {
    WriteText("/etc/sysconfig/network-scripts/ifcfg-lbr0",
              "DEVICE=lbr0\nTYPE=Bridge\nBOOTPROTO=static\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\nONBOOT="
              "yes\n" +
                  more + "\n");
  }

  // Breaks a program, in the calls that have this text: in all of them, or in the next one.
  static void Break(const std::string& name, const std::string& calls = "") {
    WriteText("/tmp/broken." + name, "always " + calls + "\n");
  }
  static void BreakOnce(const std::string& name, const std::string& calls = "") {
    WriteText("/tmp/broken." + name, "once " + calls + "\n");
  }
  static void Mend() { RunInShell("rm -f /tmp/broken.*"); }

  static Ran Run(const std::string& words) { return RunInShell("PATH=/tmp/bin:$PATH " + words); }

  static Ran Script(const std::string& words) { return Run("/etc/rc.network " + words); }

  // The same, where it gets a signal while it removes a file.
  static Ran ScriptWithSignal(const std::string& words, const std::string& file) {
    Install("rm", "/bin/rm \"$@\"\ncase $* in *" + file + "*) kill $(cat /tmp/script); sleep 0.1 ;; esac\n");
    return Run("sh -c 'echo $$ >/tmp/script; exec /etc/rc.network " + words + "'");
  }

  // The processes of the stand-ins that run: of this test alone, since it has its own network.
  static std::string Daemons() {
    return RunInShell(
               "for file in /run/rc.network/*.pid; do read -r pid <$file && read -r name </proc/$pid/comm && echo "
               "$name; "
               "done 2>/dev/null")
        .out;
  }

  // The parts of an access point that exist: daemons, bridges, files, addresses and rules; empty when there are none.
  static std::string Left() {
    return Daemons() +
           RunInShell(
               "ls -d /sys/class/net/*br0 /sys/class/net/gbr /run/rc.network/hostapd-* /run/rc.network/ip_forward "
               "/run/rc.network/guest-rights* "
               "/run/rc.network/bridge-* 2>/dev/null; ip -brief -4 address show dev wlan0 | awk '$3 { print $3 }'; "
               "cat /proc/sys/net/ipv4/ip_forward | grep -v 0; ip -brief link show up dev wlan0 | grep -o wlan0; "
               "[ ! -s /tmp/rules ] || grep '^table' /tmp/rules | grep -o 'mero_ap {'")
               .out;
  }

  static std::string OnAir() { return "dnsmasq\nhostapd\n"; }
};

#endif  // MERO_TESTS_KIT_RADIO_H
