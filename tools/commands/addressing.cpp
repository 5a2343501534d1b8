// The commands about the interface's address and gateway.
#include "commands/addressing.h"

#include "base/text.h"
#include "model/ap_state.h"
#include "model/join_lock.h"
#include "model/network_extras.h"
#include "model/status.h"

namespace {

// In the bridge of an access point, an address of the interface's own would only keep the bridge from being reached.
void RequireClient() {
  const ApState state = ReadApState();
  if (state == ApState::kOff) return;
  const std::string is = state == ApState::kSettingUp ? "is about to be" : "is";
  throw Failure(Exit::kBusy, "the adapter " + is + " an access point, whose addresses are its bridge's",
                "the bridge's network-script file has them");
}

}  // namespace

void SetAddress(const Program& program, const Addressing& addressing) {
  if (IsWord(addressing.ip, "none"))
    throw Wrong("none is no address", "`merowireless disconnect` takes the address away");
  KnownNetwork config{};
  SetAddressing(config, addressing);
  RequireAdapter();
  const JoinLock lock(JoinLockFor::kAddressing);
  RequireClient();
  ApplyAddress(SettingAddress(program, config), config);
  if (const auto known = FindCalled(ReadStatus().name)) ApplyNameServers(*known);
  const Status status = ReadStatus();
  program.output.Done("the address is " + (status.ip.empty() ? "not known yet" : status.ip), "status", StatusFields(),
                      status);
}

void SetGateway(const Program& program, const std::string& gateway) {
  RequireGateway(gateway);
  RequireAdapter();
  const JoinLock lock(JoinLockFor::kAddressing);
  RequireClient();
  ApplyGateway(gateway);
  program.output.Done("the gateway is " + gateway);
}
