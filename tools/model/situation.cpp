// Whether the adapter may be made to join a network.
#include "model/situation.h"

#include "model/ap_files.h"
#include "model/ap_state.h"
#include "model/left_alone.h"
#include "platform.h"

namespace {

// The access point may be on its way.
bool IsSwitchedOn() {
  return ApSwitchOf(MEROWirelessAPInterfaceGet()) == ApSwitch::kOn;
}

}  // namespace

bool IsForAccessPoint() {
  return IsSwitchedOn() || IsAccessPoints();
}

Situation SituationOf(const Status& status) {
  if (MEROWirelessAdapterNum() <= 0) return Situation::kNoAdapter;
  if (IsForAccessPoint()) return Situation::kAccessPoint;
  if (status.isLetIn) return Situation::kConnected;
  if (status.radio == RadioState::kOff) return Situation::kRadioOff;
  if (status.radio == RadioState::kUnknown) return Situation::kUnannounced;
  const bool isFree =
      status.isConnected() || status.state == WIRELESS_STATUS_DOWN || status.state == WIRELESS_STATUS_DISCONNECTED;
  if (!isFree) return Situation::kUntold;
  return IsLeftAlone() ? Situation::kLeftAlone : Situation::kFree;
}
