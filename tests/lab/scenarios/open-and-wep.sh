# Open networks are joined, and those with WEP, whichever of the four forms their key has.
# Limit: 400 s
# shellcheck shell=bash
# shellcheck disable=SC2016  # nothing in a name or a key is to be expanded

access_point square ssid=square channel=1
# WEP: the appliance always proves itself with the key.
wep_point() {  # NAME KEY
  access_point "$1" ssid="$1" channel=6 auth_algs=2 wep_default_key=0 wep_key0="$2"
}
wep_point five      '"t&r$e"'
wep_point thirteen  '"deux croiss.."'
wep_point ten       0badc0ffee
wep_point twentysix 00112233445566778899aabbcc
serve square 10.1.0
serve five 10.2.0
serve thirteen 10.3.0
serve ten 10.4.0
serve twentysix 10.5.0
appliance nas

# joins_and_talks ACCESS-POINT PREFIX KEY=VALUE...
joins_and_talks() {
  say "-- $1"
  joins nas "$1" essid="$1" bssid="$(address_of "$1")" "${@:3}"
  on nas mero-call ifconfig wlan0 ip="$2.5" mask=255.255.255.0
  expect_output <<<result=0
  expect_reachable nas "$2.1"
  leaves nas
}

joins_and_talks square    10.1.0 auth=OPEN    encrypt=NONE
joins_and_talks five      10.2.0 auth=SHARED  encrypt=WEP key='t&r$e'
joins_and_talks thirteen  10.3.0 auth=SHARED  encrypt=WEP key='deux croiss..'
joins_and_talks ten       10.4.0 auth=WEPAUTO encrypt=WEP key=0badc0ffee
joins_and_talks twentysix 10.5.0 auth=OPEN    encrypt=WEP key=00112233445566778899aabbcc

say '-- a key of no form'
refused nas essid=five bssid="$(address_of five)" auth=SHARED encrypt=WEP key=sixsix
# The program does not try it.
through_functions && expect_message nas 'Wrong WEP Format.'
expect_nothing_left nas
