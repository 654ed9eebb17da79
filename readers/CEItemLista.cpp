#include "CEItemLista.h"

#include "cad/CICad.h"

bool CEItemLista::obterCampo(const QString& chave, QString& valor) const {
    auto it = campos.constFind(chave);
    if (it == campos.constEnd()) return false;
    valor = it.value();
    return true;
}

void CEItemLista::definirCampoInteiro(const QString& chave, int valor) {
    definirCampo(chave, QString::number(valor));
}

void CEItemLista::definirCampoReal(const QString& chave, double valor, int decimais) {
    definirCampo(chave, ZVString::DeReal(valor, decimais));
}

void CEItemLista::copiarCampos(const CEItemLista& origem) {
    for (auto it = origem.campos.constBegin(); it != origem.campos.constEnd(); ++it)
        campos.insert(it.key(), it.value());
}

void CEItemLista::copiarCamposComSufixo(const CEItemLista& origem, const QString& sufixo) {
    if (sufixo.isEmpty()) return copiarCampos(origem);
    for (auto it = origem.campos.constBegin(); it != origem.campos.constEnd(); ++it)
        campos.insert(it.key() + "_" + sufixo, it.value());
}

void CEItemLista::paraLisp() const {
    zvsdk::ResultBuffer* cabeca = zvsdk::newNode(zvsdk::RTLB);
    zvsdk::ResultBuffer* cauda = cabeca;
    for (auto it = campos.constBegin(); it != campos.constEnd(); ++it) {
        cauda = cauda->rbnext = zvsdk::newNode(zvsdk::RTLB);
        cauda = cauda->rbnext = zvsdk::newString(it.key());
        cauda = cauda->rbnext = zvsdk::newNode(zvsdk::RTDOTE);
        cauda = cauda->rbnext = zvsdk::newString(it.value());
        cauda = cauda->rbnext = zvsdk::newNode(zvsdk::RTLE);
    }
    cauda->rbnext = zvsdk::newNode(zvsdk::RTLE);
    CICad::SetChainLisp("reg", cabeca);
    zvsdk::releaseChain(cabeca);
    if (ids.empty()) return;
    zvsdk::ResultBuffer* ename = zvsdk::newEntity(ids.front().entityName());
    CICad::SetChainLisp("ename", ename);
    zvsdk::releaseChain(ename);
}

void CEItemLista::limparLisp() {
    CICad::SetNilLisp("reg");
}

QString CEItemLista::textoCampos() const {
    QString texto;
    for (auto it = campos.constBegin(); it != campos.constEnd(); ++it)
        texto += it.key() + ' ';
    return texto;
}
