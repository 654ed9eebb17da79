#pragma once
// The bill of materials as graphic pages: a material may take several rows (long texts
// wrap, a group may show several values of one field), quantities and lengths are summed
// over its group, accessories have a row block of their own, and header values may be
// asked of the user.
#include "CCListaPaginada.h"
#include "module/CCDataWriter.h"

#include <QHash>
#include <QString>

#include <map>
#include <vector>

class CamposItem;
class CEItemLista;

class CCMaterialGrfWriter : public CCDataWriter {
public:
    // One attribute definition of a detail block, read from its default text
    // "FIELD%MODE$LIMIT$SUBMODE$SEPARATOR%".
    struct itemDet {
        QString tag, texto;
        bool valido = false;
        QString campo, modo;
        int limite = 0;
        QString submodo, separador;
        int contador = 0;
    };
    using Especificacoes = std::vector<itemDet>;
    static itemDet LeEspecificacao(const QString& tag, const QString& texto);

    void EscreverItens(VetorItens& itens, CETemplate& modelo) override;

    // Group sums and numbering: QTD and COMPRIMENTO (and LENGTH) over each chain, set on
    // every member; SEQUENCIA and SEQUENCE on each entry.
    static void SomaGrupos(VetorItens& itens, int digitos);
    // How many of the fields SomaGrupos writes into every member the fields lack.
    static std::size_t SomasAusentes(const CamposItem& campos);
    // The sum of a field's numbers over every item and the members of its chain, as the
    // total block shows it.
    static double SomaCampo(const VetorItens& itens, const QString& campo);
    // The page layout, without touching the drawing. `especificacoes` and `especificacoesAce`
    // are the row definitions of the detail and accessory blocks (read from the blocks).
    std::vector<CEPaginaLista> Diagrama(VetorItens& itens, CETemplate& modelo);

    // The texts of row `r` of an item, in `mapa` by each det's default text; whether the
    // row has content of its own.
    static bool LinhaItem(const CEItemLista& item, Especificacoes& defs, int r,
                          QHash<QString, QString>& mapa);
    static bool LinhaTexto(CEItemLista& item, Especificacoes& defs, int r,
                           QHash<QString, QString>& mapa, bool ultima, bool& funcao,
                           bool* temLinha = nullptr);

    Especificacoes especificacoes, especificacoesAce;
    // Field names the total block sums, and their sums.
    std::map<QString, double> totais;

private:
    void LeEspecificacoes(const std::vector<CCListaPaginada::Bloco>& blocos);
    void Pergunta(const std::vector<CCListaPaginada::Bloco>& blocos);
    void InsereLinha(const CCListaPaginada::Bloco& bloco, const QString& layer,
                     const CELinhaLista& linha, bool variasColunas);
    void InsereCampos(const CCListaPaginada::Bloco& bloco, const QString& layer,
                      const QHash<QString, QString>& campos, bool maiusculas, int mapa);

    int digitos_ = 0;
    // Prompt answers of header, detail, accessory detail and footer.
    std::vector<std::pair<QString, QString>> respostas_[4];
};
