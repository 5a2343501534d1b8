// How a network is addressed, and the address and gateway that the interface is given.
#include "model/addressing.h"

#include <arpa/inet.h>
#include <net/if.h>

#include <cstdint>
#include <cstdio>
#include <fstream>
#include <string_view>
#include <tuple>

#include "base/pid_file.h"
#include "base/text.h"
#include "common/paths.h"
#include "model/library_lines.h"

namespace {

bool IsDhcp(const KnownNetwork& config) {
  return std::string_view(config.szIp) == "DHCP";
}

std::uint32_t NumberOf(const std::string& address) {
  in_addr number{};
  ::inet_pton(AF_INET, address.c_str(), &number);
  return ntohl(number.s_addr);
}

// Whether an address is a host's in its subnet: neither the network's nor the broadcast address, and none of a group's
// or of the machine itself.
bool IsHost(const std::string& ip, const std::string& mask) {
  constexpr std::uint32_t kLoopback = 127;
  constexpr std::uint32_t kFirstOfGroups = 224;
  const std::uint32_t others = ~NumberOf(mask);
  const std::uint32_t host = NumberOf(ip) & others;
  const std::uint32_t first = NumberOf(ip) >> 24;
  return first != 0 && first != kLoopback && first < kFirstOfGroups && (others <= 1 || (host != 0 && host != others));
}

bool IsInSubnet(const std::string& gateway, const std::string& ip, const std::string& mask) {
  return ((NumberOf(gateway) ^ NumberOf(ip)) & NumberOf(mask)) == 0;
}

// One message for both ways in which one of the two can be missing.
Failure MaskWithoutAddress() {
  return Wrong("a static address and its netmask go together",
               "give both, such as 192.168.1.20 with --mask 255.255.255.0, or neither");
}

void RequireStatic(const Addressing& addressing) {
  if (!IsIpAddress(addressing.ip)) {
    throw Wrong("this is no IPv4 address: " + Harmless(addressing.ip, false),
                "give DHCP or an address such as 192.168.1.20");
  }
  if (addressing.mask.empty()) throw MaskWithoutAddress();
  if (!IsNetmask(addressing.mask)) {
    throw Wrong("this is no netmask: " + Harmless(addressing.mask, false), "give one such as 255.255.255.0");
  }
}

void RequireSound(const KnownNetwork& config) {
  const Soundness soundness = SoundnessOf(config);
  if (soundness == Soundness::kNoHost) throw Wrong("no host can have this address", "look at the address and its mask");
  if (soundness == Soundness::kGatewayOutside) throw Wrong("the gateway is not in this subnet", "look at --gateway");
  if (soundness == Soundness::kNoGateway)
    throw Wrong("no other host can have the gateway's address", "look at --gateway");
}

// The kernel's table begins with a line of titles; an address in it is a hexadecimal number in the byte order of
// memory.
bool HasDefaultRoute(const std::string& gateway) {
  in_addr wanted{};
  ::inet_pton(AF_INET, gateway.c_str(), &wanted);
  std::ifstream routes("/proc/net/route");
  for (std::string line; std::getline(routes, line);) {
    char szInterface[IFNAMSIZ];
    unsigned int destination, via, mask;
    if (std::sscanf(line.c_str(), "%15s %x %x %*x %*d %*d %*d %x", szInterface, &destination, &via, &mask) != 4)
      continue;
    const bool isDefault = destination == 0 && mask == 0;
    if (isDefault && via == wanted.s_addr && szInterface == std::string_view(MEROWirelessInterfaceGet())) return true;
  }
  return false;
}

}  // namespace

void RequireGateway(const std::string& gateway) {
  if (!IsIpAddress(gateway)) throw Wrong("the gateway is no IPv4 address", "give an address such as 192.168.1.1");
}

void SetAddressing(KnownNetwork& config, const Addressing& addressing) {
  const bool isDhcp = IsWord(addressing.ip, "DHCP");
  const bool isNone = IsWord(addressing.ip, "none");
  if (!isDhcp && !isNone) {
    RequireStatic(addressing);
  } else if (!addressing.mask.empty()) {
    throw MaskWithoutAddress();
  } else if (!addressing.gateway.empty()) {
    throw Wrong("only a static address has a gateway of its own", "add --ip A.B.C.D --mask A.B.C.D");
  }
  if (!addressing.gateway.empty()) RequireGateway(addressing.gateway);
  SetText(config.szIp, isNone ? "" : isDhcp ? "DHCP" : addressing.ip, "the address");
  SetText(config.szMask, addressing.mask, "the netmask");
  SetText(config.szGateway, addressing.gateway, "the gateway");
  RequireSound(config);
}

Soundness SoundnessOf(const KnownNetwork& config) {
  const auto& [ip, mask, gateway] =
      std::tuple<std::string, std::string, std::string>(config.szIp, config.szMask, config.szGateway);
  if (ip.empty() || IsDhcp(config)) return Soundness::kSound;
  if (!IsIpAddress(ip) || !IsNetmask(mask) || !IsHost(ip, mask)) return Soundness::kNoHost;
  if (gateway.empty()) return Soundness::kSound;
  if (!IsIpAddress(gateway) || !IsInSubnet(gateway, ip, mask)) return Soundness::kGatewayOutside;
  const bool isOthers = IsHost(gateway, mask) && NumberOf(gateway) != NumberOf(ip);
  return isOthers ? Soundness::kSound : Soundness::kNoGateway;
}

void RequireAddressing(const KnownNetwork& config) {
  const std::string advice = "`merowireless save` saves it with another one, or with DHCP";
  switch (SoundnessOf(config)) {
    case Soundness::kSound:
      return;
    case Soundness::kNoHost:
      throw Failed("the network was saved with an address that no host can have", advice);
    case Soundness::kGatewayOutside:
      throw Failed("the network was saved with a gateway that is not in its subnet", advice);
    case Soundness::kNoGateway:
      throw Failed("the network was saved with a gateway whose address no other host can have", advice);
  }
}

Task SettingAddress(const Program& program, const KnownNetwork& config) {
  return program.Doing(IsDhcp(config) ? "asking for an address" : "setting the address");
}

bool IsLeaseAbandoned() {
  const InterfacePath pid(kDhcpClientPidFormat, MEROWirelessInterfaceGet());
  return PLIBCFileExist(pid.c_str()) != 0 && !IsDaemonThere(pid.c_str(), "busybox");
}

void RequireLease() {
  if (!WasReported(Report::kNoLease)) return;
  throw Failure(Exit::kNoLease, "no DHCP server answered",
                "the appliance goes on asking; or give a static address: merowireless address A.B.C.D --mask M");
}

void ApplyAddress(const Task& task, const KnownNetwork& config) {
  const std::string interface = MEROWirelessInterfaceGet();
  const int result = Run<int>(task, [&] { return MEROWirelessIfconfigSet(interface.c_str(), config); });
  RequireLease();
  if (result < 0) throw Failed("the address could not be set");
}

// The library notices that the command could not be run, but not that it failed.
void ApplyGateway(const std::string& gateway) {
  if (MEROWirelessDefaultGatewaySet(gateway.c_str()) < 0 || !HasDefaultRoute(gateway)) {
    throw Failed("the gateway " + gateway + " could not be set",
                 "it has to be in the network of the interface's address: `merowireless status` shows that");
  }
}

void ApplySavedGateway(const KnownNetwork& config) {
  if (config.szGateway[0] != '\0' && !IsDhcp(config)) ApplyGateway(config.szGateway);
}
