#!/usr/bin/env bash
# The tool on the bundled samples (scripts/make_sample_scans.py and
# scripts/make_samples.py made them): a scan file, a mesh, a grid scanner
# file and a terrain tile, each summarised by info, two of them converted.
set -euo pipefail
build=${1:-build}
tool="$build/zoncloud"
out="$build/demo"
mkdir -p "$out"

step() {
  echo
  echo "== zoncloud $*"
  "$tool" "$@"
}

"$tool" --version
step formats

# Scans of a line scanner, delimited by G08 ... G09 blocks.
step info samples/scans.asc --delimiters G08 G09
step convert samples/scans.asc "$out/scans.asc" --delimiters G08 G09 --double
if diff -q <(grep -v '^!' "$out/scans.asc") <(tr -d '\r' < samples/scans.asc) >/dev/null; then
  echo "-- scans and points identical to the sample's"
else
  echo "-- the scans differ from the sample's"
fi

# A binary STL mesh, written again as a 3MF package and read back.
step info samples/knob.stl
step convert samples/knob.stl "$out/knob.3mf"
echo "-- $out/knob.3mf holds: $(unzip -Z1 "$out/knob.3mf" | tr '\n' ' ')"

# A fringe-projection measurement: one raster patch read as a grid with holes.
step info samples/panel.surf

# A terrain tile: heights as a mesh, written as STL and read back.
step info samples/N46E007.hgt
step convert samples/N46E007.hgt "$out/terrain.stl"
step info "$out/terrain.stl"
