# Whichever call of ip, iw, nft or a daemon fails in a start: on the air with every rule, or off, and it says why.
# Limit: 600 s
# Plain only
# shellcheck shell=bash

appliance nas
swept_access_point nas
sweep nas start
expect_swept 15
