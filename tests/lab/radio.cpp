// lab-radio: makes and removes simulated radios while the machine runs, as adapters are plugged in and pulled.
//
//   lab-radio plug NAME ADDRESS   makes a radio of that name, with an interface that has this hardware address
//   lab-radio make NAME           makes one without an interface, which nothing on the machine takes for its adapter
//   lab-radio pull NAME           removes one
//
// Exits with 1, and says why, when the kernel does not do it.
#include <net/if_arp.h>
#include <netinet/ether.h>
#include <netlink/genl/ctrl.h>
#include <netlink/genl/genl.h>
#include <netlink/netlink.h>

#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string_view>

namespace {

// What the simulation's driver understands; no header of the system has it.
constexpr char kFamily[] = "MAC80211_HWSIM";
enum Command : uint8_t { kNewRadio = 4, kDelRadio = 5 };
enum Attribute : int { kChannels = 9, kCustomRules = 12, kRadioName = 17, kNoInterface = 18, kPermanentAddress = 22 };

// As the lab's other radios are: two channels at a time, and rules that let a scan ask on every channel.
constexpr uint32_t kChannelsAtATime = 2;
constexpr uint32_t kRules = 0;

using Socket = std::unique_ptr<nl_sock, decltype(&nl_socket_free)>;
using Message = std::unique_ptr<nl_msg, decltype(&nlmsg_free)>;

class Request {
 public:
  Request(int family, Command command, const char* radio) : message_(nlmsg_alloc(), nlmsg_free) {
    genlmsg_put(message_.get(), NL_AUTO_PORT, NL_AUTO_SEQ, family, 0, 0, command, 1);
    nla_put_string(message_.get(), kRadioName, radio);
  }

  void DescribeRadio() {
    nla_put_u32(message_.get(), kChannels, kChannelsAtATime);
    nla_put_u32(message_.get(), kCustomRules, kRules);
  }

  void LeaveOutInterface() { nla_put_flag(message_.get(), kNoInterface); }
  void GiveAddress(const ether_addr& address) { nla_put(message_.get(), kPermanentAddress, sizeof(address), &address); }

  // False, with the reason in errno, unless the kernel does it.
  bool IsDone(nl_sock* socket) {
    int answer = -EIO;
    nl_socket_modify_cb(socket, NL_CB_ACK, NL_CB_CUSTOM, TakeDone, &answer);
    nl_socket_modify_err_cb(socket, NL_CB_CUSTOM, TakeAnswer, &answer);
    if (nl_send_auto(socket, message_.get()) >= 0) nl_recvmsgs_default(socket);
    errno = answer < 0 ? -answer : 0;
    return answer >= 0;
  }

 private:
  // What is wrong is negative. A new radio's number, which is not, comes as an error too.
  static int TakeAnswer(sockaddr_nl*, nlmsgerr* answer, void* taken) {
    *static_cast<int*>(taken) = answer->error;
    return NL_STOP;
  }

  static int TakeDone(nl_msg*, void* taken) {
    *static_cast<int*>(taken) = 0;
    return NL_STOP;
  }

  Message message_;
};

int Fail(const char* reason) {
  std::fprintf(stderr, "lab-radio: %s\n", reason);
  return 1;
}

}  // namespace

int main(int count, char** words) {
  const std::string_view action = count > 1 ? words[1] : "";
  const ether_addr* address = action == "plug" && count == 4 ? ether_aton(words[3]) : nullptr;
  if (address == nullptr && !(count == 3 && (action == "make" || action == "pull"))) {
    std::fputs("usage: lab-radio plug NAME ADDRESS | make NAME | pull NAME\n", stderr);
    return 2;
  }

  const Socket socket(nl_socket_alloc(), nl_socket_free);
  if (const int error = genl_connect(socket.get()); error < 0) return Fail(nl_geterror(error));
  const int family = genl_ctrl_resolve(socket.get(), kFamily);
  if (family < 0) return Fail(nl_geterror(family));

  Request request(family, action == "pull" ? kDelRadio : kNewRadio, words[2]);
  if (action != "pull") request.DescribeRadio();
  if (action == "make") request.LeaveOutInterface();
  if (address != nullptr) request.GiveAddress(*address);
  return request.IsDone(socket.get()) ? 0 : Fail(std::strerror(errno));
}
