#include "CCBorneDwgDataReader.h"

#include "lists/CETemplate.h"
#include "module/CIProgress.h"
#include "readers/CCBorneDataReader.h"

#include <QSet>

#include <memory>
#include <unordered_set>

namespace {

QString Chave(const QString& regua, const QString& numero) {
    return regua + QLatin1Char('\n') + numero;
}

}  // namespace

QSet<QString> CCBorneDwgDataReader::ChavesBornes(const VetorItens& bornes) {
    QSet<QString> chaves;
    for (const CEItemLista* borne : bornes)
        for (int i = 0; i < 3; ++i) {
            const QString regua = borne->valorCampo(CCBorneDataReader::kCamposRegua[i]);
            const QString numero = borne->valorCampo(CCBorneDataReader::kCamposNumero[i]);
            if (!regua.isEmpty() && !numero.isEmpty()) chaves.insert(Chave(regua, numero));
        }
    return chaves;
}

bool CCBorneDwgDataReader::Ligado(const CEItemLista& borne, const QSet<QString>& bornes) {
    if (!borne.valorCampo("RELACAO_INI").isEmpty() || !borne.valorCampo("RELACAO_FIM").isEmpty())
        return true;
    const QString jumper = borne.valorCampo("JUMPER");
    if (jumper.isEmpty()) return false;
    const QStringList numeros = jumper.split(',', Qt::SkipEmptyParts);
    for (int i = 0; i < 3; ++i) {
        const QString regua = borne.valorCampo(CCBorneDataReader::kCamposRegua[i]);
        if (regua.isEmpty()) continue;
        for (const QString& numero : numeros)
            if (bornes.contains(Chave(regua, numero.trimmed()))) return true;
    }
    return false;
}

VetorItens* CCBorneDwgDataReader::LerDados(zvdb::Database* database,
                                           const std::optional<QStringList>& paginas,
                                           CETemplate& modelo, CIProgress& progresso) {
    CICad::SetIntLisp("EXPORTA", 3);
    // The cable connections: the export read loads them for the components it reads, and
    // once is enough for a run.
    std::unique_ptr<VetorItens> lidos(Le(database, &modelo, true, paginas));
    if (!lidos) return nullptr;
    progresso.Definir(80);

    VetorItens componentes, bornes;
    for (CEItemLista* item : *lidos) {
        const QString tipo = item->valorCampo("ZV_LISTA_TIPO");
        if (tipo == "COMP") componentes.push_back(item);
        if (tipo == "BORNE") bornes.push_back(item);
    }
    if (!modelo.LerTexto("*FILTRO_TEMPLATE*").isEmpty()) {
        VetorItens ficam;
        for (CEItemLista* item : componentes)
            if (modelo.FiltraItem(*item) && item->valorCampo("ZV_LISTA") != "N")
                ficam.push_back(item);
        componentes = std::move(ficam);
    }
    // A cancelled strip picker draws no terminal.
    if (CICad::GetBoolLisp("*SEL_REGUA_BORNE_CFG*"))
        bornes = CCBorneDataReader::SelecionaReguas(bornes);
    if (!CICad::GetBoolLisp("*BORNES_SEM_LIG_GRX*")) {
        const QSet<QString> chaves = ChavesBornes(bornes);
        VetorItens ficam;
        for (CEItemLista* borne : bornes)
            if (Ligado(*borne, chaves)) ficam.push_back(borne);
        bornes = std::move(ficam);
    }
    // Links the terminal reader made may point at terminals that went: they are made again
    // among those that stay, when the drawing shows jumpers.
    for (CEItemLista* borne : bornes)
        borne->anterior = borne->proximo = nullptr;
    if (CICad::GetBoolLisp("*MOSTRA_JUMPER_GRX*")) CCBorneDataReader::LigaJumpers(bornes);

    // Nothing to draw: the writer adds no page, and the user hears why.
    if (bornes.empty()) CICad::ImprimeMensagem(64);

    auto* resposta = new VetorItens(componentes);
    resposta->insert(resposta->end(), bornes.begin(), bornes.end());
    // What the filters took out is freed now: nothing that stays points at it.
    const std::unordered_set<CEItemLista*> ficam(resposta->begin(), resposta->end());
    for (CEItemLista* item : *lidos)
        if (!ficam.count(item)) delete item;
    progresso.Definir(95);
    return resposta;
}
