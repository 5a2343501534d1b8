# Whichever call of ip, iw, nft or a daemon fails when an access point is ended: off with nothing left, and it says why.
# Limit: 600 s
# Plain only
# shellcheck shell=bash

appliance nas
swept_access_point nas
sweep nas restart
expect_swept 6
