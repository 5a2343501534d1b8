# Wherever the power goes, each settings file is whole, on ext4 and on f2fs, and what a call has saved before is there.
# Plain only
# Limit: 600 s
# shellcheck shell=bash

appliance nas
inside nas tee /etc/resolv.conf >/dev/null <<<'nameserver 192.0.2.53'
plug_in nas
for kind in ext4 f2fs; do
  settings_on nas $kind
  records_settings nas
  records_access_point nas
  loses_power_anywhere nas 16 1 1
done
