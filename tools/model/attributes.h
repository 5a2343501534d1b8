// What stands in a message of the wireless stack.
#ifndef MERO_TOOLS_ATTRIBUTES_H
#define MERO_TOOLS_ATTRIBUTES_H

#include <netlink/genl/genl.h>

#include <cstring>
#include <optional>
#include <string>

// The attribute of a kind, which lies within the message; null when there is none.
inline nlattr* AttributeOf(std::string& message, int kind) {
  auto* header = reinterpret_cast<nlmsghdr*>(message.data());
  if (!genlmsg_valid_hdr(header, 0)) return nullptr;
  const auto* general = static_cast<const genlmsghdr*>(nlmsg_data(header));
  return nla_find(genlmsg_attrdata(general, 0), genlmsg_attrlen(general, 0), kind);
}

// The attributes within another, by their kind; none where there is no such.
template <int kLast>
struct Nest {
  explicit Nest(const nlattr* outer) {
    if (outer != nullptr) (void)nla_parse_nested(parts, kLast, const_cast<nlattr*>(outer), nullptr);
  }

  // As a number of so many bits, or a record; nothing when it is missing or shorter.
  template <class Number>
  std::optional<Number> As(int kind) const {
    Number number;
    if (parts[kind] == nullptr || nla_len(parts[kind]) < static_cast<int>(sizeof number)) return std::nullopt;
    std::memcpy(&number, nla_data(parts[kind]), sizeof number);
    return number;
  }

  nlattr* parts[kLast + 1] = {};
};

#endif  // MERO_TOOLS_ATTRIBUTES_H
