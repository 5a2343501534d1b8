# Debian systems that tests have to themselves: the archives that one comes from, the system that mmdebstrap makes of
# them and that is kept as an archive of its files, and a way into it. Sourced by scripts of bash, with `set -euo
# pipefail`. Roots are made, and entered, by root.
# shellcheck shell=bash

debian_support=$(realpath "${BASH_SOURCE[0]}")
readonly debian_support

# For mmdebstrap, of a system that is quick to make: without what only people read.
# shellcheck disable=SC2034  # for those who make one
readonly -a debian_lean=(--dpkgopt='path-exclude=/usr/share/doc/*' --dpkgopt='path-exclude=/usr/share/locale/*'
  --dpkgopt='path-exclude=/usr/share/man/*')

debian_suite() {
  # shellcheck source=/dev/null
  (. /etc/os-release && echo "$VERSION_CODENAME")
}

# The archives that this machine's apt uses for the machine's own suite, as they are for a suite of Debian's, whatever the
# architecture, and however the machine's sources call its own: with what these say of how far each is trusted.
debian_archives() { # SUITE
  local archives own
  own=$(debian_suite)
  # shellcheck disable=SC2016  # the fields are apt's
  archives=$(apt-get indextargets --format '$(SOURCESENTRY) $(REPO_URI) $(CODENAME) $(COMPONENT)' \
    'Created-By: Packages' 'Origin: Debian' | sed -nE "s/^([^ ]+ [^ ]+) $own([- ])/\1 $1\2/p" | debian_lines | sort -u)
  if [[ ! $archives ]]; then
    echo "this machine's apt has no list of the packages of Debian $own: run apt-get update" >&2
    return 1
  fi
  printf '%s\n' "$archives"
}

debian_lines() {
  local entry archive options
  while read -r entry archive; do
    options=$(debian_trust "${entry%:*}" "${entry##*:}") || return
    printf 'deb %s%s\n' "${options:+[$options] }" "$archive"
  done
}

# An entry of apt's sources is a line of one kind of files, and a paragraph of the other. Keys that stand in it are left
# out.
debian_trust() { # FILE NUMBER
  local option='signed-by|trusted|allow-[a-z-]+|check-[a-z-]+|valid-until-[a-z]+'
  case $1 in
    *.list) sed -nE "$2s/^[[:space:]]*deb[[:space:]]+\[([^]]*)\].*/\1/p" "$1" | tr -s '[:blank:]' '\n' ;;
    *) sed '/^#/d' "$1" | awk -v RS= -v number="$2" 'NR == number' | sed -nE 's/^([A-Za-z-]+): *(\S+)$/\L\1\E=\2/p' ;;
  esac | sed -nE "/^($option)=/p" | paste --serial --delimiters=' '
}

# How this machine's apt reaches archives, such as through a proxy, and what it asks of them: a setting in each line.
debian_settings() {
  apt-config dump | awk '/^Acquire::[^"]* ".+";$/ &&
    !/^Acquire::(cdrom|Changelogs|CompressionTypes|GzipIndexes|IndexTargets|Languages|Snapshots)[: ]/'
}

# All that tells where a system comes from: what is kept is of no use when that has changed.
debian_origin() { # SUITE
  echo "$1" && debian_archives "$1" && debian_settings
}

# Its apt has the settings of this machine's, in which may be the password of a proxy: its archive is the owner's alone.
make_debian() { # SUITE ARCHIVE|- [MMDEBSTRAP-OPTION...]
  local settings
  [[ $2 == - ]] || (rm -f "$2" && umask 077 && : >"$2") || return
  mapfile -t settings < <(debian_settings) && wait "$!" || return
  debian_archives "$1" | mmdebstrap --quiet --aptopt='APT::Install-Recommends "false"' "${settings[@]/#/--aptopt=}" \
    --dpkgopt=force-unsafe-io "${@:3}" "$1" "$2" - >&2
}

