#pragma once
// The project's pages as one PDF: each page is shown and printed by the host to a one-page
// PDF in the temporary folder, the pages are joined into one document, bookmarks and links
// are added when the options ask for a navigable PDF, and the result replaces the target
// in one step (a temporary file beside it, then a rename), or not at all.
#include <QByteArray>
#include <QHash>
#include <QString>
#include <QStringList>

#include <vector>

class CIProgress;

class CEExportaPdf {
public:
    using Opcoes = QHash<QString, QString>;

    // The options of the export configuration (PAGINAS, PDF_PAPER_SIZE_PZ,
    // PDF_ORIENTATION_LP, PDF_TABELA_ESTILO, PDF_DPI, PDF_WATERMARK, PDF_PESOLINHA_SN,
    // PDF_SMART_SN); the progress window may be null.
    CEExportaPdf(Opcoes opcoes, CIProgress* progresso);

    // True when the final file is in place.
    bool Exporta(const QString& arquivo);

    // The paper table: names in order, and a name's "width,height" in millimetres.
    static const QStringList& Folhas();
    static QString TamanhoFolha(const QString& nome);
    // The print command's answers for one page, in the host's order.
    static QStringList ComandoImpressao(const QString& folha, bool paisagem, bool comJanela,
                                        double x1, double y1, double x2, double y2,
                                        const QString& dpi, const QString& estilo, bool pesoLinha,
                                        const QString& arquivo);
    // The pages to print: PAGINAS split at ";", or the project's pages.
    static QStringList ListaPaginas(const QString& opcaoPaginas);
    // The one-page files joined in order into one PDF in memory; empty (and a message box)
    // when a file can't be read. Fills the PDF page sizes.
    QByteArray Junta(const QStringList& nomes);

    // Per printed page: the frame in drawing units, its place in the joined PDF.
    std::vector<double> AlturaPag, LarguraPag, OrigemX, OrigemY;
    std::vector<double> AlturaPdf, LarguraPdf;
    std::vector<int> RotacaoPdf;
    QStringList ArquivosPdf;
    QStringList PaginasImpressas;
    // The bytes of the one-page files, all together.
    qint64 BytesPaginas = 0;

private:
    bool ImprimePagina(int i, int total, const QString& pagina, const QString& folha, bool paisagem,
                       const QString& estilo, const QString& dpi, bool pesoLinha);
    bool ExtensaoPagina(const QString& pagina, double& x1, double& y1, double& x2, double& y2);
    void EsperaArquivos();
    void Progresso(int percentual, const QString& texto = QString());
    bool Cancelado();

    Opcoes opcoes_;
    CIProgress* progresso_;
};
