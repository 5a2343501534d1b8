# A supplicant over nl80211 joins the access point, on its main network and on that for guests; of one that cannot join it is
# told how far it came, or what it said itself.
# Plain only
# On request
# shellcheck shell=bash

LAB_PLAN='ROLES=clients BANDS=2.4 NETWORKS="main guests" PROTECTIONS=wpa2 CLIENTS=bare POINTS="" OURS=merowireless PATIENCE=4'
# shellcheck source=tests/lab/joins/joins.sh
. "$LAB/joins/joins.sh"

say '-- with a secret that is wrong'
role=client band=2.4 protection=wpa2 peer=bare network=main
put_up_ours
secret() { printf 'none of theirs'; }
client_of_ours "$MAIN" wlan0 10.1.14.
known_limit() { printf 'Successfully init'; }
client_of_ours "$MAIN" wlan0 10.1.14.

# What came of each, without the time.
outcomes() {
  awk -F '\t' -v OFS=' ' '{ print $1, $2, $3, $4, $5, $6, ($7 ~ /^[0-9]+$/ ? "in time" : $8) }' "$CELLS"
}

expect_same 'who has joined' "\
client bare wpa2 2.4 main joined in time
client bare wpa2 2.4 guests joined in time
client bare wpa2 2.4 main failed no further than: watching
client bare wpa2 2.4 main refused Successfully initialized wpa_supplicant" "$(outcomes)"
