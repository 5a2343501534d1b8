// The IPv4 routes that somebody has given an interface. The kernel drops them when the interface goes down.
#include "work/routes.h"

#include <arpa/inet.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <functional>
#include <optional>

#include "base/require.h"
#include "common/descriptor.h"

namespace {

// A connection to the kernel's routing, and the answers to one request.
class Routing {
 public:
  Routing() : socket_(Require(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_ROUTE), "netlink")) {}

  // Sends a message. Gives `take` each answer but the last one, and gives the error that is told by that one, or 0.
  int Ask(const std::string& message, const std::function<void(const nlmsghdr&)>& take) const {
    Require(static_cast<int>(::send(socket_.get(), message.data(), message.size(), 0)), "netlink");
    alignas(nlmsghdr) char answers[32768];
    while (true) {
      auto left = static_cast<unsigned int>(
          Require(static_cast<int>(::recv(socket_.get(), answers, sizeof answers, 0)), "netlink"));
      auto* answer = reinterpret_cast<nlmsghdr*>(answers);
      for (; NLMSG_OK(answer, left); answer = NLMSG_NEXT(answer, left)) {
        if (answer->nlmsg_type == NLMSG_DONE) return 0;
        if (answer->nlmsg_type == NLMSG_ERROR) return -static_cast<nlmsgerr*>(NLMSG_DATA(answer))->error;
        take(*answer);
      }
    }
  }

 private:
  Descriptor socket_;
};

std::string AllRoutes() {
  struct {
    nlmsghdr header;
    rtmsg route;
  } request{};
  request.header.nlmsg_len = sizeof request;
  request.header.nlmsg_type = RTM_GETROUTE;
  request.header.nlmsg_flags = NLM_F_REQUEST | NLM_F_DUMP;
  request.route.rtm_family = AF_INET;
  return {reinterpret_cast<const char*>(&request), sizeof request};
}

// Calls `visit(attribute)` for each attribute of a route.
void ForEachOf(const nlmsghdr& message, const std::function<void(const rtattr&)>& visit) {
  auto left = static_cast<unsigned int>(RTM_PAYLOAD(&message));
  auto* value = RTM_RTA(static_cast<rtmsg*>(NLMSG_DATA(const_cast<nlmsghdr*>(&message))));
  for (; RTA_OK(value, left); value = RTA_NEXT(value, left)) visit(*value);
}

std::uint32_t NumberIn(const rtattr& attribute) {
  std::uint32_t number = 0;
  std::memcpy(&number, RTA_DATA(&attribute), std::min(sizeof number, RTA_PAYLOAD(&attribute)));
  return number;
}

const rtmsg& RouteIn(const nlmsghdr& message) {
  return *static_cast<const rtmsg*>(NLMSG_DATA(const_cast<nlmsghdr*>(&message)));
}

// Whether a route is one that somebody has given an interface.
bool IsGiven(const nlmsghdr& message, unsigned interface) {
  if (message.nlmsg_type != RTM_NEWROUTE || RouteIn(message).rtm_protocol == RTPROT_KERNEL) return false;
  unsigned through = 0;
  ForEachOf(message, [&](const rtattr& attribute) {
    if (attribute.rta_type == RTA_OIF) through = NumberIn(attribute);
  });
  return through == interface;
}

struct WayOut {
  in_addr gateway{};
  std::uint32_t metric = 0;  // the kernel does not tell 0
};

WayOut WayOutOf(const nlmsghdr& message) {
  WayOut way;
  ForEachOf(message, [&](const rtattr& attribute) {
    if (attribute.rta_type == RTA_GATEWAY) way.gateway.s_addr = NumberIn(attribute);
    if (attribute.rta_type == RTA_PRIORITY) way.metric = NumberIn(attribute);
  });
  return way;
}

// The message that adds a route which the kernel has told of.
std::string Addition(const nlmsghdr& told) {
  std::string message(reinterpret_cast<const char*>(&told), told.nlmsg_len);
  auto* header = reinterpret_cast<nlmsghdr*>(message.data());
  header->nlmsg_flags = NLM_F_REQUEST | NLM_F_ACK | NLM_F_CREATE | NLM_F_EXCL;
  auto* route = static_cast<rtmsg*>(NLMSG_DATA(header));
  route->rtm_flags &= RTNH_F_ONLINK;  // the others tell how it is, and not what it is
  return message;
}

}  // namespace

Routes Routes::Of(const std::string& interface) {
  Routes routes;
  const unsigned index = ::if_nametoindex(interface.c_str());
  (void)Routing().Ask(AllRoutes(), [&](const nlmsghdr& told) {
    if (index != 0 && IsGiven(told, index)) routes.messages_.push_back(Addition(told));
  });
  return routes;
}

bool Routes::PutBack() const {
  const Routing routing;
  bool all = true;
  for (const std::string& message : messages_) {
    const int error = routing.Ask(message, [](const nlmsghdr&) {});
    all = all && (error == 0 || error == EEXIST);
  }
  return all;
}

std::string GatewayOf(const std::string& interface) {
  const unsigned index = ::if_nametoindex(interface.c_str());
  std::optional<WayOut> first;
  (void)Routing().Ask(AllRoutes(), [&](const nlmsghdr& told) {
    if (index == 0 || !IsGiven(told, index) || RouteIn(told).rtm_dst_len != 0) return;
    const WayOut way = WayOutOf(told);
    if (way.gateway.s_addr != 0 && (!first || way.metric < first->metric)) first = way;
  });
  char szGateway[INET_ADDRSTRLEN] = "";
  if (first) ::inet_ntop(AF_INET, &first->gateway, szGateway, sizeof szGateway);
  return szGateway;
}
