#!/usr/bin/env bash
# Unpacks the daemons that own DNS settings, and the bus that they speak over, into a folder. Nothing is installed.
#
#   fetch_daemons.sh FOLDER
#
# The packages are those that this machine would have to install. What is there already is left as it is.
set -uo pipefail

die() {
  printf 'fetch_daemons.sh: %s\n' "$*" >&2
  exit 1
}

wanted=(systemd systemd-resolved network-manager dbus-daemon)

# The packages to fetch, one a line.
missing() {
  apt-get --simulate --no-install-recommends install "${wanted[@]}" 2>/dev/null | awk '$1 == "Inst" { print $2 }'
}

# Several programs and directories moved to /usr; a package that still has the old place would hide the link to the new.
merge_usr() {
  local name
  for name in bin sbin lib lib32 lib64 libx32; do
    [ -d "$1/$name" ] && [ ! -L "$1/$name" ] || continue
    mkdir -p "$1/usr/$name" && cp -al "$1/$name/." "$1/usr/$name/" && rm -rf "${1:?}/$name" || die "cannot write to $1"
  done
}

folder=$(realpath -m "${1:?the folder is missing}")
mkdir -p "$(dirname "$folder")" || die "cannot make $(dirname "$folder")"
exec 9>"$folder.lock" || die "cannot write $folder.lock"
flock 9
[ ! -e "$folder/complete" ] || exit 0

packages=$(missing)
status=$?
if [ "$status" -ne 0 ]; then
  apt-get update -q >/dev/null 2>&1
  packages=$(missing) || die "apt-get cannot tell which packages ${wanted[*]} need: is this a Debian with a package mirror?"
fi
rm -rf "$folder.new" && mkdir -p "$folder.new/archives" "$folder.new/root" || die "cannot write $folder.new"
cd "$folder.new/archives" || die "cannot enter $folder.new"
if [ -n "$packages" ]; then
  download=(apt-get download -q -o APT::Sandbox::User=root)
  # shellcheck disable=SC2086  # the list is words
  "${download[@]}" $packages >../log 2>&1 || { apt-get update -q >/dev/null 2>&1; "${download[@]}" $packages >../log 2>&1; } ||
    die "apt-get could not download $(echo $packages): is a package mirror reachable? ($(tail -n 1 ../log))"
  for package in *.deb; do dpkg -x "$package" ../root || die "$package cannot be unpacked"; done
fi
cd .. || die "cannot enter $folder.new"
merge_usr root
rm -rf archives root/usr/share/{doc,man,locale,info,bash-completion} root/usr/lib/udev root/usr/share/zsh
touch complete
rm -rf "$folder" && mv "$folder.new" "$folder" || die "cannot write $folder"
