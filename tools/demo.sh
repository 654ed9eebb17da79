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
echo "== the demo project and the product data (blocks, templates, configuration)"
PRODUCT="$OUT/produto"
rm -rf "$PRODUCT"
mkdir -p "$PRODUCT"
cp -r "$ROOT/data/templates" "$ROOT/data/config" "$PRODUCT/"
"$BIN/zvhost" generate --out "$OUT/demo.dxf" --seed 1 --terminals 120 --pages 10 --numbers project \
    --data "$PRODUCT"
export ZV_PRODUCT_DIR="$PRODUCT/"
# The module's commands on the demo project, the user configuration loaded.
run() {
    "$BIN/zvhost" --quiet --load "$PRODUCT/config/zvconfig.lsp" "$@"
}
echo "== zvhost: the graphic lists and the strip drawing of the demo project"
for job in "gerarListaBornesGrf terminal-list.dxf" "gerarListaFiosGrf wire-list.dxf" \
    "gerarListaCabosGrf cable-list.dxf" "gerarListaMateriaisGrf material-list.dxf" \
    "gerarListaBornesDwg strip-drawing.dxf"; do
    read -r command file <<<"$job"
    echo "-- $command: $OUT/$file"
    run "$OUT/demo.dxf" -o "$OUT/$file" "$command"
done
echo "-- diagramaTopografico: $OUT/topographic.dxf"
run --answer "template=$PRODUCT/templates/topografico.dtp" "$OUT/demo.dxf" -o "$OUT/topographic.dxf" \
    diagramaTopografico
echo "== zvhost: one export of each data format (configuration Completa) into $OUT/exports"
mkdir -p "$OUT/exports"
for job in "exportacaoBornes BORNES CSV terminals.csv" "exportacaoFios FIOS XLSX wires.xlsx" \
    "exportacaoCabos CABOS HTML cables.html" "exportacao COMPS XML components.xml"; do
    read -r command kind format file <<<"$job"
    run --answer export:config=Completa --answer "export:type=$kind" --answer "export:format=$format" \
        --answer "export:file=$OUT/exports/$file" "$OUT/demo.dxf" "$command"
done
echo "== the pages as one PDF with bookmarks and links, and one page as PNG, in $OUT/exports"
for job in "PDF demo.pdf" "PNG comando-0001.png COMANDO\$0001\$A"; do
    read -r format file pages <<<"$job"
    run --answer export:config=Completa --answer export:type=PAGINAS --answer "export:format=$format" \
        --answer export:option:PDF_SMART_SN=S --answer "export:pages=$pages" \
        --answer "export:option:PDF_PAPER_SIZE_PZ=A3 (420 x 297 mm)" \
        --answer "export:file=$OUT/exports/$file" "$OUT/terminal-list.dxf" exportacao
done
if [ -x "$BIN/zvdesk" ]; then
    "$BIN/zvdesk" --load "$PRODUCT/config/zvconfig.lsp" --screenshot "$OUT/zvdesk.png" \
        "$OUT/terminal-list.dxf"
fi
echo "== results in $OUT"
DEMO="$(cd "$OUT" && pwd)"
echo "== the desktop program on the demo project (a window: needs a display, or xvfb-run):"
echo "   ZV_DATA_DIR=$DEMO/data ZV_PRODUCT_DIR=$DEMO/produto/ \\"
echo "       $(cd "$BIN" && pwd)/zvdesk --load $DEMO/produto/config/zvconfig.lsp $DEMO/demo.dxf"
