// Questions to the kernel's wireless stack, which the listing tool and the management program have, and one request.
// Nothing here waits for the radio, and but for that request nothing changes anything.
#ifndef MERO_COMMON_NL80211_H
#define MERO_COMMON_NL80211_H

#include <linux/nl80211.h>
#include <netlink/genl/ctrl.h>
#include <netlink/genl/genl.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <new>
#include <string>
#include <string_view>
#include <vector>

namespace nl80211 {

template <auto Free>
struct Releaser {
  void operator()(auto* resource) const { Free(resource); }
};
using Socket = std::unique_ptr<nl_sock, Releaser<nl_socket_free>>;
using Message = std::unique_ptr<nl_msg, Releaser<nlmsg_free>>;
using Callbacks = std::unique_ptr<nl_cb, Releaser<nl_cb_put>>;

struct Question {
  nl80211_commands command;
  bool dump;                      // asks for all that there is of a kind
  unsigned interface;             // 0 for what concerns none
  std::string_view country = {};  // whose rules are asked for: two letters
};

struct Answer {
  std::vector<std::string> messages = {};  // each a whole netlink message
  int error = 0;                           // the driver's, an errno; ENODEV too where no radio has ever been
  int failure = 0;                         // of the exchange itself, as libnl numbers them: below 0

  bool saysNotWireless() const { return error == ENODEV || error == EOPNOTSUPP; }
  const char* reason() const { return error != 0 ? std::strerror(error) : nl_geterror(failure); }
};

inline int OnMessage(nl_msg* message, void* answer) {
  const nlmsghdr* header = nlmsg_hdr(message);
  static_cast<Answer*>(answer)->messages.emplace_back(reinterpret_cast<const char*>(header), header->nlmsg_len);
  return NL_OK;
}

// Only the last message tells whether the driver broke a listing off.
inline int OnFinish(nl_msg* message, void* answer) {
  const nlmsghdr* header = nlmsg_hdr(message);
  int status = 0;
  if (nlmsg_datalen(header) >= static_cast<int>(sizeof(status))) {
    std::memcpy(&status, nlmsg_data(header), sizeof(status));
  }
  static_cast<Answer*>(answer)->error = -status;
  return NL_OK;
}

inline int OnError(sockaddr_nl*, nlmsgerr* error, void* answer) {
  static_cast<Answer*>(answer)->error = -error->error;
  return NL_STOP;
}

inline Message Request(int family, const Question& question) {
  Message message(nlmsg_alloc());
  if (!message) throw std::bad_alloc();
  if (genlmsg_put(message.get(), NL_AUTO_PORT, NL_AUTO_SEQ, family, 0, question.dump ? NLM_F_DUMP : 0, question.command,
                  0) == nullptr ||
      (question.interface != 0 && nla_put_u32(message.get(), NL80211_ATTR_IFINDEX, question.interface) < 0) ||
      (!question.country.empty() &&
       nla_put_string(message.get(), NL80211_ATTR_REG_ALPHA2, std::string(question.country).c_str()) < 0)) {
    throw std::bad_alloc();
  }
  // What a radio can do does not fit one message, and older kernels cut it unless they are asked for several.
  if (question.command == NL80211_CMD_GET_WIPHY && nla_put_flag(message.get(), NL80211_ATTR_SPLIT_WIPHY_DUMP) < 0) {
    throw std::bad_alloc();
  }
  return message;
}

inline Answer AskOnce(nl_sock* socket, int family, const Question& question) {
  Answer answer;
  const Message request = Request(family, question);
  const Callbacks callbacks(nl_cb_alloc(NL_CB_DEFAULT));
  if (!callbacks) throw std::bad_alloc();
  nl_cb_set(callbacks.get(), NL_CB_VALID, NL_CB_CUSTOM, OnMessage, &answer);
  nl_cb_set(callbacks.get(), NL_CB_FINISH, NL_CB_CUSTOM, OnFinish, &answer);
  nl_cb_err(callbacks.get(), NL_CB_CUSTOM, OnError, &answer);

  answer.failure = nl_send_auto(socket, request.get());
  if (answer.failure >= 0) answer.failure = nl_recvmsgs(socket, callbacks.get());
  return answer;
}

inline Answer Ask(const Question& question) {
  const Socket socket(nl_socket_alloc());
  if (!socket) throw std::bad_alloc();
  if (const int failure = genl_connect(socket.get()); failure < 0) return {.failure = failure};
  const int family = genl_ctrl_resolve(socket.get(), NL80211_GENL_NAME);
  // A kernel that has never seen a radio need not know nl80211.
  if (family == -NLE_OBJ_NOTFOUND) return {.error = ENODEV};
  if (family < 0) return {.failure = family};

  // The radio may hear something while the driver answers. Then the answer may lack an entry or tell one twice, and is
  // worth asking for again; not for ever, since a busy band never rests.
  constexpr int kMostReadings = 5;
  Answer answer;
  for (int reading = 0; reading < kMostReadings; ++reading) {
    answer = AskOnce(socket.get(), family, question);
    if (answer.failure != -NLE_DUMP_INTR) return answer;
  }
  answer.failure = 0;
  return answer;
}

}  // namespace nl80211

#endif  // MERO_COMMON_NL80211_H
