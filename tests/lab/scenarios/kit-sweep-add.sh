# Whichever command fails when an adapter is announced: the access point as it was, and it says why.
# Limit: 600 s
# Plain only
# shellcheck shell=bash

appliance nas
swept_access_point nas
sweep nas add
expect_swept 7
