#pragma once
// The export driver of one run: what the dialog chose (kind of list, format, file, columns,
// filters, options), the items read from the project, and the steps that turn them into
// the rows of one file: selection by kind, filters, sort, grouping, concatenation and
// numbering. The column values and their padding are shared by all writers.
#include "CEFiltroExport.h"
#include "CEPropExport.h"
#include "MapaOrdenado.h"
#include "readers/VetorItens.h"

#include <QDate>
#include <QString>
#include <QStringList>

#include <functional>
#include <memory>
#include <optional>
#include <vector>

class CCExportWriter;
class CEExportConfigs;

class CEExportacao {
public:
    // Kinds of list, the numbers kept in `TipoIn`.
    enum TipoEntrada {
        Bornes = 1,
        Fios = 2,
        Comps = 3,
        FiosEComps = 4,
        Paginas = 5,
        Cabos = 6,
        Tudo = 7,
        Anilhas = 8,
    };
    // Output formats, the numbers kept in `TipoOut` (1 was an older spreadsheet format).
    enum TipoSaida {
        Csv = 0,
        Xml = 2,
        Html = 3,
        Png = 4,
        Dwg = 5,
        Dwf = 6,
        Dxf = 7,
        Emf = 8,
        Pdf = 9,
        Xlsx = 10,
    };

    // The command entry of the exports: the dialog (in a scripted host, its answers), the
    // run with `leitor` reading the project, and what the user is told. Numbered messages
    // say why nothing was written.
    using FuncaoLeitor = std::function<std::unique_ptr<VetorItens>(CEExportacao&)>;
    static void Exporta(const QString& tipoPalavra, FuncaoLeitor leitor);

    // Options seeded with their defaults; the four data writers made.
    CEExportacao();
    ~CEExportacao();
    CEExportacao(const CEExportacao&) = delete;
    CEExportacao& operator=(const CEExportacao&) = delete;

    int TipoIn = Bornes;
    int TipoOut = Csv;
    int TipoOutPagina = Csv;
    QString Arquivo;
    MapaOrdenado Opcoes;
    std::vector<CEPropExport> Colunas;
    std::vector<CEFiltroExport> Filtros;
    // What the reader gave; its items belong to this object.
    std::unique_ptr<VetorItens> ItensLidos;
    // After selection, filters, sort and grouping; shares the items of ItensLidos.
    std::unique_ptr<VetorItens> Itens;
    int Progresso = 0;
    // The day written into `DATA` and `DATE`.
    QDate Hoje = QDate::currentDate();
    // Why the last run wrote no file; empty when it did.
    QString Erro;

    // Reads the project for the kind of list; set by whoever composes the run, since the
    // reader of exports is its own class.
    FuncaoLeitor Leitor;
    // The page exports (kind "PAGINAS": PNG, DWG, DWF, DXF, EMF, and PDF by TipoOutPagina).
    // True when the files were written; otherwise Erro says why.
    std::function<bool(CEExportacao&)> ExportaPaginas;

    QString GetOpcao(const QString& chave) const { return Opcoes.valor(chave); }
    bool GetOpcaoSN(const QString& chave) const { return GetOpcao(chave) == QLatin1String("S"); }
    void SetOpcao(const QString& chave, const QString& valor) { Opcoes.definir(chave, valor); }

    // The words and numbers of the kinds and formats; 0 and -1 for a word that is none.
    static int TipoInDePalavra(const QString& palavra);
    static QString PalavraDeTipoIn(int tipo);
    static int TipoOutDePalavra(const QString& palavra);
    static QString PalavraDeTipoOut(int tipo);
    // ".csv", ".xlsx" ...; empty for an unknown format.
    static QString ExtensaoDe(int tipoOut);
    // Data formats are for every kind but "PAGINAS", page formats only for it.
    static bool FormatoServe(int tipoIn, int tipoOut);

    // Rebuilds Colunas and Filtros from a stored section (made when missing); false when
    // the section has no column row, and then Colunas is empty.
    bool AplicaConfig(CEExportConfigs& configs, const QString& secao, const QString& config);
    // The columns a kind of list starts with, in the field names of a language (1 to 3).
    static std::vector<CEPropExport> ColunasPadrao(int tipoIn, int idioma);

    // The run after the dialog: read, select, filter, sort, group, write. True when a file
    // was written; otherwise Erro says why.
    bool Executa();

    // The steps, in the order Executa runs them.
    void Seleciona();
    // Keeps the items of the strips named, in the order of the names; none for no list.
    void SelecionaReguas(const std::optional<QStringList>& reguas);
    void Filtra();
    void Ordena();
    // Folds the items of equal group value into their first, counted and summed; numbers
    // the items (or the groups). Returns the first items of the groups, in order; empty
    // when no column groups.
    VetorItens Agrupa();
    void Concatena(const VetorItens& grupos);

    // The text of a column for an item: the literal, the expression with its {TAG} parts
    // filled, or the field.
    static QString ValorColuna(const CEItemLista& item, const CEPropExport& coluna);
    // Cuts or pads a text to a width; see the tests for its edge cases.
    static QString Ajusta(const QString& texto, const QString& largura, const QString& preenche,
                          bool direita);
    // A sort key as the export sorts: its first run of digits padded to ten.
    static QString Normaliza(const QString& texto);

    CCExportWriter* WriterPara(int tipoOut) const;

private:
    void Numera(CEItemLista& item, int n) const;
    mutable QDate diaTexto_;
    mutable QString dataTexto_;

    std::unique_ptr<CCExportWriter> WriterCsv;
    std::unique_ptr<CCExportWriter> WriterXml;
    std::unique_ptr<CCExportWriter> WriterHtml;
    std::unique_ptr<CCExportWriter> WriterXlsx;
};
