#!/usr/bin/python3
"""Prints the terminals of a project drawing for the end-to-end export test, one a line:
strip;number;catalogue key. A terminal is a block reference in model space whose block
name begins "BORNE" or "BOR-"; its tags may be in any of the three languages.

    bornes_desenho.py PROJECT.dxf
"""
import sys

import ezdxf

REGUA = ("REGUA", "STRIP", "REGLETA")
NUMERO = ("NUMERO", "NUMBER")


def chave(ref):
    if not ref.has_xdata("KVR_ZV"):
        return ""
    for codigo, valor in ref.get_xdata("KVR_ZV"):
        if codigo == 1000:
            return str(valor).split("\f")[0]
    return ""


def main():
    doc = ezdxf.readfile(sys.argv[1])
    for ref in doc.modelspace().query("INSERT"):
        nome = ref.dxf.name.upper()
        if not (nome.startswith("BORNE") or nome.startswith("BOR-")):
            continue
        tags = {a.dxf.tag: a.dxf.text for a in ref.attribs}
        regua = next((tags[t] for t in REGUA if tags.get(t)), "")
        numero = next((tags[t] for t in NUMERO if tags.get(t)), "")
        print("%s;%s;%s" % (regua, numero, chave(ref)))


if __name__ == "__main__":
    main()
