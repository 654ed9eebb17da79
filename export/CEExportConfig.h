#pragma once
// One named export configuration: its sections, in file order, and its own values.
#include "CEExportSecao.h"
#include "MapaOrdenado.h"

#include <QString>

#include <memory>
#include <vector>

class CEExportConfig {
public:
    explicit CEExportConfig(QString nome = QString()) : Nome(std::move(nome)) {}

    QString Nome;
    std::vector<std::unique_ptr<CEExportSecao>> Secoes;
    MapaOrdenado Valores;

    // The first section of that exact name, or null.
    CEExportSecao* Secao(const QString& nome) const;
    // A new section with every option at its default, after the others.
    CEExportSecao& NovaSecao(const QString& nome);
};
