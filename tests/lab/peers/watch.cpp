// peer-watch: starts a peer, and sees by the kernel and by the air what becomes of it.
//
//   peer-watch start GROUP COMMAND...          tells the number of the last process and the time, and becomes the
//                                              command, in that control group
//   peer-watch join SECONDS                    tells when the kernel lets the wireless interface's traffic pass, when
//                                              it has an address, and when the first machine of its network answers
//   peer-watch beacon INTERFACE NAME SECONDS   tells when the first beacon of that network is on the air
//
// Each thing told is a line of its name and the time, in microseconds of the machine's monotonic clock. A watcher says
// "watching" once it does, and exits with 1 when its seconds were not enough.
#include <arpa/inet.h>
#include <linux/if_packet.h>
#include <net/ethernet.h>
#include <net/if.h>
#include <netinet/ip.h>
#include <netinet/ip_icmp.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <charconv>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <iostream>
#include <memory>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>

#include "common/descriptor.h"
#include "common/nl80211.h"

namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

// How often the kernel is asked, which costs one part in a hundred of the machine's time.
constexpr milliseconds kPause(2);
constexpr milliseconds kBetweenPings(20);

void Tell(std::string_view what) {
  const auto now = std::chrono::duration_cast<std::chrono::microseconds>(Clock::now().time_since_epoch());
  std::cout << what << ' ' << now.count() << std::endl;
}

void TellReady() {
  std::cout << "watching" << std::endl;
}

[[noreturn]] void Fail(const std::string& what) {
  throw std::runtime_error(what + ": " + std::strerror(errno));
}

Clock::time_point Deadline(std::string_view seconds) {
  int count = 0;
  const auto [end, error] = std::from_chars(seconds.data(), seconds.data() + seconds.size(), count);
  if (error != std::errc() || end != seconds.data() + seconds.size()) {
    throw std::runtime_error("no number of seconds: " + std::string(seconds));
  }
  return Clock::now() + std::chrono::seconds(count);
}

Descriptor Socket(int family, int type, int protocol) {
  Descriptor socket(::socket(family, type | SOCK_CLOEXEC | SOCK_NONBLOCK, protocol));
  if (!socket.valid()) Fail("no socket");
  return socket;
}

bool WaitForInput(int fd, milliseconds longest) {
  pollfd wanted = {.fd = fd, .events = POLLIN, .revents = 0};
  return ::poll(&wanted, 1, static_cast<int>(longest.count())) > 0;
}

// ---- start ------------------------------------------------------------------------------------------------------

// The kernel's last word of this file is the number of the process that was started last.
std::string LastProcess() {
  std::ifstream file("/proc/loadavg");
  std::string word;
  while (file >> word) continue;
  return word;
}

[[noreturn]] void Start(const char* group, char** command) {
  std::ofstream members(std::string(group) + "/cgroup.procs");
  members << getpid() << std::flush;
  if (!members) Fail(std::string("cannot enter ") + group);
  members.close();
  std::cout << "last " << LastProcess() << '\n';
  Tell("start");
  ::execvp(command[0], command);
  Fail(command[0]);
}

// ---- join -------------------------------------------------------------------------------------------------------

class Stations {
 public:
  Stations() : socket_(nl_socket_alloc()) {
    if (!socket_ || genl_connect(socket_.get()) < 0) throw std::runtime_error("no way to the wireless stack");
    family_ = genl_ctrl_resolve(socket_.get(), NL80211_GENL_NAME);
    if (family_ < 0) throw std::runtime_error("there is no wireless stack");
  }

  // Whether an interface has a station whose traffic passes: its access point, for a client.
  bool AnyAuthorized(unsigned interface) const {
    nl80211::Answer answer = nl80211::AskOnce(socket_.get(), family_, {NL80211_CMD_GET_STATION, true, interface});
    for (std::string& message : answer.messages) {
      if (IsAuthorized(reinterpret_cast<nlmsghdr*>(message.data()))) return true;
    }
    return false;
  }

 private:
  static bool IsAuthorized(nlmsghdr* message) {
    const auto* header = static_cast<const genlmsghdr*>(nlmsg_data(message));
    nlattr* info = nla_find(genlmsg_attrdata(header, 0), genlmsg_attrlen(header, 0), NL80211_ATTR_STA_INFO);
    if (info == nullptr) return false;
    const nlattr* flags = nla_find(static_cast<nlattr*>(nla_data(info)), nla_len(info), NL80211_STA_INFO_STA_FLAGS);
    if (flags == nullptr || nla_len(flags) < static_cast<int>(sizeof(nl80211_sta_flag_update))) return false;
    nl80211_sta_flag_update update;
    std::memcpy(&update, nla_data(flags), sizeof(update));
    return (update.set & update.mask & 1U << NL80211_STA_FLAG_AUTHORIZED) != 0;
  }

  nl80211::Socket socket_;
  int family_;
};

struct Interface {
  std::string name;
  unsigned index = 0;  // 0 while there is none
};

// The wireless interface. Some take it away, and make one of their own, of another name.
Interface CurrentInterface() {
  const std::unique_ptr<struct if_nameindex, nl80211::Releaser<if_freenameindex>> interfaces(if_nameindex());
  for (const auto* one = interfaces.get(); one != nullptr && one->if_index != 0; ++one) {
    const std::string radio = std::string("/sys/class/net/") + one->if_name + "/phy80211";
    if (::access(radio.c_str(), F_OK) == 0) return {one->if_name, one->if_index};
  }
  return {};
}

class Pinger {
 public:
  Pinger() : socket_(Socket(AF_INET, SOCK_RAW, IPPROTO_ICMP)) {}

