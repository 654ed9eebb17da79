#!/usr/bin/python3
"""The terminal export done with ezdxf, as the bench's yardstick: reads a project drawing,
takes every block reference in model space whose block name begins with "BORNE", and
writes the same columns as the CSV export of the bench (REGUA, NUMERO, DESCRICAO,
RELACAO_INI, RELACAO_FIM, ZV_KEY) with the same delimiters and CR LF line ends. Fields the
drawing does not hold (the description comes from the catalogue, the relations from the
wires) are left empty, so this does less work than the module does.

    exporta_bornes_ezdxf.py PROJECT.dxf OUT.csv

Prints the number of terminals and the seconds spent reading and writing.
"""
import sys
import time

import ezdxf

COLUNAS = ["REGUA", "NUMERO", "DESCRICAO", "RELACAO_INI", "RELACAO_FIM", "ZV_KEY"]
# A project writes a terminal's tags in one of three languages.
TRADUCOES = {"STRIP": "REGUA", "REGLETA": "REGUA", "NUMBER": "NUMERO"}


def chave(ref):
    # The catalogue key is the first text of the KVR_ZV extended data, before U+000C.
    if not ref.has_xdata("KVR_ZV"):
        return ""
    for codigo, valor in ref.get_xdata("KVR_ZV"):
        if codigo == 1000:
            return str(valor).split("\f")[0]
    return ""


def main():
    entrada, saida = sys.argv[1], sys.argv[2]
    inicio = time.perf_counter()
    doc = ezdxf.readfile(entrada)
    lido = time.perf_counter()
    linhas = ['"' + '";"'.join(COLUNAS) + '"']
    for ref in doc.modelspace().query("INSERT"):
        if not ref.dxf.name.startswith("BORNE"):
            continue
        campos = {TRADUCOES.get(a.dxf.tag, a.dxf.tag): a.dxf.text for a in ref.attribs}
        campos["ZV_KEY"] = chave(ref)
        linhas.append('"' + '";"'.join(campos.get(c, "") for c in COLUNAS) + '"')
    with open(saida, "w", encoding="latin-1", errors="replace", newline="") as f:
        f.write("\r\n".join(linhas) + "\r\n")
    fim = time.perf_counter()
    print("terminals: %d  read: %.2f s  rows and file: %.2f s  total: %.2f s"
          % (len(linhas) - 1, lido - inicio, fim - lido, fim - inicio))


if __name__ == "__main__":
    main()
