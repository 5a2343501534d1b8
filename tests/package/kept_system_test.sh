#!/bin/bash
# kept_system_test.sh: where package_test.sh has its Debian system, without making one.
# shellcheck disable=SC2016  # what programs are made of
set -euo pipefail
here=$(dirname "$(realpath "$0")")
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
mkdir "$work"/{bin,tmp,packages}

fail() {
  echo "$1" >&2
  exit 1
}

program() { # NAME SCRIPT
  printf '#!/bin/bash\n%s\n' "$2" >"$work/bin/$1"
  chmod 755 "$work/bin/$1"
}

program apt-get '. /etc/os-release && echo "$WORK/sources.list:1 http://archive.example/ $VERSION_CODENAME main"'
program apt-config ''
program dpkg-deb 'echo "busybox, $(cat "$WORK/dependency")"'
program mmdebstrap 'cat >/dev/null; for word; do [[ $word != *.new ]] || target=$word; done
  [[ ! -s $target ]] || echo "two runs make $target" >&2
  echo made | tee -a "$WORK/made" >"$target"; sleep 0.2'
for name in setpriv unshare; do program "$name" 'echo "$0 $*" >>"$WORK/entered"; ls "$TMPDIR" >>"$WORK/in-tmp"'; done

look() {
  WORK=$work TMPDIR=$work/tmp PATH=$work/bin:$PATH "$here/package_test.sh" "$work/packages" 2>>"$work/said" || {
    cat "$work/said" >&2
    return 1
  }
}

archives() { (cd "$work" && echo package-test-*.tar*); }

touch "$work/packages/one.deb" "$work/sources.list"
echo hostapd >"$work/dependency"

# Two runs at once wrote one archive.
look & first=$!
look
wait "$first"
[[ $(<"$work/made") == made ]] || fail 'the system is made twice'

# In /tmp, the directory could be anybody's once a run had been ended: what was left of that went on as root in a system
# of theirs.
archive=$work/$(archives)
[[ ! -s $work/in-tmp ]] || fail 'the system is entered in a directory where anyone may make files'
entered="$work/bin/setpriv --pdeathsig KILL unshare --mount --net --pid --fork --kill-child"
entered+=" $here/package_test.sh $archive $work/packages "
[[ $(sort -u "$work/entered") == "$entered" ]] || fail "not entered as it should be: $(<"$work/entered")"

# Each system that there had ever been was kept.
echo iw >"$work/dependency"
look
[[ $(archives) == package-test-*.tar && $(archives) != *' '* && $work/$(archives) != "$archive" ]] ||
  fail "kept: $(archives)"
! grep 'two runs' "$work/said" >&2
