#!/usr/bin/env bash
# The main job on the bundled sample.
set -euo pipefail
build=${1:-build}
"$build/zoncloud" formats

# Convert the bundled scans into a free ASCII file, as a user would, and show it.
sample=samples/scans.asc
if [ -f "$sample" ]; then
  echo
  echo "== zoncloud info $sample --delimiters G08 G09"
  "$build/zoncloud" info "$sample" --delimiters G08 G09
  out="$build/demo"
  mkdir -p "$out"
  echo
  echo "== zoncloud convert $sample $out/scans.asc --delimiters G08 G09 --double"
  "$build/zoncloud" convert "$sample" "$out/scans.asc" --delimiters G08 G09 --double
  echo "-- first lines of $out/scans.asc:"
  head -n 14 "$out/scans.asc"
  echo "-- $(grep -c '^G08' "$out/scans.asc") scans, $(grep -c '^X ' "$out/scans.asc") points"
  if diff -q <(grep -v '^!' "$out/scans.asc") <(tr -d '\r' < "$sample") >/dev/null; then
    echo "-- scans and points identical to the sample's"
  else
    echo "-- the scans differ from the sample's"
  fi
else
  echo "no sample at $sample: nothing to convert" >&2
fi
