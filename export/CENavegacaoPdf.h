#pragma once
// A joined project PDF made navigable: a bookmark tree of groups and pages, of components
// with their contacts and terminals, of wires and of cross references, and a link from
// every cross reference on a page to its other end. Drawing coordinates become PDF
// coordinates through each page's frame and sheet.
#include "CEGrupoPaginas.h"
#include "CELink.h"
#include "CEMarcador.h"

#include <QByteArray>
#include <QRectF>
#include <QStringList>

#include <vector>

class CIProgress;

class CENavegacaoPdf {
public:
    // One printed page: its frame in drawing units (height, width, the offset that takes
    // the lower-left corner to the origin) and its sheet in the PDF (points, rotation).
    struct GeometriaPagina {
        double Altura = 0, Largura = 0, OrigemX = 0, OrigemY = 0;
        double AlturaPdf = 0, LarguraPdf = 0;
        int Rotacao = 0;
    };

    // The pages as printed, in the order of the PDF's pages, with their geometry.
    CENavegacaoPdf(QStringList paginas, std::vector<GeometriaPagina> geometria,
                   CIProgress* progresso);

    // Adds the bookmarks and links to the PDF in memory; false (and a message box) when it
    // can't be read or written.
    bool Navega(QByteArray& pdf);

    // A box of a page's drawing as a PDF rectangle: the frame fills the sheet as the print
    // fitted it, the box is enlarged around its centre to 2.2 times its size and clipped to
    // the sheet. Rotations other than 0 and 90 give an empty rectangle at the origin.
    static QRectF ParaPdf(const QRectF& caixa, const GeometriaPagina& pagina);

    void ColetaComponentes();
    void ColetaFios();
    void ColetaLinks();
    void ColetaPaginas();

    std::vector<CEMarcador> Componentes, Fios;
    std::vector<CELink> Links;
    std::vector<CEGrupoPaginas> Grupos;

private:
    int NumeroDaPagina(const QString& layer) const;

    QStringList paginas_;
    std::vector<GeometriaPagina> geometria_;
    CIProgress* progresso_;
};
