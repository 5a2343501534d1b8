# A thousand losses of power, in the middle of all that writes settings, leave each file whole, on ext4 and on f2fs.
# Plain only
# On request
# Limit: 1750 s
# shellcheck shell=bash

access_point cafe ssid=cafe channel=1
appliance nas
inside nas tee /etc/resolv.conf >/dev/null <<<'nameserver 192.0.2.53'
inside nas mkdir -p /etc.defaults
inside nas tee /etc.defaults/meroinfo.conf >/dev/null <<<'support_pci_wifi="yes"'
plug_in nas
guests=(guest_net_enable=1 guest_net_ssid=visitors guest_net_encryption=2 guest_net_wpa_passphrase='come on in'
  guest_net_wpa=2 guest_net_wpa_encrypt_type=2)
for kind in ext4 f2fs; do
  settings_on nas $kind
  records_settings nas
  recorded nas mero-call connect essid=cafe bssid="$(address_of cafe)" auth=OPEN encrypt=NONE
  recorded nas mero-call disconnect
  records_access_point nas
  recorded nas mero-call ap-save ssid='home again' "${guests[@]}"
  recorded nas mero-call ap-enable
  recorded nas merowireless radio off
  recorded nas merowireless radio on
  recorded nas mero-call mode client
  recorded nas mero-call mode ap
  recorded nas merowireless ap set --channel 11
  recorded nas merowireless ap enable
  recorded nas merowireless ap disable
  recorded nas mero-call save essid=last bssid=02:00:00:00:00:03 auth=OPEN encrypt=NONE ip=DHCP
  loses_power_anywhere nas 2 2 3
done
