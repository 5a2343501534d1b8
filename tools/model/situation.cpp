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

// The driver looks for others of its cell for some seconds before it begins one, and is in no network meanwhile.
bool IsInSearchOfItsCell() {
  WIRELESS_INFO info{};
  if (MEROWirelessCurInfoGet(REQUEST_MODE, &info) != 0 || info.opmode != WIRELESS_OPMODE_ADHOC) return false;
  return MEROWirelessCurInfoGet(REQUEST_ESSID, &info) == 0 && info.szEssid[0] != '\0';
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
  if (status.state == WIRELESS_STATUS_DISCONNECTED && IsInSearchOfItsCell()) return Situation::kCell;
  return IsLeftAlone() ? Situation::kLeftAlone : Situation::kFree;
}
