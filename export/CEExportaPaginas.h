#pragma once
// Each selected page of the project as a file of its own, in the order of the list: PNG
// and EMF images through the host's export command, DXF through the product's LISP side.
// DWG and DWF have no writer in this edition: a numbered message, and nothing is written.
#include <QHash>
#include <QString>
#include <QStringList>

class CEExportaPaginas {
public:
    using Opcoes = QHash<QString, QString>;
    // The output formats of the page export.
    enum Formato { PNG = 4, DWG = 5, DWF = 6, DXF = 7, EMF = 8 };

    // The options PAGINAS, DWG_SEPARADOR and DWG_NUMERO_DIGITOS.
    explicit CEExportaPaginas(Opcoes opcoes);

    // True when every page of the list was written.
    bool Exporta(int formato, const QString& arquivo);
    // The file of the n-th page: with more than one page, the number goes before the last
    // "." ("lista.png" gives "lista_001.png"); a name without "." gets it in front.
    static QString NomeArquivo(const QString& arquivo, int n, int paginas, const QString& separador,
                               int digitos);

    QStringList Arquivos;  // the files written, in order

private:
    Opcoes opcoes_;
};
