#pragma once
// One section of a stored export configuration: a kind of list (or the empty name), its
// format options, its column rows and its filter rows.
#include "MapaOrdenado.h"

#include <QString>

#include <vector>

class CEExportSecao {
public:
    // One column as stored: the item field (or expression, or literal), its flags, its
    // heading, width and fill.
    struct LinhaColuna {
        QString Tag;
        bool Visivel = false;
        bool Agrupa = false;
        QString Titulo;
        bool Literal = false;
        bool Concatena = false;
        bool Direita = false;
        QString Tamanho;
        QString Preenche;
        friend bool operator==(const LinhaColuna&, const LinhaColuna&) = default;
    };
    // One filter as stored: field, operator number, value.
    struct LinhaFiltro {
        QString Campo;
        int Operador = 0;
        QString Valor;
        friend bool operator==(const LinhaFiltro&, const LinhaFiltro&) = default;
    };

    // A new section holds every option key at its default.
    explicit CEExportSecao(QString nome = QString());

    QString Nome;
    MapaOrdenado Opcoes;
    std::vector<LinhaColuna> Colunas;
    std::vector<LinhaFiltro> Filtros;

    // The option keys a new section starts with, and their defaults, in the order they are
    // written.
    static const std::vector<std::pair<QString, QString>>& OpcoesPadrao();
    // The eight kinds of list a section may be named after.
    static const QStringList& NomesTipos();
};
