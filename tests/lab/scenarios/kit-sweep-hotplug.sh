# Whichever command of the hot-plug script fails: an access point or a client, as it was or as asked, and it says why.
# Limit: 600 s
# Plain only
# shellcheck shell=bash

appliance nas
swept_access_point nas
sweep nas change-mode-client
sweep nas change-mode-ap
expect_swept 12
