#include "CEItemLista.h"

#include "cad/CICad.h"

#include <algorithm>

bool CEItemLista::obterCampo(const QString& chave, QString& valor) const {
    const QString* achado = campos.procura(chave);
    if (!achado) return false;
    valor = *achado;
    return true;
}

void CEItemLista::definirCampoInteiro(const QString& chave, int valor) {
    definirCampo(chave, QString::number(valor));
}

void CEItemLista::definirCampoReal(const QString& chave, double valor, int decimais) {
    definirCampo(chave, ZVString::DeReal(valor, decimais));
}

void CEItemLista::copiarCampos(const CEItemLista& origem) {
    campos.juntar(origem.campos);
}

void CEItemLista::copiarCamposComSufixo(const CEItemLista& origem, const QString& sufixo) {
    if (sufixo.isEmpty()) return copiarCampos(origem);
    // The joined names are made once for the program; the batch goes in with one merge.
    const QString junto = QLatin1Char('_') + sufixo;
    std::vector<CamposItem::Campo> lote;
    lote.reserve(origem.campos.todos().size());
    for (const CamposItem::Campo& campo : origem.campos.todos())
        lote.push_back({CamposItem::numeroComSufixo(campo.nome, junto), campo.valor});
    std::sort(lote.begin(), lote.end(), [](const CamposItem::Campo& a, const CamposItem::Campo& b) {
        return a.nome < b.nome;
    });
    campos.juntarOrdenados(lote);
}

namespace {
const QString& NomeReg() {
    static const QString nome("reg");
    return nome;
}
}  // namespace

void CEItemLista::paraLisp() const {
    // The texts are not copied: the host builds `reg` straight from them. Items are
    // published one at a time, from the command thread, into the same list of pairs.
    static std::vector<zvsdk::StringPair> pares;
    pares.clear();
    const QString* const* nomes = CamposItem::nomes();
    for (const CamposItem::Campo& campo : campos.todos())
        pares.push_back({nomes[campo.nome], &campo.valor});
    CICad::SetParesLisp(NomeReg(), pares);
    entidadeParaLisp();
}

void CEItemLista::entidadeParaLisp() const {
    if (ids.empty()) return;
    static const QString nomeEname("ename");
    zvsdk::ResultBuffer ename;
    ename.restype = zvsdk::RTENAME;
    ename.rlname = ids.front().entityName();
    CICad::SetChainLisp(nomeEname, &ename);
}

void CEItemLista::limparLisp() {
    CICad::SetNilLisp(NomeReg());
}

QString CEItemLista::textoCampos() const {
    QString texto;
    for (auto it = campos.constBegin(); it != campos.constEnd(); ++it)
        texto += it.key() + ' ';
    return texto;
}
