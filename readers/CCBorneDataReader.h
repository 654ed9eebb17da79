#pragma once
// The terminal reader: one item per terminal with its strip and number, what is wired to
// each of its sides, the wires themselves, and the jumper chains of the strips.
#include "CCDataReader.h"

#include <QSet>

#include <array>
#include <functional>
#include <optional>
#include <unordered_set>
#include <utility>
#include <vector>

class CCBorneDataReader : public CCDataReader {
public:
    // A terminal's sides need the wires' elements and points, never their whole texts.
    // Its terminals ask for their neighbours strip by strip: a few thousand kept read are
    // enough.
    CCBorneDataReader() {
        GuardaCompletas = false;
        LimitaEntidadesGuardadas(2048);
        CopiasDosLados(SufixosDosLados());
    }
    // The suffixes the sides copy their neighbours (_INI, _FIM) and wires (_SEGINI, _SEGFIM)
    // under.
    static std::vector<QString> SufixosDosLados();
    void LerLadoIni(CEItemLista& item, const OdDbObjectId& borne, CETemplate& modelo) override;
    void LerLadoFim(CEItemLista& item, const OdDbObjectId& borne, CETemplate& modelo) override;
    // Reads every page of the database; the page list is not used.
    VetorItens* LerDados(zvdb::Database* database, const std::optional<QStringList>& paginas,
                         CETemplate& modelo, CIProgress& progresso) override;

    // The steps after reading, each on its own for the writers and the tests.
    static VetorItens SelecionaReguas(const VetorItens& itens);
    static void IniciaSequencial(VetorItens& itens);
    static void PreencheFaltantes(VetorItens& itens);
    static void LigaJumpers(VetorItens& itens);
    // The strip and number fields of the three languages, in the order they are tried.
    static constexpr const char* kCamposRegua[3] = {"REGUA", "STRIP", "REGLETA"};
    static constexpr const char* kCamposNumero[3] = {"NUMERO", "NUMBER", "NUMERO"};
    // The strip and number of a terminal: the first non-empty language.
    static QString Regua(const CEItemLista& item);
    static QString Numero(const CEItemLista& item);
    // A terminal by strip name and number: the two texts as the items hold them, shared, not
    // joined into a new text per terminal.
    struct ChaveBorne {
        QString regua, numero;
        bool operator==(const ChaveBorne&) const = default;
    };

    // One side of a terminal as any reader finds it: the element wired at the side's point
    // (the insertion point, or the cut point) and the wire there.
    struct LadoBorne {
        CEPonto ponto;  // the side's point
        CEPonto outro;  // the terminal's other point
        // Handle of the element wired there, empty when none: a view into the reader's
        // connections, which holds until its reads are freed.
        QStringView vizinho;
        OdDbObjectId elemento;  // that element, null when its handle is stale
        OdDbObjectId fio;       // the wire at the side's point, null when none
        // That wire's number and whether its own field holds it, as NumeroDoFio and
        // EhFioNumerado give them: the side asks for both more than once.
        QString numeroFio;
        bool fioNumerado = false;
        CEPonto pontoElemento;  // where the wire meets the element
        QString layer;          // the terminal's layer, as the reader names it
        // The wire at the other point, once looked for (null: none there): the terminal's
        // other side, whose point that is, takes it.
        std::optional<OdDbObjectId> fioOutro;
    };
    // For a list that reads few of its items' fields: the names it reads (none: any). The
    // sides then copy of their neighbours and wires only those and what they read themselves.
    std::function<std::optional<QSet<QString>>(CETemplate&)> CamposDaLista;
    // Repeated numbers leave the jumpers unlinked; the terminal list says so (message 329),
    // the exports, which draw no jumpers, do not.
    bool AvisaNumerosRepetidos = true;

    // The side at the insertion point, or at the cut point. `oposto`, the terminal's other
    // side when it was found already, lends its two points, its layer when it has one, and
    // the wire at its other point when it looked for it.
    static LadoBorne AchaLado(CCDataReader& leitor, const OdDbObjectId& borne, bool insercao,
                              const LadoBorne* oposto = nullptr);
    // The wires at the terminal's two points under their suffixes, when the side's wire is
    // a numbered one. Answers the wire it found at the other point (null: none), when it
    // looked for one.
    static std::optional<OdDbObjectId> LeFiosLado(CCDataReader& leitor, CEItemLista& item,
                                                  const OdDbObjectId& borne, const LadoBorne& lado,
                                                  bool insercao, CETemplate* modelo);
    // The suffix of the element wired at the insertion side (or the cut side), and of the
    // wire at the insertion point (or the cut point), for the terminal's INVERTIDO.
    static QString SufixoElemento(const CEItemLista& borne, bool insercao);
    static QString SufixoFio(const CEItemLista& borne, bool insercao);
    // Whether the item's INVERTIDO reads "S" in any case: its wires' ends are not swapped.
    static bool Invertido(const CEItemLista& borne);

private:
    struct Lado;
    void LeLado(CEItemLista& item, const OdDbObjectId& borne, const Lado& lado, CETemplate& modelo);
    void CompoeRelacaoBorne(const QString& sufixo, CEItemLista& item, const OdDbObjectId& elemento,
                            const CEPonto& ponto, CETemplate& modelo);
    // Takes a terminal's item or drops it; false when it was dropped.
    bool Aceita(CEItemLista* item, CETemplate& modelo, VetorItens& itens);
    void RegistraNumero(const CEItemLista& item);

    // How a side's relation is joined: the template's separator and order, read once a run.
    struct Concatenacao {
        const CETemplate* modelo = nullptr;
        QString separador;
        bool relacaoPrimeiro = false;
    };
    Concatenacao concatenacao_;
    const Concatenacao& ConcatenacaoDo(CETemplate& modelo);
    // Per suffix of a side, the numbers of the relation's, strip's and number's names in the
    // three languages (kSemNome until first asked). Valid until the next suffix is added.
    std::vector<std::pair<QString, std::array<std::uint32_t, 9>>> lugaresLado_;
    std::uint32_t* LugaresDoLado(const QString& sufixo);

    bool avisouLista_ = false;
    bool duplicado_ = false;
    QHash<QString, QString> jumperPorNumero_;
};

uint qHash(const CCBorneDataReader::ChaveBorne& chave, uint semente = 0);
