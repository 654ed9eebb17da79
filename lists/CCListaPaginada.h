#pragma once
// What every graphic list writer does alike: resolve and import its blocks, create its
// pages in the project, and fill header, footer and detail rows from page fields and items.
#include "CECelulasBloco.h"
#include "CEPaginaLista.h"

#include "cad/CEInsercoesBlocos.h"
#include "cad/OdDbObjectId.h"

#include <QHash>
#include <QSet>
#include <QStringList>

#include <functional>
#include <memory>
#include <optional>
#include <vector>

class CETemplate;
namespace zv {
class CEListaAtributos;
}

class CCListaPaginada {
public:
    // One block of a list: the template's symbol, its name in the drawing, its file.
    struct Bloco {
        QString simbolo;
        QString nome;
        QString arquivo;
        bool existe() const { return !arquivo.isEmpty(); }
    };

    // Reads the symbols, checks the files in order (a missing one throws message 150 with
    // its path) and imports each under prefix + page group. Empty symbols give no block.
    static std::vector<Bloco> ResolveBlocos(CETemplate& modelo, const QStringList& simbolos,
                                            const QStringList& prefixos, const QString& grupo);
    // "\\DADOS\\X" and the like from the shared folder, as a ".dwg" path.
    static QString CaminhoBloco(const QString& valor);
    static void ImportaBloco(const Bloco& bloco);
    // The fields a block's cells may name: every tag and default text, in upper case (as a
    // list looks them up, and trimmed) into `nomes`. False when a cell is a function, which
    // reads any field; with `porNome`, one that only looks fields up by name gives those.
    static bool JuntaCampos(const zv::CEListaAtributos* definicoes, QSet<QString>& nomes,
                            bool porNome = false);
    static void JuntaNome(QSet<QString>& nomes, const QString& nome);
    // The template's sort and page-break fields, which every paged list reads of its items.
    static void JuntaOrdemEQuebras(CETemplate& modelo, QSet<QString>& nomes);
    // The fields a list reads of the block's definitions: those of its file, and of the
    // drawing's own block of that name when there is one. None when a function reads them.
    static std::optional<QSet<QString>> CamposDoBloco(const Bloco& bloco, bool porNome = false);

    // Message 89 when the group exists (Yes replaces it), then one page per record, named
    // after the layer criarpagina leaves current, then atualizarpaginas.
    static void CriaPaginas(const QString& grupo, std::vector<CEPaginaLista>& paginas);
    // DATA, HORA, QTD and PAGINA of a first page.
    static QHash<QString, QString> CamposPrimeiraPagina(int quantidade);

    // Header (fields looked up in upper case) or footer (as they stand), at the origin.
    static void InsereCampos(const Bloco& bloco, const QString& layer,
                             const QHash<QString, QString>& campos, bool maiusculas);
    // What detail rows keep from one to the next: the block and the page's layer found, and
    // what each cell of the block is (a VARIAVEL field by its number, a FUNCAO, or neither).
    struct CelulaDetalhe {
        enum class Tipo { Variavel, Funcao, Outra } tipo = Tipo::Outra;
        CECampoPorNumero campo;
    };
    struct Detalhes {
        CEInsercoesBlocos insercoes;
        CECelulasBloco<CelulaDetalhe> celulas;
        void Reinicia() {
            insercoes.Reinicia();
            celulas.Reinicia();
        }
    };
    // A detail row: VARIAVEL fields, FUNCAO expressions; the link back to the item's
    // drawing object unless the page has several columns.
    static void InsereDetalhe(Detalhes& detalhes, const Bloco& bloco, const QString& layer,
                              const CELinhaLista& linha, bool variasColunas);
    // The value of a FUNCAO expression for the published item; empty unless a string.
    static QString AvaliaFuncao(const QString& expressao);

    // Whether a block's attribute tag names a function cell (FUNCAO, FUNCTION, any case).
    static bool EhFuncao(const QString& tag);

    // Blocks placed and filled from an item, for one writer run. Each cell that is no function
    // takes what the writer's `valor` gives for its tag and default text (none leaves it as it
    // is); function cells are worked out with the item published, once the block is in the
    // drawing and each in its turn. The first insertion of a block tells whether it has
    // function cells: a block without gets its values as its attributes are made, instead of
    // being read back and written again.
    class BlocosPreenchidos {
    public:
        using Valor =
            std::function<std::optional<QString>(const QString& tag, const QString& padrao)>;
        // The block of that name from that file; null when there is no file or it was not
        // placed.
        OdDbObjectId Insere(const QString& arquivo, const QString& nome, const QString& layer,
                            double x, double y, const CEItemLista& item, const Valor& valor);
        void Reinicia() {
            comFuncao_.clear();
            semFuncoes_ = QString();
            insercoes_.Reinicia();
        }

    private:
        QHash<QString, bool> comFuncao_;
        QString semFuncoes_;
        CEInsercoesBlocos insercoes_;
    };

    // The running grid of a list's rows, in single precision as the drawing keeps it.
    struct Grade {
        float x0, y0, x, y, h;
        double espaco;
        int linhas, colunas, contagem = 0, coluna = 0;

        // Start point, row height, column step, rows and columns of the template, at the
        // start of the first column.
        static Grade DoModelo(CETemplate& modelo);
        // A row for the item at the running point; the row may own its item.
        // The first row of a page takes room for a full page, up to a bound.
        void Coloca(CEPaginaLista& pagina, CEItemLista* item,
                    std::shared_ptr<CEItemLista> proprio = {});
        void Reinicia();
        static constexpr int kMaxLinhas = 512, kMaxColunas = 8;
    };
};
