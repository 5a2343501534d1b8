// Network interfaces, asked and told through ioctls; their addresses, through the kernel's routing socket.
#include "platform/base/interface.h"

#include <linux/rtnetlink.h>
#include <netinet/in.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <algorithm>
#include <bit>

#include "platform/base/bytes.h"

bool IsInterfaceName(std::string_view name) {
  if (name.empty() || name.size() >= IFNAMSIZ || name == "." || name == "..") return false;
  return All(name, [](char c) { return c != '/' && c != ':' && !IsSpace(c); });
}

Result<Descriptor> OpenControl() {
  Descriptor control(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!control.valid()) return Status::Failed(errno);
  return control;
}

Status SetInterfaceUp(const char* szIfName, bool up) {
  Result<Descriptor> control = OpenControl();
  if (!control.ok()) return control.status();
  Result<ifreq> request = RequestFor<ifreq>(szIfName);
  if (!request.ok()) return request.status();

  if (::ioctl(control->get(), SIOCGIFFLAGS, &*request) < 0) return Status::Failed(errno);
  const int flags = up ? request->ifr_flags | IFF_UP : request->ifr_flags & ~IFF_UP;
  request->ifr_flags = static_cast<short>(flags);
  return Status::Of(::ioctl(control->get(), SIOCSIFFLAGS, &*request));
}

namespace {

constexpr struct {
  nlmsghdr header;
  ifaddrmsg about;
} kListAll = {{sizeof kListAll, RTM_GETADDR, NLM_F_REQUEST | NLM_F_DUMP, 0, 0}, {AF_INET, 0, 0, 0, 0}};

// Walks the messages that stand one behind another.
class Messages {
 public:
  Messages(char* at, size_t left) : at_(at), left_(left) {}

  // The next message; null when there is no more, or the rest is not a whole one.
  nlmsghdr* Next() {
    auto* message = reinterpret_cast<nlmsghdr*>(at_);
    if (left_ < sizeof *message || message->nlmsg_len < sizeof *message || message->nlmsg_len > left_) return nullptr;
    const size_t size = std::min<size_t>(NLMSG_ALIGN(message->nlmsg_len), left_);
    at_ += size;
    left_ -= size;
    return message;
  }

 private:
  char* at_;
  size_t left_;
};

// The IPv4 addresses of one interface, read and changed through the kernel's routing socket.
class Addresses {
 public:
  // Reads those that the interface has. An interface that is not there has none.
  Status List(const char* szIfName) {
    index_ = ::if_nametoindex(szIfName);
    if (index_ == 0 && errno != ENODEV && errno != ENXIO) return Status::Failed(errno);
    kernel_ = Descriptor(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_ROUTE));
    if (!kernel_.valid()) return Status::Failed(errno);
    if (::send(kernel_.get(), &kListAll, sizeof kListAll, 0) < 0) return Status::Failed(errno);
    while (true) {
      alignas(nlmsghdr) char part[8192];  // the kernel gives no more at a time
      const ssize_t size = ::recv(kernel_.get(), part, sizeof part, 0);
      if (size < 0) return Status::Failed(errno);
      Messages messages(part, static_cast<size_t>(size));
      while (nlmsghdr* message = messages.Next()) {
        const void* content = NLMSG_DATA(message);
        // The message that ends the list begins with an errno, as does one that tells of a failure; at the end it is 0.
        if (message->nlmsg_type != RTM_NEWADDR) {
          const int error = -*static_cast<const int*>(content);
          return error != 0 ? Status::Failed(error) : found_.status();
        }
        if (static_cast<const ifaddrmsg*>(content)->ifa_index != index_) continue;
        found_.Append({reinterpret_cast<char*>(message), message->nlmsg_len});
      }
    }
  }

  unsigned index() const { return index_; }

  // Calls `visit(message)` for each address that was read, until a call fails.
  template <class Visit>
  Status ForEach(Visit visit) {
    Messages messages(found_.data(), found_.view().size());
    while (nlmsghdr* message = messages.Next()) {
      if (Status status = visit(*message); !status.ok()) return status;
    }
    return Status::Ok();
  }

  // Adds the address of a message.
  Status Add(nlmsghdr& message) { return Tell(message, RTM_NEWADDR, NLM_F_CREATE | NLM_F_REPLACE); }

