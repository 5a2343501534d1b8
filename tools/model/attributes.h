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

// What an attribute holds, as a number of so many bits or a record; nothing when it is missing or shorter.
template <class Value>
std::optional<Value> ValueIn(const nlattr* attribute) {
  Value value;
  if (attribute == nullptr || nla_len(attribute) < static_cast<int>(sizeof value)) return std::nullopt;
  std::memcpy(&value, nla_data(attribute), sizeof value);
  return value;
}

// The attributes within another, by their kind; none where there is no such.
template <int kLast>
struct Nest {
  explicit Nest(const nlattr* outer) {
    if (outer != nullptr) (void)nla_parse_nested(parts, kLast, const_cast<nlattr*>(outer), nullptr);
  }

  template <class Value>
  std::optional<Value> As(int kind) const {
    return ValueIn<Value>(parts[kind]);
  }

  nlattr* parts[kLast + 1] = {};
};

#endif  // MERO_TOOLS_ATTRIBUTES_H
