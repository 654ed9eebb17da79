#pragma once
// One filter of an export: an item field, an operator and a value.
#include <QString>

class CEFiltroExport {
public:
    enum Operador {
        Igual = 0,
        Diferente = 1,
        Contem = 2,
        NaoContem = 3,
        ComecaCom = 4,
        NaoComecaCom = 5,
        TerminaCom = 6,
        NaoTerminaCom = 7,
    };

    CEFiltroExport() = default;
    CEFiltroExport(QString campo, int operador, QString valor)
        : Campo(std::move(campo)), Valor(std::move(valor)), Operador(operador) {}

    // Whether a field's value passes. Exact, case included; an operator that is none of
    // the eight passes nothing.
    bool Aceita(const QString& valorCampo) const;

    QString Campo;
    QString Valor;
    int Operador = Igual;
    friend bool operator==(const CEFiltroExport&, const CEFiltroExport&) = default;
};
