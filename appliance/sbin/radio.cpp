#include "appliance/sbin/radio.h"

#include <linux/nl80211.h>
#include <net/if.h>
#include <netlink/genl/ctrl.h>
#include <netlink/genl/genl.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <memory>
#include <new>
#include <stdexcept>
#include <tuple>
#include <utility>

#include "appliance/sbin/elements.h"

namespace iwlist {
namespace {

template <auto Free>
struct Releaser {
  void operator()(auto* resource) const { Free(resource); }
};
using Socket = std::unique_ptr<nl_sock, Releaser<nl_socket_free>>;
using Message = std::unique_ptr<nl_msg, Releaser<nlmsg_free>>;
using Callbacks = std::unique_ptr<nl_cb, Releaser<nl_cb_put>>;

// The driver's answer to one request.
struct Answer {
  std::vector<Network> networks;
  int error = 0;  // an errno
};

int OnNetwork(nl_msg* message, void* answer) {
  if (auto network = NetworkOfMessage(nlmsg_hdr(message))) {
    static_cast<Answer*>(answer)->networks.push_back(std::move(*network));
  }
  return NL_OK;
}

// Only the last message tells whether the driver broke the listing off.
int OnFinish(nl_msg* message, void* answer) {
  const nlmsghdr* header = nlmsg_hdr(message);
  int status = 0;
  if (nlmsg_datalen(header) >= static_cast<int>(sizeof(status))) {
    std::memcpy(&status, nlmsg_data(header), sizeof(status));
  }
  static_cast<Answer*>(answer)->error = -status;
  return NL_OK;
}

int OnError(sockaddr_nl*, nlmsgerr* error, void* answer) {
  static_cast<Answer*>(answer)->error = -error->error;
  return NL_STOP;
}

// For an error of libnl's.
[[noreturn]] void FailToReachDriver(int error) {
  throw std::runtime_error(std::string("cannot reach the driver: ") + nl_geterror(error));
}

[[noreturn]] void RefuseInterface(const std::string& interface) {
  throw std::runtime_error(interface + ": not a wireless interface");
}

Socket Connect() {
  Socket socket(nl_socket_alloc());
  if (!socket) throw std::bad_alloc();
  if (const int error = genl_connect(socket.get()); error < 0) FailToReachDriver(error);
  return socket;
}

Message ScanResultsRequest(int family, unsigned interface) {
  Message message(nlmsg_alloc());
  if (!message) throw std::bad_alloc();
  if (genlmsg_put(message.get(), NL_AUTO_PORT, NL_AUTO_SEQ, family, 0, NLM_F_DUMP, NL80211_CMD_GET_SCAN, 0) ==
          nullptr ||
      nla_put_u32(message.get(), NL80211_ATTR_IFINDEX, interface) < 0) {
    throw std::bad_alloc();
  }
  return message;
}

// The result is one of libnl's, for the exchange of messages; the driver's own error is in `answer`.
int Ask(nl_sock* socket, int family, unsigned interface, Answer& answer) {
  const Message request = ScanResultsRequest(family, interface);
  const Callbacks callbacks(nl_cb_alloc(NL_CB_DEFAULT));
  if (!callbacks) throw std::bad_alloc();
  nl_cb_set(callbacks.get(), NL_CB_VALID, NL_CB_CUSTOM, OnNetwork, &answer);
  nl_cb_set(callbacks.get(), NL_CB_FINISH, NL_CB_CUSTOM, OnFinish, &answer);
  nl_cb_err(callbacks.get(), NL_CB_CUSTOM, OnError, &answer);

  if (const int sent = nl_send_auto(socket, request.get()); sent < 0) return sent;
  return nl_recvmsgs(socket, callbacks.get());
}

bool SaysNotWireless(int error) {
  return error == ENODEV || error == EOPNOTSUPP;
}

// The attributes of a network in a message, by their kind.
using Attributes = std::array<nlattr*, NL80211_BSS_MAX + 1>;

// False when the message describes no network.
bool ReadAttributes(nlmsghdr* message, Attributes& bss) {
  nla_policy policy[NL80211_BSS_MAX + 1] = {};
  policy[NL80211_BSS_BSSID].minlen = std::tuple_size_v<decltype(Network::bssid)>;
  policy[NL80211_BSS_FREQUENCY].type = NLA_U32;
  policy[NL80211_BSS_CAPABILITY].type = NLA_U16;
  policy[NL80211_BSS_SIGNAL_MBM].minlen = sizeof(std::int32_t);
  policy[NL80211_BSS_SIGNAL_UNSPEC].type = NLA_U8;
  policy[NL80211_BSS_SEEN_MS_AGO].type = NLA_U32;

  if (!genlmsg_valid_hdr(message, 0)) return false;
  const auto* header = static_cast<const genlmsghdr*>(nlmsg_data(message));
  nlattr* description = nla_find(genlmsg_attrdata(header, 0), genlmsg_attrlen(header, 0), NL80211_ATTR_BSS);
  return description != nullptr && nla_parse_nested(bss.data(), NL80211_BSS_MAX, description, policy) == 0 &&
         bss[NL80211_BSS_BSSID] != nullptr && bss[NL80211_BSS_FREQUENCY] != nullptr;
}

int SignalOf(const Attributes& bss) {
  // The figure of a network whose driver gives none: the weakest that a driver gives.
  constexpr int kWeakest = -100;
  if (const nlattr* mbm = bss[NL80211_BSS_SIGNAL_MBM]) return nla_get_s32(mbm) / 100;
  // A share of the best signal, in per cent. By custom 100 % is -50 dBm and 2 % is 1 dB.
  if (const nlattr* share = bss[NL80211_BSS_SIGNAL_UNSPEC]) return kWeakest + nla_get_u8(share) / 2;
  return kWeakest;
}

Bytes ElementsOf(const Attributes& bss) {
  // The answer to a probe tells the name that a beacon may hide.
  const nlattr* elements = bss[NL80211_BSS_INFORMATION_ELEMENTS];
  if (elements == nullptr) elements = bss[NL80211_BSS_BEACON_IES];
  if (elements == nullptr) return {};
  return {static_cast<const std::uint8_t*>(nla_data(elements)), static_cast<std::size_t>(nla_len(elements))};
}

}  // namespace

std::optional<Network> NetworkOfMessage(nlmsghdr* message) {
  Attributes bss;
  if (!ReadAttributes(message, bss)) return {};
  const unsigned megahertz = nla_get_u32(bss[NL80211_BSS_FREQUENCY]);
  const unsigned capability = bss[NL80211_BSS_CAPABILITY] == nullptr ? 0 : nla_get_u16(bss[NL80211_BSS_CAPABILITY]);

  Network network;
  std::memcpy(network.bssid.data(), nla_data(bss[NL80211_BSS_BSSID]), network.bssid.size());
  network.channel = ChannelOf(megahertz);
  network.signal = SignalOf(bss);
  if (const nlattr* age = bss[NL80211_BSS_SEEN_MS_AGO]) network.seenMsAgo = nla_get_u32(age);
  network.description = Describe(ElementsOf(bss), capability, megahertz);
  return network;
}

std::vector<Network> ReadScanResults(const std::string& interface) {
  const unsigned index = if_nametoindex(interface.c_str());
  if (index == 0) throw std::runtime_error(interface + ": no such interface");

  const Socket socket = Connect();
  const int family = genl_ctrl_resolve(socket.get(), NL80211_GENL_NAME);
  // A kernel that has never seen a radio need not know nl80211.
  if (family == -NLE_OBJ_NOTFOUND) RefuseInterface(interface);
  if (family < 0) FailToReachDriver(family);

  // The radio may hear something while the driver answers. Then the answer may lack a network or tell one twice, and
  // is worth asking for again; not for ever, since a busy band never rests.
  constexpr int kMostReadings = 5;
  Answer answer;
  int result = 0;
  for (int reading = 0; reading < kMostReadings; ++reading) {
    answer = {};
    result = Ask(socket.get(), family, index, answer);
    if (result != -NLE_DUMP_INTR) break;
  }
  if (SaysNotWireless(answer.error)) RefuseInterface(interface);
  if (answer.error != 0 || (result < 0 && result != -NLE_DUMP_INTR)) {
    const char* reason = answer.error != 0 ? std::strerror(answer.error) : nl_geterror(result);
    throw std::runtime_error(interface + ": cannot read the scan results: " + reason);
  }
  return std::move(answer.networks);
}

}  // namespace iwlist
