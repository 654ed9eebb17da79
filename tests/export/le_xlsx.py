#!/usr/bin/python3
"""Prints a workbook as JSON for the export tests: per sheet, its name and its cells
({"A1": value}, formulas as their text), and per cell of the first sheet its style's
font (bold) and fill colour, so a test can tell that a template's formatting survived.

    le_xlsx.py FILE.xlsx
"""
import json
import sys

import openpyxl


def main():
    livro = openpyxl.load_workbook(sys.argv[1])
    folhas = []
    for folha in livro.worksheets:
        celulas = {}
        estilos = {}
        for linha in folha.iter_rows():
            for c in linha:
                if c.value is None:
                    continue
                celulas[c.coordinate] = c.value if isinstance(c.value, str) else repr(c.value)
                estilos[c.coordinate] = {
                    "negrito": bool(c.font and c.font.b),
                    "cor": c.fill.fgColor.rgb if c.fill and c.fill.fill_type else None,
                    "tipo": c.data_type,
                }
        folhas.append({
            "nome": folha.title,
            "celulas": celulas,
            "estilos": estilos,
            "imagens": len(getattr(folha, "_images", [])),
            "mescladas": [str(r) for r in folha.merged_cells.ranges],
        })
    json.dump(folhas, sys.stdout, ensure_ascii=True, sort_keys=True)


if __name__ == "__main__":
    main()
