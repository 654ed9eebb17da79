#!/usr/bin/python3
"""Makes the template workbook of the export tests: a first sheet with a bold heading, a
filled cell, a formula, a merged title and an image; a second sheet with its own values.

    faz_modelo_xlsx.py OUT.xlsx IMAGE.png
"""
import sys

import openpyxl
from openpyxl.drawing.image import Image
from openpyxl.styles import Font, PatternFill


def main():
    livro = openpyxl.Workbook()
    folha = livro.active
    folha.title = "Lista"
    folha["A1"] = "Lista de bornes"
    folha["A1"].font = Font(b=True)
    folha.merge_cells("A1:C1")
    folha["D1"] = "=1+2"
    folha["B2"] = "Cliente"
    folha["B2"].fill = PatternFill("solid", fgColor="FFFFFF00")
    folha["A4"] = "velho"
    folha["A4"].font = Font(b=True)
    folha["E4"] = "=SUM(1,2)"
    folha["F9"] = "fica"
    folha.add_image(Image(sys.argv[2]), "H2")
    outra = livro.create_sheet("Outra")
    outra["A1"] = "nao mexer"
    outra["B2"] = 42
    livro.save(sys.argv[1])


if __name__ == "__main__":
    main()
