# Shared by ./run package and ./test package: builds the Debian packages. Sourced after prepare.sh.

# deb_version: the version of the packages, which must be the project's.
deb_version() {
  local version project
  version=$(dpkg-parsechangelog -l packaging/debian/changelog -S Version)
  project=$(sed -n 's/^project(.* VERSION \([0-9.]*\).*/\1/p' CMakeLists.txt)
  [ "$version" = "$project" ] ||
    die "packaging/debian/changelog says version $version and CMakeLists.txt says $project: make them equal"
  printf '%s' "$version"
}

# build_debs FOLDER: builds the packages of this checkout in a fresh copy below FOLDER. The files *.deb are in FOLDER, what is
# for debuggers in FOLDER/debug.
build_debs() {
  local folder=$1 version source log
  version=$(deb_version) || exit 1
  source=$folder/zorva-$version
  log=$folder/build.log
  need_room 2000
  mkdir -p "$folder" || die "cannot write to $PWD"
  # Only one build at a time.
  exec 9>"$folder".lock
  flock 9
  rm -rf "$source" "$folder"/*.deb "$folder/debug"
  mkdir "$source" && tar -c --exclude=./build --exclude=./.git . | tar -x -C "$source" && cp -r packaging/debian "$source/debian" ||
    die "cannot write to $PWD/$folder"
  printf 'Building the packages of version %s (some minutes)\n' "$version" >&2
  with_progress "$log" build_in "$source" || build_failed "$log"
  rm -rf "$source"
  mkdir "$folder/debug" && mv "$folder"/*-dbgsym_* "$folder"/*.changes "$folder"/*.buildinfo "$folder/debug" || exit
  exec 9>&-
}

# build_in SOURCE: nothing of the environment may change the packages.
build_in() (
  cd "$1" || exit
  umask 022
  unset CFLAGS CXXFLAGS CPPFLAGS LDFLAGS
  export LC_ALL=C.UTF-8 TZ=UTC DEB_BUILD_OPTIONS="nocheck parallel=$(nproc)"
  exec dpkg-buildpackage -b -us -uc
)

# show_debs FOLDER: the packages with the sizes of their files and of what they install.
show_debs() {
  local deb sum=0 kib
  printf '%-50s %10s %14s\n' PACKAGE 'FILE, KiB' 'INSTALLED, KiB'
  for deb in "$1"/*.deb; do
    kib=$(dpkg-deb -f "$deb" Installed-Size)
    sum=$((sum + kib))
    printf '%-50s %10d %14d\n' "${deb##*/}" "$((($(stat -c %s "$deb") + 1023) / 1024))" "$kib"
  done
  printf '%-50s %10s %14d\n' 'all together' '' "$sum"
}
