#!/bin/sh
# truth_test.sh
#
# The lab's comparison of what the program says with what is so finds each lie, and nothing in readings that are true:
# some that an appliance gave, connected and on the air, are doctored one at a time.
set -eu
lab=$(dirname "$(realpath "$0")")
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

compare() { # FILE; leaves what it prints in `said`, and its status in `status`
	status=0
	said=$(awk -f "$lab/lib/truth.awk" "$1") || status=$?
}

# The sed script doctors the readings; these are the differences then, by what they are about.
finds() { # READINGS STATUS DIFFERENCES SED-SCRIPT
	sed "$4" "$lab/../data/lab/$1" >"$work/readings"
	cmp -s "$work/readings" "$lab/../data/lab/$1" && [ "$4" ] && echo "$4 changes nothing" && exit 1
	compare "$work/readings"
	about=$(printf '%s\n' "$said" | sed 's/^\([^:]*\): the program says that "\([a-z_]*\)".*/\1.\2/' | LC_ALL=C sort -u | xargs)
	[ "$status,$about" = "$2,$3" ] && return
	printf '%s, with %s:\nstatus %s, expected %s\n%s\nexpected\n%s\n' "$1" "$4" "$status" "$2" "$said" "$3"
	exit 1
}

finds connected 0 '' ''
finds on-air 0 '' ''

# What the program says of the connection.
finds connected 1 status.state 's/"state":"connected"/"state":"disconnected"/'
finds connected 1 status.name 's/\("status":{.*"name":\)"[a-z]*"/\1"office"/'
finds connected 1 status.auth '/"status":/s/"auth":"[A-Z0-9]*"/"auth":"OPEN"/'
finds connected 1 status.mode '/"status":/s/"MANAGED"/"ADHOC"/'
finds connected 1 status.interface 's/"interface":"wlan0","ip"/"interface":"wlan1","ip"/'
finds connected 1 status.ip 's/"ip":"10[0-9.]*"/"ip":"10.1.0.99"/'
finds connected 1 status.ip 's/"ip":"10[0-9.]*"/"ip":null/'
finds connected 1 status.mask 's/"mask":"255.255.255.0"/"mask":"255.255.0.0"/'
finds connected 1 status.access_point 's/"access_point":"[0-9A-F:]*"/"access_point":"02:00:00:00:09:00"/'
finds connected 1 status.signal_dbm 's/"signal_dbm":-[0-9]*/"signal_dbm":-99/'
finds connected 1 status.channel '/"status":/s/"channel":[0-9]*/"channel":13/'
finds connected 1 status.rate_kbps 's/"rate_kbps":[0-9]*/"rate_kbps":65000/'
finds connected 1 status.gateway '/"status":/s/"gateway":"[0-9.]*"/"gateway":null/'
finds connected 1 status.name_servers 's/"name_servers":"[0-9.]*"/"name_servers":"192.0.2.1"/'
finds connected 1 status.radio 's/\("status":.*"radio":\)"on"/\1"off"/'
finds connected 1 status.state 's/^wpa_state=.*/wpa_state=4WAY_HANDSHAKE/'
finds connected 1 status.name 's/^ssid=.*/ssid=office/'
finds on-air 1 status.state 's/"state":"access-point"/"state":"disconnected"/'

# Of the access point.
finds connected 1 access-point.state 's/"state":"off"/"state":"on-air"/'
finds on-air 1 access-point.state 's/"state":"on-air"/"state":"off"/'
finds on-air 1 access-point.enabled 's/"enabled":true/"enabled":false/'
finds on-air 1 access-point.name 's/"name":"office"/"name":"bureau"/'
finds on-air 1 access-point.air_name 's/"air_name":"office"/"air_name":"bureau"/'
finds on-air 1 access-point.channel 's/"channel":11/"channel":6/'
finds on-air 1 access-point.megahertz 's/"megahertz":2462/"megahertz":2437/'
finds on-air 1 access-point.stations 's/"stations":1/"stations":2/'
finds on-air 1 access-point.stations '/^Station/d'
finds on-air 1 access-point.pending 's/\tchannel=11/\tchannel=6/'
finds on-air 1 access-point.state '/ssid office/d; s/^state=ENABLED/state=DFS/'

# Of the radio and the known networks.
finds connected 1 'radio.kernel_block radio.radio status.radio' 's/^0 0$/1 0/'
finds on-air 1 'radio.radio status.radio' 's/unblock=yes/unblock=no/'
finds connected 1 radio.adapter 's/"adapter":"[a-z0-9_]*"/"adapter":"ExampleStick"/'
finds connected 1 'known: park is saved, and the program does not list it known: the program lists office, which is not saved' \
	's/"name":"park"/"name":"office"/'

# What has changed in the meantime says nothing of the program.
finds connected 2 '' '1,/^== after/s/10\.1\.0\./10.1.9./'
finds on-air 2 '' '1,/^== after/{/^Station/d;}'
