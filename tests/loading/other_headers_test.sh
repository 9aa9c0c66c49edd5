#!/usr/bin/env bash
# Compiles the library's five folders, unchanged, against other folders of headers, and checks that none of the
# project's own is used.
#
# usage: other_headers_test.sh SOURCE-DIR WORK-DIR HEADERS C-COMPILER C++-COMPILER
# HEADERS is "copied" for copies of the project's own, "other" for another vendor's agent and CMPI 2.1.
# Exits 77 where the compiler is not there.
set -euo pipefail

source=$1
headers=$3
work=$2/$headers-$(basename "$5")
for compiler in "$4" "$5"; do
  command -v "$compiler" >/dev/null || { echo "skipped: there is no $compiler"; exit 77; }
done

# A compiler cache may return the dependencies of another folder's build.
export CCACHE_DISABLE=1

rm -rf "${work:?}/headers"
mkdir -p "$work/headers"
if [ "$headers" = other ]; then
  cp -Rp "$source/tests/loading/other_agent" "$work/headers/interface"
  python3 "$source/tests/loading/make_cmpi_2_1.py" "$source/cmpi" "$work/headers/cmpi"
else
  cp -Rp "$source/agent/interface" "$work/headers/interface"
  cp -Rp "$source/cmpi" "$work/headers/cmpi"
fi

# One of the two kinds of headers does without precompiled ones, to show that each source includes what it uses. Nothing
# is run, so there is no debug information.
precompile=$([ "$headers" = other ] && echo ON || echo OFF)
cmake -S "$source" -B "$work/build" -G Ninja -DCMAKE_BUILD_TYPE= -DZORVA_BUILD_TESTS=OFF -DZORVA_PRECOMPILE="$precompile" \
  -DCMAKE_C_COMPILER="$4" -DCMAKE_CXX_COMPILER="$5" \
  -DZORVA_AGENT_INCLUDE_DIR="$work/headers/interface" -DZORVA_CMPI_INCLUDE_DIR="$work/headers/cmpi"
cmake --build "$work/build" --target zorva_cmpi_support zorva_model zorva_settings zorva_factory zorva_providers

used=$(ninja -C "$work/build" -t deps |
  awk '/^(cmpi|model|settings|factory|providers)\//{mine=1} /^[^ ]/&&!/^(cmpi|model|settings|factory|providers)\//{mine=0} mine')
if grep -E "^ +$source/(cmpi/[^/]*$|(agent|broker|schema|host|cli|server|cimxml|cimom|http|frontend)/)" <<<"$used"; then
  echo "the library has used headers that are not its own"
  exit 1
fi
for header in interface/Instrumentation.h cmpi/cmpift.h; do
  grep -q "$work/headers/$header" <<<"$used" || { echo "$header: the other one was not used"; exit 1; }
done
echo "$(grep -c '\.o:' <<<"$used") sources compiled with $5"