  // Removes the address of a message. It may be gone already: with some addresses the kernel removes others.
  Status Remove(nlmsghdr& message) {
    const Status status = Tell(message, RTM_DELADDR, 0);
    return status.error() == EADDRNOTAVAIL ? Status::Ok() : status;
  }

 private:
  Status Tell(nlmsghdr& message, uint16_t type, uint16_t flags) {
    message.nlmsg_type = type;
    message.nlmsg_flags = static_cast<uint16_t>(NLM_F_REQUEST | NLM_F_ACK | flags);
    struct {
      nlmsghdr header;
      nlmsgerr result;
    } answer;
    if (::send(kernel_.get(), &message, message.nlmsg_len, 0) < 0) return Status::Failed(errno);
    if (::recv(kernel_.get(), &answer, sizeof answer, 0) < 0) return Status::Failed(errno);
    return Status::Failed(-answer.result.error);
  }

  Descriptor kernel_;
  Bytes found_;  // the kernel's own messages, by which an address can be added again with all that it had
  unsigned index_ = 0;
};

struct AddressPart {
  rtattr header;
  in_addr_t value;
};

// A message about an address of an interface. A broadcast address of 0 is none.
struct AddressMessage {
  nlmsghdr header;
  ifaddrmsg about;
  AddressPart local;
  AddressPart subnet;  // by which the kernel tells one address with two masks apart
  AddressPart broadcast;
};

AddressPart Part(unsigned short type, uint32_t address) {
  return {{RTA_LENGTH(sizeof address), type}, htonl(address)};
}

// Whether a message that the kernel has sent is about just that address, under the interface's own name.
bool Same(const nlmsghdr& found, const AddressMessage& wanted, const char* szIfName) {
  const auto& about = *static_cast<const ifaddrmsg*>(NLMSG_DATA(&found));
  in_addr_t values[IFA_BROADCAST + 1] = {};
  auto left = static_cast<int>(IFA_PAYLOAD(&found));
  for (auto* part = IFA_RTA(&about); RTA_OK(part, left); part = RTA_NEXT(part, left)) {
    const void* value = RTA_DATA(part);
    if (part->rta_type == IFA_LABEL && std::strcmp(static_cast<const char*>(value), szIfName) != 0) return false;
    if (part->rta_type <= IFA_BROADCAST) std::memcpy(&values[part->rta_type], value, sizeof values[0]);
  }
  return about.ifa_prefixlen == wanted.about.ifa_prefixlen && values[IFA_ADDRESS] == wanted.subnet.value &&
         values[IFA_LOCAL] == wanted.local.value && values[IFA_BROADCAST] == wanted.broadcast.value;
}

}  // namespace

Status RemoveAddresses(const char* szIfName) {
  Addresses addresses;
  if (Status status = addresses.List(szIfName); !status.ok()) return status;
  return addresses.ForEach([&](nlmsghdr& found) { return addresses.Remove(found); });
}

Status SetOnlyAddress(const char* szIfName, uint32_t address, uint32_t mask) {
  Addresses addresses;
  if (Status status = addresses.List(szIfName); !status.ok()) return status;

  AddressMessage wanted{};
  wanted.header.nlmsg_len = sizeof wanted;
  wanted.about.ifa_family = AF_INET;
  wanted.about.ifa_prefixlen = static_cast<uint8_t>(std::countl_one(mask));
  wanted.about.ifa_index = addresses.index();
  wanted.local = Part(IFA_LOCAL, address);
  wanted.subnet = Part(IFA_ADDRESS, address);
  wanted.broadcast = Part(IFA_BROADCAST, ~mask > 1 ? address | ~mask : 0);  // a subnet of one or two addresses has none

  // The wanted address is added first, since the kernel may refuse it; and again after the others have been removed,
  // since it may have been removed with them.
  if (Status status = addresses.Add(wanted.header); !status.ok()) return status;
  Status status = addresses.ForEach(
      [&](nlmsghdr& found) { return Same(found, wanted, szIfName) ? Status::Ok() : addresses.Remove(found); });
  if (status.ok()) status = addresses.Add(wanted.header);
  if (!status.ok()) {
    (void)addresses.Remove(wanted.header);
    (void)addresses.ForEach([&](nlmsghdr& found) { return (void)addresses.Add(found), Status::Ok(); });
  }
  return status;
}
