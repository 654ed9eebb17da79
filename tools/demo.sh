#!/usr/bin/env bash
# The main job on the sample project: runs the host with the module and writes into OUT.
set -euo pipefail
BIN="$1"
OUT="$2"
mkdir -p "$OUT"
export ZV_DATA_DIR="$OUT/data"
mkdir -p "$ZV_DATA_DIR"
ROOT="$(cd "$(dirname "$0")/.." && pwd)"
CAT="$ROOT/data/catalogue"
echo "== the demo catalogue (SQLite) from data/catalogue"
"$BIN/zvhost" catalogue --build "$ZV_DATA_DIR/catalogo.db" "$CAT/catalogo-esquema.sql" \
    "$CAT/catalogo-dados.sql"
"$BIN/zvhost" catalogue --set Database=SQLITE NetworkZV="$ZV_DATA_DIR/" DBName=catalogo.db \
    libLang=1
"$BIN/zvhost" catalogue --check
echo "== zvhost: a new drawing, the module loaded, the terminal list command"
"$BIN/zvhost" --quiet "$OUT/demo.dxf" gerarListaBornesGrf
echo "== results in $OUT"
