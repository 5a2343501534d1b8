# The same as grows-not, a hundred times: 500 joins and leaves, 200 changes of the mode, 100 access points.
# Limit: 3600 s
# Plain only
# On request
# shellcheck shell=bash

ROUNDS=100
# shellcheck source=tests/lab/scenarios/grows-not.sh
. "$LAB/scenarios/grows-not.sh"
