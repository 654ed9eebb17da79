#!/usr/bin/python3
"""Prints the cells of every sheet of a workbook as JSON, read from the file's XML itself:
per sheet its name and, per cell, its value ("=" and the formula for a formula cell) and
its kind ("s" text, "n" number, "b" truth value, "f" formula, "e" error). Texts are decoded
as the format says (_xHHHH_ is the character HHHH), which openpyxl does not do.

    celulas_xlsx.py FILE.xlsx
"""
import json
import posixpath
import re
import sys
import zipfile
import xml.etree.ElementTree as ET

NS = {"m": "http://schemas.openxmlformats.org/spreadsheetml/2006/main"}
REL = "{http://schemas.openxmlformats.org/officeDocument/2006/relationships}id"
ESCAPE = re.compile("_x([0-9A-Fa-f]{4})_")


def decodifica(texto):
    texto = ESCAPE.sub(lambda m: chr(int(m.group(1), 16)), texto)
    # Escaped surrogate halves join into the character they make.
    return texto.encode("utf-16", "surrogatepass").decode("utf-16")


def texto_de(no):
    """The text of a string item: its t, or the t of each of its runs."""
    return "".join(t.text or "" for t in no.iter("{%s}t" % NS["m"]))


def main():
    pasta = zipfile.ZipFile(sys.argv[1])
    nomes = set(pasta.namelist())
    compartilhadas = []
    if "xl/sharedStrings.xml" in nomes:
        raiz = ET.fromstring(pasta.read("xl/sharedStrings.xml"))
        compartilhadas = [decodifica(texto_de(si)) for si in raiz.findall("m:si", NS)]
    relacoes = {
        r.get("Id"): r.get("Target")
        for r in ET.fromstring(pasta.read("xl/_rels/workbook.xml.rels"))
    }
    livro = ET.fromstring(pasta.read("xl/workbook.xml"))
    folhas = []
    for folha in livro.find("m:sheets", NS).findall("m:sheet", NS):
        alvo = relacoes[folha.get(REL)]
        parte = alvo[1:] if alvo.startswith("/") else posixpath.normpath("xl/" + alvo)
        celulas = {}
        for c in ET.fromstring(pasta.read(parte)).iter("{%s}c" % NS["m"]):
            tipo = c.get("t", "n")
            formula = c.find("m:f", NS)
            v = c.find("m:v", NS)
            if formula is not None and formula.text:
                celulas[c.get("r")] = {"valor": "=" + formula.text, "tipo": "f"}
            elif tipo == "s" and v is not None:
                celulas[c.get("r")] = {"valor": compartilhadas[int(v.text)], "tipo": "s"}
            elif tipo == "inlineStr":
                celulas[c.get("r")] = {"valor": decodifica(texto_de(c.find("m:is", NS))),
                                       "tipo": "s"}
            elif v is not None:
                celulas[c.get("r")] = {"valor": v.text or "", "tipo": "s" if tipo == "str"
                                       else tipo}
        folhas.append({"nome": folha.get("name"), "celulas": celulas})
    json.dump(folhas, sys.stdout, ensure_ascii=True, sort_keys=True)


if __name__ == "__main__":
    main()
