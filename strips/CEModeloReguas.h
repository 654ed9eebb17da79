#pragma once
// The terminal-strip drawing before it is drawn: the strips with their terminals in drawing
// order, the symbols wired to them, the jumper tracks, the cuts of long strips, the pages
// and where each strip stands. Everything here is computed on the items alone; the writer
// then only inserts blocks.
#include "CEBorneDwg.h"
#include "CEPaginaDwg.h"
#include "CEReguaDwg.h"
#include "CESimboloDwg.h"
#include "readers/CCBorneDataReader.h"
#include "readers/TabelaChaves.h"

#include <QHash>
#include <QStringList>
#include <QStringView>

#include <cstdint>
#include <deque>
#include <memory>
#include <vector>

class CETemplate;
class VetorItens;

class CEModeloReguas {
public:
    // The layout settings of a strip drawing's template.
    struct Parametros {
        int bornesPorRegua = 0;  // terminals per strip row; below 1: no limit
        QStringList chavesQuebra;
        int reguasPorPagina = 1;
        double distanciaReguas = 0.0;
        double refX = 0.0, refY = 0.0;
        QStringList camposDetalhe;

        static Parametros DoModelo(CETemplate& modelo);
    };

    // Builds, lays tracks, cuts strips and makes pages; then points and details.
    void Monta(const VetorItens& itens, const Parametros& parametros);

    // The steps, in the order Monta runs them.
    void Constroi(const VetorItens& itens);
    void CalculaTrilhas();
    void CortaReguas(int limite, const QStringList& chavesQuebra);
    void Pagina(int reguasPorPagina);
    void CalculaPontos(double distancia, double refX, double refY);
    void CalculaDetalhes(const QStringList& campos);

    // Whether the layout reads a component's field of that name: its kind, handle and
    // label, and its connections in the three languages.
    static bool LeCampoDoSimbolo(const QString& nome);

    // Symbols that no terminal of the drawing is wired to, in symbol order.
    std::vector<CESimboloDwg*> SimbolosSemBorne();
    using ChaveBorne = CCBorneDataReader::ChaveBorne;
    CEBorneDwg* Borne(const QString& regua, const QString& numero) const;
    // The first symbol of the handle, or null.
    CESimboloDwg* Simbolo(const QString& handle) const;

    // Texts the items hold, as keys: views of the text, which stays in the item. A table so
    // keyed copies no text, and writes nothing into a text's memory (a copy counts itself
    // there) for each terminal and symbol of the drawing; two keys of other lengths differ
    // without a look at their texts.
    struct TextoDoItem {
        QStringView texto;
        bool operator==(const TextoDoItem& outro) const { return texto == outro.texto; }
        friend uint qHash(const TextoDoItem& chave, uint semente = 0) {
            return qHash(chave.texto, semente);
        }
    };
    struct ChaveDoItem {
        QStringView regua;
        QStringView numero;
        bool operator==(const ChaveDoItem& outro) const {
            return numero == outro.numero && regua == outro.regua;
        }
        // The strip's hash seeds the number's, as for CCBorneDataReader::ChaveBorne: a seed
        // takes Qt's better hash, and a strip's numbers spread over the whole table.
        friend uint qHash(const ChaveDoItem& chave, uint semente = 0) {
            return qHash(chave.numero, qHash(chave.regua, semente));
        }
    };

    // The terminals and symbols live in blocks of a few, in the order they were made, and
    // stay where they are as more are added: no allocation of their own.
    std::deque<CEBorneDwg> bornes;
    TabelaChaves<ChaveDoItem, CEBorneDwg*> bornesPorChave;
    std::deque<CESimboloDwg> simbolos;
    TabelaChaves<TextoDoItem, CESimboloDwg*> simbolosPorHandle;
    std::vector<std::unique_ptr<CEPaginaDwg>> paginas;
    std::vector<std::unique_ptr<CEReguaDwg>> reguas;

private:
    // What ordering the strips by their symbols keeps from one symbol to the next.
    struct Rascunho;
    void OrdenaPorSimbolos(CEReguaDwg& regua, Rascunho& rascunho);
    // The symbol's terminals in the order of its connections, into rascunho.ordem; those that
    // match none drop.
    void BornesDoSimbolo(const CESimboloDwg& simbolo, Rascunho& rascunho) const;
    // The terminals' side connections, each terminal's in a run of its own.
    std::vector<const QString*> ligacoes_;
    // Where the next piece of a strip begins (the terminal count when no cut is due), and
    // whether the strip ends its page there.
    size_t Corte(const CEReguaDwg& regua, int limite, const std::vector<std::uint32_t>& chaves,
                 bool& quebra) const;
};