  // The first host of the interface's network; none while the interface has no address.
  std::optional<in_addr> FirstHost(const std::string& interface) const {
    const auto address = Ask(interface, SIOCGIFADDR);
    const auto mask = Ask(interface, SIOCGIFNETMASK);
    if (!address || !mask || address->s_addr == 0) return {};
    return in_addr{(address->s_addr & mask->s_addr) | htonl(1)};
  }

  // What cannot be sent yet, for want of a route, is sent the next time.
  void Send(in_addr host) const {
    const sockaddr_in to = {.sin_family = AF_INET, .sin_port = 0, .sin_addr = host, .sin_zero = {}};
    icmphdr echo = {};
    echo.type = ICMP_ECHO;
    echo.un.echo.id = kOwn;
    echo.checksum = static_cast<std::uint16_t>(~(htons(ICMP_ECHO << 8) + unsigned{kOwn}));
    (void)::sendto(socket_.get(), &echo, sizeof(echo), 0, reinterpret_cast<const sockaddr*>(&to), sizeof(to));
  }

  // Waits a moment for the answer.
  bool IsAnswered() const {
    if (!WaitForInput(socket_.get(), kPause)) return false;
    char packet[256];
    const ssize_t size = ::recv(socket_.get(), packet, sizeof(packet), 0);
    const std::size_t skipped = static_cast<std::size_t>(packet[0] & 0xF) * 4;
    if (size < static_cast<ssize_t>(skipped + sizeof(icmphdr))) return false;
    icmphdr header;
    std::memcpy(&header, packet + skipped, sizeof(header));
    return header.type == ICMP_ECHOREPLY && header.un.echo.id == kOwn;
  }

 private:
  static constexpr std::uint16_t kOwn = 0x1234;

  std::optional<in_addr> Ask(const std::string& interface, unsigned long request) const {
    ifreq question = {};
    interface.copy(question.ifr_name, IFNAMSIZ - 1);
    if (::ioctl(socket_.get(), request, &question) < 0) return {};
    sockaddr_in answer;
    std::memcpy(&answer, &question.ifr_addr, sizeof(answer));
    return answer.sin_addr;
  }

  Descriptor socket_;
};

// The three do not come in one order for everybody: an address may be set before the traffic passes.
bool WatchJoin(Clock::time_point deadline) {
  const Stations stations;
  const Pinger pinger;
  bool authorized = false, addressed = false;
  Clock::time_point pinged;

  TellReady();
  while (Clock::now() < deadline) {
    const Interface interface = CurrentInterface();
    if (!authorized && interface.index != 0 && stations.AnyAuthorized(interface.index)) {
      authorized = true;
      Tell("authorized");
    }
    const auto host = pinger.FirstHost(interface.name);
    if (host && !addressed) {
      addressed = true;
      Tell("address");
    }
    if (authorized && host && Clock::now() - pinged >= kBetweenPings) {
      pinger.Send(*host);
      pinged = Clock::now();
    }
    if (pinger.IsAnswered()) {
      Tell("ping");
      return true;
    }
  }
  return false;
}

// ---- beacon -----------------------------------------------------------------------------------------------------

// Whether a frame, behind what the driver says of its reception, is a beacon of a network of that name.
bool IsBeaconOf(std::span<const std::uint8_t> frame, std::string_view name) {
  constexpr std::size_t kHeader = 24, kFixed = 12;
  constexpr std::uint8_t kBeacon = 0x80, kNameElement = 0;
  if (frame.size() < 4) return false;
  const std::size_t reception = frame[2] | static_cast<std::size_t>(frame[3]) << 8;
  if (frame.size() < reception + kHeader + kFixed + 2 || frame[reception] != kBeacon) return false;
  const auto element = frame.subspan(reception + kHeader + kFixed);  // the name stands first
  if (element[0] != kNameElement || element.size() < 2U + element[1]) return false;
  return std::string_view(reinterpret_cast<const char*>(element.data()) + 2, element[1]) == name;
}

bool WatchBeacon(const std::string& interface, std::string_view name, Clock::time_point deadline) {
  const Descriptor socket = Socket(AF_PACKET, SOCK_RAW, htons(ETH_P_ALL));
  sockaddr_ll from = {};
  from.sll_family = AF_PACKET;
  from.sll_protocol = htons(ETH_P_ALL);
  from.sll_ifindex = static_cast<int>(if_nametoindex(interface.c_str()));
  if (::bind(socket.get(), reinterpret_cast<const sockaddr*>(&from), sizeof(from)) < 0) Fail(interface);

  TellReady();
  std::uint8_t frame[4096];
  while (Clock::now() < deadline) {
    if (!WaitForInput(socket.get(), milliseconds(1000))) continue;
    const ssize_t size = ::recv(socket.get(), frame, sizeof(frame), 0);
    if (size <= 0 || !IsBeaconOf({frame, static_cast<std::size_t>(size)}, name)) continue;
    Tell("beacon");
    return true;
  }
  return false;
}

int Usage() {
  std::cerr << "usage: peer-watch start GROUP COMMAND...\n"
               "       peer-watch join SECONDS\n"
               "       peer-watch beacon INTERFACE NAME SECONDS\n";
  return 2;
}

int Run(int argc, char** argv) {
  const std::string_view what = argc > 1 ? argv[1] : "";
  if (what == "start" && argc > 3) Start(argv[2], argv + 3);
  if (what == "join" && argc == 3) return WatchJoin(Deadline(argv[2])) ? 0 : 1;
  if (what == "beacon" && argc == 5) return WatchBeacon(argv[2], argv[3], Deadline(argv[4])) ? 0 : 1;
  return Usage();
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return Run(argc, argv);
  } catch (const std::exception& error) {
    std::cerr << "peer-watch: " << error.what() << '\n';
    return 1;
  }
}