# Tells the archive of a system with some packages, which is made if it is not in the directory; another one that had the
# same name, suite and architectures before is of no use any more then. mmdebstrap takes several architectures, with
# commas between them: the first is the system's own.
debian_root() { # DIRECTORY NAME SUITE ARCHITECTURES PACKAGE...
  local directory=$1 name=$2-$3-$4 suite=$3 architectures=$4 archive include origin other
  shift 4
  include=$(printf '%s\n' "$@" | sort -u | paste --serial --delimiters=,)
  origin=$(debian_origin "$suite") || return
  archive=$directory/$name-$({ declare -f make_debian debian_root && echo "$origin ${debian_lean[*]} $include"; } |
    cksum | cut -d ' ' -f 1).tar
  mkdir -p "$directory"
  {
    flock 9
    if [[ ! -e $archive ]]; then
      echo "making a Debian system ($name)" >&2
      # Its apt knows what there is, and can fetch more.
      make_debian "$suite" "$archive.new" --format=tar --variant=minbase --architectures="$architectures" \
        ${include:+"--include=$include"} --skip=cleanup/apt/lists "${debian_lean[@]}" || return
      mv "$archive.new" "$archive"
      for other in "$directory/$name"-[0-9]*.tar{,.new}; do [[ $other == "$archive" ]] || rm -f "$other"; done
    fi
  } 9>"$directory/$name.lock"
  printf '%s\n' "$archive"
}

# Files of this machine's that apt in a system is told of, where the system has none: keys of archives, certificates.
debian_files_for_apt() { # DIRECTORY
  local file
  find "$1/etc/apt" -type f -exec \
    sed -nE 's/^deb .*[[ ]signed-by=(\/[^] ]+).*/\1/p; s/^Acquire::.*::(CAInfo|IssuerCert|CRLFile|SslCert|SslKey) "(\/.*)";$/\2/Ip' {} + |
    tr ',' '\n' | sort -u | while read -r file; do
    if [[ -f $file && ! -e $1$file ]]; then mkdir -p "$1${file%/*}" && cp --preserve=mode "$file" "$1$file" || return; fi
  done
}

# Puts a system where a directory is, with what every machine mounts. For a mount namespace of the caller's own: what is
# written there is in memory, and gone with the namespace.
mount_debian() { # ARCHIVE DIRECTORY
  mount -t tmpfs -o mode=755 debian "$2"
  tar --extract --numeric-owner --file "$1" --directory "$2"
  mount -t proc proc "$2/proc"
  mount -t sysfs -o ro sys "$2/sys"
  mkdir -p "$2/dev/shm" "$2/dev/pts"
  mount -t tmpfs -o mode=1777 shm "$2/dev/shm"
  mount -t devpts -o newinstance,ptmxmode=666,mode=620,gid=5 terminals "$2/dev/pts"
  ln -sf pts/ptmx "$2/dev/ptmx"
  rm -f "$2/etc/resolv.conf"
  cat /etc/resolv.conf >"$2/etc/resolv.conf"
  [[ ! -d $2/etc/apt ]] || debian_files_for_apt "$2"
}

# Runs a command in a system that is mounted somewhere, or that this has become, and tells it nothing of the caller.
inside_debian() { # DIRECTORY COMMAND...
  chroot "$1" env -i PATH=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin HOME=/root LC_ALL=C.UTF-8 \
    DEBIAN_FRONTEND=noninteractive "${@:2}"
}

# The first process of in_debian. It waits for the command, so that whatever that leaves behind is somebody's.
enter_debian() { # ARCHIVE [-b DIRECTORY PLACE]... COMMAND...
  local directory=${1%.tar} status=0
  mkdir -p "$directory"
  mount_debian "$1" "$directory"
  shift
  while [[ $1 == -b ]]; do
    mkdir -p "$directory$3"
    mount --bind "$2" "$directory$3"
    shift 3
  done
  # A root that was changed with chroot alone could have no namespaces of users.
  mkdir "$directory/.outside"
  pivot_root "$directory" "$directory/.outside"
  cd / || return
  umount -l /.outside
  rmdir /.outside
  inside_debian / "$@" || status=$?
  return "$status"
}

# Runs a command in a machine of its own that has a system of an archive, the caller's network, and the directories that
# are lent to it. Nothing of it is left when the command ends, or when the caller does.
in_debian() { # ARCHIVE [-b DIRECTORY PLACE]... COMMAND...
  # shellcheck disable=SC2016  # for the shell inside
  setpriv --pdeathsig KILL unshare --mount --pid --ipc --uts --fork --kill-child \
    bash -c 'set -euo pipefail; . "$0"; enter_debian "$@"' "$debian_support" "$@"
}
