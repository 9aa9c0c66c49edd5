#!/bin/sh
# The manual pages, most of which the programs write: groff, man and mandoc have nothing to say of them, and every page that they
# refer to is there.
#
#   manual_pages.sh BUILD-FOLDER
set -eu
command -v groff >/dev/null || { echo "skipped: there is no groff"; exit 77; }
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT
"$1/bin/zorvactl" manual "$folder"
"$1/bin/zorvacimd" --manual "$folder"
cp "$(dirname "$0")/../bmc/zorva-bmc.8" "$folder/man8"
cd "$folder"

for page in man*/*; do
  groff -man -ww -Tutf8 "$page" 2>>complaints >/dev/null
  if command -v man >/dev/null; then
    LC_ALL=C.UTF-8 MANROFFSEQ='' MANWIDTH=80 man --warnings -E UTF-8 -l -Tutf8 -Z "$page" 2>>complaints >/dev/null
  fi
  # A date would make each build different.
  if command -v mandoc >/dev/null; then mandoc -Tlint -Wwarning "$page" | grep -v 'missing date' >>complaints || true; fi
  if LC_ALL=C grep -n '[^ -~]' "$page"; then echo "$page: is not ASCII"; exit 1; fi
done
if [ -s complaints ]; then cat complaints; exit 1; fi

# References, as \fBzorvactl\-show\fR(1). Other projects' pages are not looked for.
sed -nE 's/\\-/-/g; s/\\f[BIR]//g; p' man*/* | grep -oE '(zorva[a-z.-]*|agent\.toml)\([0-9]\)' | sort -u >references
while IFS='()' read -r name section _; do
  [ -s "man$section/$name.$section" ] || { echo "there is no $name($section)"; exit 1; }
done <references
[ "$(wc -l <references)" -ge 10 ]
