# Sweeps over the kit: each call of a program of the network fails once, one at a time, and so does each command of a batch
# of ip. Everything happens within the appliance, by guest/sweep: a call from outside takes longer than a start.
# shellcheck shell=bash

SWEPT=0

# swept_access_point NAME: an appliance that translates addresses and has guests, whose rules are not the usual ones, on
# the air; what it looks like then is what sweeps expect.
swept_access_point() {
  inside "$1" mkdir -p /etc.defaults
  inside "$1" tee /etc.defaults/meroinfo.conf >/dev/null <<<'support_pci_wifi="yes"'
  plug_in "$1"
  serves "$1" ssid=home encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 channel=6 \
    ieee80211n_wireless_width=1 \
    guest_net_enable=1 guest_net_ssid=visitors guest_net_encryption=2 guest_net_wpa_passphrase='come on in' \
    guest_net_wpa=2 guest_net_wpa_encrypt_type=2 \
    guest_net_lan_block=1 guest_net_access_ds=1 guest_net_internet_block=1 guest_net_allow_http=0
  inside "$1" mkdir /run/sweep
  inside "$1" tee /run/sweep/sweep <"$LAB/guest/sweep" >/dev/null
  inside "$1" bash /run/sweep/sweep prepare
}

# sweep NAME WAY: sweeps over what guest/sweep calls so; the appliance has to be whole, or off, after each failure.
sweep() {
  local result
  result=$(inside "$1" bash /run/sweep/sweep "$2") || fail "the sweep over $2:
$result"
  say "$2: $result"
  SWEPT=$((SWEPT + ${result%% *}))
}

# expect_swept COUNT: so many calls, or more, have failed by now.
expect_swept() {
  say "$SWEPT calls failed in all"
  ((SWEPT >= $1)) || fail "only $SWEPT calls failed, of $1 at least"
}
