# The race sees a contender join and serve, for the first and for the second time, and comes to every figure.
# Plain only
# On request
# Limit: 600 s
# shellcheck shell=bash

LAB_PLAN='EVENTS="join ap" AIRS=alone BANDS=2.4 CONTENDERS=bare ROUNDS=1'
# shellcheck source=tests/lab/race/race.sh
. "$LAB/race/race.sh"

# What there is of each start, but for what neither event has.
seen() {
  awk -F '\t' -v OFS=' ' '{
    for (column = 7; column <= 17; column++) $column = $column ~ /^[0-9]+$/
    print
  }' "$FIGURES"
}

expect_same 'the figures that there are' "\
join alone 2.4 cold bare 1 0 1 1 1 1 1 1 1 1 1 1
join alone 2.4 warm bare 1 0 1 1 1 1 1 1 1 1 1 1
ap alone 2.4 cold bare 1 1 0 0 1 1 1 1 1 1 1 0
ap alone 2.4 warm bare 1 1 0 0 1 1 1 1 1 1 1 0" "$(seen)"
