# The Debian system that packages are tested in: how it is made and kept, what there is in it, and commands there. Part of
# package_test.sh, which says in `root` where it stands, and in `here` where itself does.
# shellcheck shell=bash
# shellcheck disable=SC2154  # what package_test.sh sets

# shellcheck source=tests/support/debian.sh
. "$here/../support/debian.sh"

dependencies() { # DIRECTORY
  local package
  for package in "$1"/*.deb; do dpkg-deb --field "$package" Depends; done |
    tr ',' '\n' | sed -E 's/^ *([^ ]+).*/\1/; /mero/d' | sort -u | paste --serial --delimiters=,
}

# Another system is made when something of this has changed.
made_of() { # DIRECTORY
  declare -f make_system make_debian && debian_origin "$(debian_suite)" && dependencies "$1"
}

make_system() { # ARCHIVE DIRECTORY
  echo "making a Debian system" >&2
  # shellcheck disable=SC2016  # the directory is mmdebstrap's to name
  make_debian "$(debian_suite)" "$1.new" --format=tar --variant=apt \
    --include="cmake,g++,make,pkgconf,$(dependencies "$2")" --customize-hook='mkdir "$1/srv/tools"' \
    --customize-hook='chroot "$1" sh -c "cd /srv/tools && apt-get -o APT::Sandbox::User=root download wireless-tools"' &&
    mv "$1.new" "$1"
}

# Tells the archive of the system, which is made if it is not beside the packages; one that is made of anything else is of
# no use any more.
kept_system() { # DIRECTORY
  local beside archive
  beside=$(realpath "$(dirname "$1")")/package-test || return
  archive=$beside-$(made_of "$1" | cksum | cut -d ' ' -f 1).tar || return
  {
    flock 9
    if [[ ! -e $archive ]]; then
      rm -f "$beside"-[0-9]*.tar{,.new}
      make_system "$archive" "$1" || return
    fi
  } 9>"$beside.lock"
  printf '%s\n' "$archive"
}

enter_system() { # ARCHIVE DIRECTORY
  mkdir -p "$root"
  mount_debian "$1" "$root"
  mkdir "$root"/tmp/{packages,released,upgrades,failing}
  cp "$2"/*.deb "$root/tmp/packages/"
}

# Has the packages' scripts find systemd running, and writes down what they ask of it.
pretend_systemd() {
  local name
  mkdir -p "$root/run/systemd/system"
  for name in systemctl udevadm; do
    printf '#!/bin/sh\necho "%s $*" >>/tmp/asked\ncase $* in *is-enabled*) echo enabled ;; esac\n' "$name" \
      >"$root/usr/bin/$name"
    chmod 755 "$root/usr/bin/$name"
  done
}

# Every file, and every directory that is empty, with what can be seen of it, and what is in those that are not below
# /usr; besides what apt and dpkg write down for themselves.
files() {
  {
    list_files '(' -not -type d -o -empty ')' -printf '%P %y %m %u:%g %s %l\n'
    list_files -path ./usr -prune -o -type f -exec sha256sum '{}' + | sed -E 's,^(\S+)  \./(.*),\2 \1,'
  } | sort
}

list_files() { # TEST-OF-FIND...
  (cd "$root" && find . -xdev '(' -path ./tmp -o -path ./var/cache -o -path ./var/log -o -path ./var/lib/apt -o \
    -path ./var/lib/dpkg ')' -prune -o "$@")
}

# ---- Commands in it ---------------------------------------------------------------------------------------------

inside() { inside_debian "$root" "$@" 9<&-; }

# The same in the network of this machine, which descriptor 9 keeps.
inside_online() {
  # shellcheck disable=SC2016  # for the shell in that network
  nsenter --net=/proc/self/fd/9 bash -c 'exec 9<&-; . "$0" && inside_debian "$@"' "$debian_support" "$root" "$@"
}

# Runs a command quietly, and shows what it said if it fails.
quietly() {
  local said
  said=$("$@" 2>&1) || {
    printf '%s\n' "$said" >&2
    return 1
  }
}

readonly apt_get=(apt-get --yes -o Dpkg::Use-Pty=0 -o APT::Sandbox::User=root)

apt() { quietly inside "${apt_get[@]}" "$@"; }

# Only what is fetched comes from the network.
apt_online() {
  quietly inside_online "${apt_get[@]}" --download-only "$@" && apt --no-download "$@"
}

install_from() { # DIRECTORY [OPTION...]
  local directory=$1 packages
  shift
  packages=("$root/tmp/$directory"/*.deb)
  rm -f "$root/tmp/asked"
  apt install "$@" "${packages[@]#"$root"}"
}
