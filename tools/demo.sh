#!/usr/bin/env bash
# The main job on the sample project: runs the host with the module and writes into OUT.
set -euo pipefail
BIN="$1"
OUT="$2"
mkdir -p "$OUT"
export ZV_DATA_DIR="$OUT/data"
mkdir -p "$ZV_DATA_DIR"
echo "== zvhost: a new drawing, the module loaded, the terminal list command"
"$BIN/zvhost" --quiet "$OUT/demo.dxf" gerarListaBornesGrf
echo "== results in $OUT"
