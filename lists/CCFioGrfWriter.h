#pragma once
// The wire list as graphic pages: one row an item, sorted by the template, a new page (or
// blank rows, for the cable list) at a change of a key field, and a page of totals at the
// end. The cable list writer builds on it.
#include "CCListaPaginada.h"
#include "module/CCDataWriter.h"

#include <QHash>
#include <QSet>

#include <optional>
#include <utility>
#include <vector>

class CCFioGrfWriter : public CCDataWriter {
public:
    void EscreverItens(VetorItens& itens, CETemplate& modelo) override;
    // Places the page's rows, each with the detail block.
    virtual void EscrevePagina(const CEPaginaLista& pagina);
    // How a change of a key field breaks: false starts a new page.
    virtual bool QuebraComBranco(CETemplate& modelo);

    // The pages of the items, sorted as the template says, with the total page last when
    // the template has a total block; the drawing is not touched. `totais` lists the fields
    // that the total sums, in order.
    std::vector<CEPaginaLista> Diagrama(VetorItens& itens, CETemplate& modelo,
                                        const QStringList& totais);
    // The fields the total block sums: the VARIAVEL attribute definitions of the block
    // named, in order; nothing when the drawing lacks it.
    static QStringList CamposTotal(const CCListaPaginada::Bloco& total);
    // A VARIAVEL cell of a row: the length prints as a number with `digitos` decimals.
    static QString ValorVariavel(const CEItemLista& item, const QString& campo, int digitos);
    // The names (in upper case) of the fields a list of the template reads of its items: the
    // sort and break fields, the length, and the tags and default texts of the row and total
    // blocks as the list defines them (from their files; the drawing's own, kept when a file
    // fails, count too). None when one of those blocks has a function, which reads any field.
    static std::optional<QSet<QString>> CamposDasLinhas(CETemplate& modelo);

protected:
    // Fills a detail or total row inserted at the row's point.
    void InsereLinha(const CCListaPaginada::Bloco& bloco, const QString& layer,
                     const CELinhaLista& linha);

    // What a row block's attribute does, by its tag's prefix.
    enum class Papel { Variavel, Funcao, Total, Outro };
    Papel PapelDoTag(const QString& tag);

    QString grupo_;
    bool variasColunas_ = false;
    int digitos_ = 0;
    // Header, detail, first-row detail, footer, total.
    std::vector<CCListaPaginada::Bloco> blocos_;
    QHash<QString, Papel> papeis_;
    // What each cell of the row blocks is, and the field it shows, found once.
    struct CelulaLinha {
        Papel papel = Papel::Outro;
        CECampoPorNumero campo;
    };
    CECelulasBloco<CelulaLinha> celulas_;
    CelulaLinha NovaCelula(const QString& tag, const QString& padrao);
    // What a row's cells read: the item, its length's text, and that length as printed once
    // a cell asks for it.
    struct Linha {
        const CEItemLista& item;
        const QString comprimento;
        std::optional<QString> impresso;
    };
    // What ValorVariavel gives for a VARIAVEL cell, the field for a TOTAL one; none leaves
    // the cell as it is.
    std::optional<QString> ValorCelula(Linha& linha, const QString& tag, const QString& padrao);
    // The run's row blocks, filled from their items.
    CCListaPaginada::BlocosPreenchidos preenchidos_;
    // A length's printed form with the run's digits; rows repeat a few lengths.
    const QString& Impresso(const QString& comprimento);
    QHash<QString, QString> impressos_;
    // The length's field, by its number.
    CECampoPorNumero comprimento_;
};
