#!/usr/bin/env bash
# ./test package: builds the packages twice and compares them, asks lintian, and installs, uses, upgrades, removes and purges
# them in a fresh Debian.
set -uo pipefail
cd "$(dirname "$0")/../.." || exit 1
. packaging/prepare.sh
. packaging/packages.sh
. tests/packages/chroot.sh

largest_kib=6000
failed=0

verdict() { # SENTENCE STATUS
  if [ "$2" -eq 0 ]; then printf 'ok      %s\n' "$1"; else
    printf 'FAILED  %s\n' "$1"
    failed=1
  fi
}

# A second build in another directory, without the compiler's cache.
check_reproducible() {
  local again=build/package-again/somewhere/else
  CCACHE_DISABLE=1 build_debs "$again"
  (cd build/package && sha256sum -- *.deb debug/*.deb) >build/package/sums
  (cd "$again" && sha256sum -- *.deb debug/*.deb) | diff build/package/sums - >&2
  verdict 'two builds give the same bytes' $?
}

check_size() {
  show_debs build/package | tee build/package/sizes
  [ "$(awk '/^all together/ { print $NF }' build/package/sizes)" -lt "$largest_kib" ]
  verdict "all packages together install less than $largest_kib KiB" $?
}

check_lintian() {
  local said
  said=$(lintian --allow-root --pedantic build/package/*.deb 2>&1)
  [ -z "$said" ] || printf '%s\n' "$said"
  [ -z "$said" ]
  verdict 'lintian has nothing to say at its pedantic level' $?
}

# next_version FOLDER: the packages as they would be in the next version, with another agent.toml.
next_version() {
  local version deb tree=build/package/next
  version=$(deb_version)
  mkdir -p "$1"
  for deb in build/package/*.deb; do
    rm -rf "$tree"
    dpkg-deb -R "$deb" "$tree" && sed -i "s/\b${version//./\\.}\b/$version+next/" "$tree/DEBIAN/control" || return
    if [ -f "$tree/etc/zorvagent/agent.toml" ]; then
      echo '# a new line' >>"$tree/etc/zorvagent/agent.toml"
      (cd "$tree" && find . -type f ! -path './DEBIAN/*' -printf '%P\0' | xargs -0 md5sum >DEBIAN/md5sums)
    fi
    dpkg-deb --root-owner-group -b "$tree" "$1" >/dev/null || return
  done
  rm -rf "$tree"
}

# The packages where systemd runs: it is started in the fresh system, and runs a step of inside.sh as a service.
boot_system() {
  local root=$chroot_folder/system
  cp tests/packages/zorva-test.{service,target} "$root/etc/systemd/system/"
  boot_root system >"$chroot_folder/boot.log" 2>&1
  if [ -s "$root/packages/booted.log" ]; then
    cat "$root/packages/booted.log"
    grep -q '^all of it was run' "$root/packages/booted.log" && ! grep -q '^FAILED' "$root/packages/booted.log"
    verdict 'where systemd runs, the packages work' $?
  else
    printf 'skipped: systemd does not start in namespaces here: %s\n' "$(tail -n 1 "$chroot_folder/boot.log")"
  fi
}

check_installation() {
  local root=$chroot_folder/system step
  make_base
  fresh_root system
  mkdir -p "$root/packages/next"
  cp build/package/*.deb "$root/packages/"
  next_version "$root/packages/next" || die "cannot make packages of the next version"
  cp tests/packages/inside.sh "$root/packages/"
  printf 'Fetching what the packages need\n' >&2
  in_root system -- sh -c 'apt-get update && apt-get install -y -q --no-install-recommends --download-only /packages/*.deb g++ cmake \
    make pkg-config && apt-get install -y -q --no-install-recommends sblim-wbemcli' \
    >"$chroot_folder/fetch.log" 2>&1 || die "apt-get failed in the fresh system: see build/chroot/fetch.log"
  keep_archives system
  for step in install installed show serve upgrade remove; do
    ZORVA_OWN_NETWORK=1 in_root system -n -u -i -- bash /packages/inside.sh "$step" || failed=1
  done
  boot_system
  ZORVA_OWN_NETWORK=1 in_root system -n -u -i -- bash /packages/inside.sh develop || failed=1
  rm -rf --one-file-system "$root"
}

[ "$(id -u)" -eq 0 ] || die "this needs root: it installs the packages in a fresh system"
need_packages "${build_packages[@]}" "${deb_packages[@]}" "${deb_test_packages[@]}"
[ "${1-}" = --keep ] && [ -f build/package/build.log ] || build_debs build/package
check_size
check_lintian
check_installation
[ "${1-}" = --keep ] || check_reproducible
exit "$failed"
