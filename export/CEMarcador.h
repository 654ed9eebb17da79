#pragma once
// A node of the bookmark tree: a component, a wire or one of their contacts and terminals,
// with the box of its object on its page.
#include <QRectF>
#include <QString>

#include <cstdint>
#include <vector>

struct CEMarcador {
    enum Tipo { Componente = 1, Contato = 2, Borne = 4, Fio = 8 };

    QString Nome;
    std::uint64_t Handle = 0;
    QString Bloco;
    QString Ordem;  // the sort text
    std::vector<CEMarcador> ContatosNA, ContatosNF, ContatosNAF, Bornes;
    QRectF Caixa;  // in drawing units
    int NumPagina = 0;
    int TipoNo = Componente;
};
