#pragma once
// A template whose symbols the test sets directly; points are "X,Y" texts.
#include "lists/CETemplate.h"
#include "readers/CEItemLista.h"

#include <QHash>
#include <QVariant>

class TemplateDouble : public CETemplate {
public:
    TemplateDouble() : CETemplate("double.grt") {}
    QHash<QString, QVariant> simbolos;

    bool Carregar() override { return true; }
    int LerInteiro(const QString& s) override { return simbolos.value(s).toInt(); }
    double LerReal(const QString& s) override { return simbolos.value(s).toDouble(); }
    QString LerTexto(const QString& s) override { return simbolos.value(s).toString(); }
    QStringList LerListaTexto(const QString& s) override {
        return simbolos.value(s).toStringList();
    }
    bool LerLogico(const QString& s) override { return simbolos.value(s).toBool(); }
    void LerPonto(const QString& s, double& x, double& y) override {
        const QStringList partes = LerTexto(s).split(',');
        x = partes.value(0).toDouble();
        y = partes.value(1).toDouble();
    }
    bool FiltraItem(const CEItemLista&) override { return true; }
};
