# A fresh Debian in build/chroot, for ./test package. Sourced after packaging/prepare.sh; needs root.

chroot_folder=$PWD/build/chroot

# The mirror and release that apt uses on this machine, for the main packages of Debian.
machine_mirror() {
  apt-get indextargets --format '$(REPO_URI) $(RELEASE) $(ORIGIN) $(COMPONENT)' 'Created-By: Packages' |
    awk '$3 == "Debian" && $4 == "main" && $2 !~ /-/ { print $1, $2; exit }'
}

# make_base: build/chroot/base.tar, made once.
make_base() {
  local mirror release
  [ ! -f "$chroot_folder/base.tar" ] || return 0
  read -r mirror release < <(machine_mirror)
  [ -n "$release" ] || die "apt knows no mirror of Debian on this machine"
  mkdir -p "$chroot_folder" || die "cannot write to $PWD/build"
  rm -rf "$chroot_folder/base"
  printf 'Making a fresh Debian %s (once)\n' "$release" >&2
  # debootstrap mounts /proc in it; in a mount namespace of its own that ends with it.
  unshare -m --propagation private debootstrap --variant=minbase "$release" "$chroot_folder/base" "$mirror" \
    >"$chroot_folder/debootstrap.log" 2>&1 || die "debootstrap failed: see build/chroot/debootstrap.log"
  tar -C "$chroot_folder/base" --one-file-system -cf "$chroot_folder/base.tar.new" . &&
    mv "$chroot_folder/base.tar.new" "$chroot_folder/base.tar" || die "cannot write to $PWD/build"
  rm -rf --one-file-system "$chroot_folder/base"
}

# fresh_root NAME: unpacks the base into build/chroot/NAME. Packages that were fetched before are in its cache.
fresh_root() {
  local root=$chroot_folder/$1
  rm -rf --one-file-system "$root"
  mkdir -p "$root" "$chroot_folder/archives" && tar -C "$root" -xf "$chroot_folder/base.tar" || die "cannot write to $PWD/build"
  cp -f "$chroot_folder"/archives/*.deb "$root/var/cache/apt/archives/" 2>/dev/null
  cp -L /etc/resolv.conf "$root/etc/resolv.conf"
}

# keep_archives NAME: keeps what apt has fetched there for the next run.
keep_archives() {
  cp -u "$chroot_folder/$1"/var/cache/apt/archives/*.deb "$chroot_folder/archives/"
}

# boot_root NAME: starts systemd there, which ends with the service zorva-test. It gets a control group of its own.
boot_root() {
  local group status
  group=$(findmnt -no TARGET -t cgroup2 | head -n 1)/zorva-test.$$
  mkdir "$group" || return
  ZORVA_BOOT=1 ZORVA_OWN_NETWORK=1 timeout 300 bash -c 'echo $$ >"$1/cgroup.procs" && shift &&
    exec unshare -m -p -n -u -i -C --fork --kill-child --propagation private bash "$@"' \
    boot "$group" "$PWD/tests/packages/enter.sh" "$chroot_folder/$1"
  status=$?
  find "$group" -depth -type d -exec rmdir {} +
  return "$status"
}

# in_root NAME [UNSHARE-OPTIONS...] -- COMMAND...: runs it there. Its mounts and processes end with it.
in_root() {
  local root=$chroot_folder/$1 options=()
  shift
  while [ "$1" != -- ]; do
    options+=("$1")
    shift
  done
  shift
  unshare -m -p --fork --kill-child --propagation private "${options[@]}" \
    bash "$PWD/tests/packages/enter.sh" "$root" "$@"
}
