# Shared by ./run and ./test: one clear sentence when something is wrong, packages, disk space, building. They source it
# with the checkout as the working directory.

# The packages that the build needs, and those that the tests need in addition.
build_packages=(g++ cmake ninja-build pkg-config python3-minimal libspdlog-dev libfmt-dev nlohmann-json3-dev
  libtomlplusplus-dev libutfcpp-dev libcli11-dev libmnl-dev libsystemd-dev libmicrohttpd-dev libgnutls28-dev libcrypt-dev
  zlib1g-dev libpugixml-dev libcurl4-openssl-dev libexpected-dev)
test_packages=(python3 python3-jsonschema jq git libgtest-dev libgmock-dev binutils iproute2 libxml2-utils sblim-wbemcli curl openssl clang
  groff-base zsh fish)
clang_packages=(clang clang-tidy)
deb_packages=(debhelper dpkg-dev)
deb_test_packages=(debootstrap iproute2 lintian)
console_packages=(chromium chromium-driver fonts-dejavu-core python3 openssl iproute2)
bench_packages=(python3 libbenchmark-dev iproute2 wrk)

die() {
  printf '%s: %s\n' "${0##*/}" "$*" >&2
  exit 1
}

# need_room MEGABYTES: ends the script if the checkout's disk has less free space.
need_room() {
  local free
  free=$(df --output=avail -m . 2>/dev/null | tail -n 1 | tr -d ' ')
  if [ -n "$free" ] && [ "$free" -lt "$1" ]; then
    die "building needs $1 MB of free disk space here and only $free MB are left; free some or move the checkout"
  fi
}

missing_packages() {
  local package
  for package in "$@"; do
    [ "$(dpkg-query -W -f '${db:Status-Status}' "$package" 2>/dev/null)" = installed ] || printf '%s ' "$package"
  done
}

# need_packages PACKAGE...: installs the missing ones with apt-get.
need_packages() {
  command -v dpkg-query >/dev/null || die "this needs Debian 12 or a system like it: there is no dpkg here to install packages with"
  local missing as_root=() log=build/apt.log
  missing=$(missing_packages "$@")
  [ -n "$missing" ] || return 0
  if [ "$(id -u)" -ne 0 ]; then
    command -v sudo >/dev/null && sudo -v 2>/dev/null ||
      die "these packages are missing and installing them needs root: run 'apt-get install $missing' as root, then this again"
    as_root=(sudo)
  fi
  need_room 1500
  mkdir -p build || die "cannot write to $PWD"
  printf 'Installing %s\n' "$missing" >&2
  local install=("${as_root[@]}" env DEBIAN_FRONTEND=noninteractive apt-get install -y -q --no-install-recommends)
  # shellcheck disable=SC2086  # the list is words
  if ! "${install[@]}" $missing >"$log" 2>&1; then
    "${as_root[@]}" apt-get update -q >>"$log" 2>&1
    # shellcheck disable=SC2086
    "${install[@]}" $missing >>"$log" 2>&1 ||
      die "apt-get could not install ${missing% }: is this machine connected to a package mirror? ($(grep -m1 '^E:' "$log" || echo "see $log"); all of it is in $log)"
  fi
}

# unpack_packages FOLDER PACKAGE...: downloads the packages, without those that they depend on, and unpacks them into the folder once.
unpack_packages() {
  local folder=$1 package
  shift
  [ ! -e "$folder/complete" ] || return 0
  rm -rf "$folder" && mkdir -p "$folder/archives" || die "cannot write to $folder"
  local download=(apt-get download -q -o APT::Sandbox::User=root)
  (cd "$folder/archives" && { "${download[@]}" "$@" || { apt-get update -q; "${download[@]}" "$@"; }; }) >"$folder/log" 2>&1 ||
    die "apt-get could not download $*: is this machine connected to a package mirror? (all of it is in $folder/log)"
  for package in "$folder"/archives/*.deb; do dpkg -x "$package" "$folder" || die "$package cannot be unpacked"; done
  rm -rf "$folder/archives"
  touch "$folder/complete"
}

# build PRESET [TARGET...]: configures once and builds what is not up to date; prints nothing if there is nothing to do.
build() {
  local preset=$1 log
  shift
  log=build/$preset.log
  mkdir -p build/"$preset" || die "cannot write to $PWD/build"
  # Only one build of a preset at a time: two would damage each other's files.
  exec 9>build/"$preset".lock
  flock 9
  if [ ! -f build/"$preset"/build.ninja ]; then
    need_room 1500
    printf 'Configuring %s\n' "$preset" >&2
    cmake --preset "$preset" >"$log" 2>&1 ||
      die "configuring failed: $(grep -m1 -A2 'CMake Error' "$log" | tail -n 1 || true) (all of it is in $log)"
  fi
  if [ "$(ninja -C build/"$preset" -n "$@" 2>/dev/null | tail -n 1)" != 'ninja: no work to do.' ]; then
    need_room 1000
    printf 'Building %s (the first time takes some minutes)\n' "$preset" >&2
    with_progress "$log" ninja -C build/"$preset" "$@" || build_failed "$log"
  fi
  exec 9>&-
}

# with_progress LOG COMMAND...: runs it with its output in LOG; a terminal shows how far ninja is.
with_progress() {
  local log=$1 status
  shift
  if [ ! -t 2 ]; then
    "$@" >"$log" 2>&1
    return
  fi
  "$@" 2>&1 | tee "$log" | sed -un 's/^\(\[[0-9/]*\]\).*/\r\1 /p' | tr -d '\n' >&2
  status=${PIPESTATUS[0]}
  printf '\n' >&2
  return "$status"
}

build_failed() {
  if grep -q 'No space left on device' "$1"; then die "the disk is full: free some space and run this again"; fi
  printf '\n' >&2
  grep -m5 -E 'error:|FAILED:|undefined reference|fatal' "$1" >&2
  die "building failed; all of it is in $1"
}
