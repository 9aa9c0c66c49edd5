#!/usr/bin/env bash
# Compiles the library's five folders, unchanged, against copies of the two folders of headers that another vendor's may
# take the place of, and looks that nothing came from the originals.
#
# usage: other_headers_test.sh SOURCE-DIR WORK-DIR C-COMPILER C++-COMPILER
# Exits 77 where the compiler is not there.
set -euo pipefail

source=$1
work=$2/$(basename "$4")
for compiler in "$3" "$4"; do
  command -v "$compiler" >/dev/null || { echo "skipped: there is no $compiler"; exit 77; }
done

mkdir -p "$work/headers"
for folder in agent/interface cmpi; do
  rm -rf "${work:?}/headers/$(basename "$folder")"
  cp -Rp "$source/$folder" "$work/headers/$(basename "$folder")"
done

cmake -S "$source" -B "$work/build" -G Ninja -DCMAKE_BUILD_TYPE=Debug -DZORVA_BUILD_TESTS=OFF \
  -DCMAKE_C_COMPILER="$3" -DCMAKE_CXX_COMPILER="$4" \
  -DZORVA_AGENT_INCLUDE_DIR="$work/headers/interface" -DZORVA_CMPI_INCLUDE_DIR="$work/headers/cmpi"
cmake --build "$work/build" --target zorva_model zorva_settings zorva_factory zorva_providers

used=$(ninja -C "$work/build" -t deps |
  awk '/^(model|settings|factory|providers)\//{mine=1} /^[^ ]/&&!/^(model|settings|factory|providers)\//{mine=0} mine')
if grep -E "^ +$source/(agent|cmpi|broker|schema|host|cli|server|cimxml)/" <<<"$used"; then
  echo "the library has used headers that are not its own"
  exit 1
fi
for header in interface/Instrumentation.h cmpi/cmpift.h; do
  grep -q "$work/headers/$header" <<<"$used" || { echo "$header: the copy was not used"; exit 1; }
done
echo "$(grep -c '\.o:' <<<"$used") sources compiled with $4"
