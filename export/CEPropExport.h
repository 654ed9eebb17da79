#pragma once
// One column of an export: which field (or expression, or literal text) it shows, its
// heading, width, fill and flags.
#include "CEExportSecao.h"

#include <QString>

class CEPropExport {
public:
    CEPropExport() = default;
    // A new column shows the field `tag` under its own name; it is visible, nothing else.
    explicit CEPropExport(const QString& tag) : Tag(tag), Rotulo(tag), Titulo(tag) {}
    // A column as a stored row describes it; `Literal` is left to the caller.
    static CEPropExport DaLinha(const CEExportSecao::LinhaColuna& linha);

    QString Tag;
    QString Rotulo;
    QString Titulo;
    QString Tamanho;   // decimal width; empty, 0 or negative for none
    QString Preenche;  // empty means one blank
    bool Visivel = true;
    bool Agrupa = false;
    bool Literal = false;
    bool Concatena = false;
    bool Direita = false;  // pad on the left
};
