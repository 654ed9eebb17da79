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
    // The chain lives in one block: a list run publishes an item per row.
    std::vector<zvsdk::ResultBuffer> nos(size_t(campos.size()) * 5 + 2);
    size_t i = 0;
    auto no = [&nos, &i](short tipo, const QString* texto = nullptr) {
        zvsdk::ResultBuffer& n = nos[i];
        n.restype = tipo;
        if (texto) n.rstring = *texto;
        if (i > 0) nos[i - 1].rbnext = &n;
        ++i;
    };
    no(zvsdk::RTLB);
    for (auto it = campos.constBegin(); it != campos.constEnd(); ++it) {
        no(zvsdk::RTLB);
        no(zvsdk::RTSTR, &it.key());
        no(zvsdk::RTDOTE);
        no(zvsdk::RTSTR, &it.value());
        no(zvsdk::RTLE);
    }
    no(zvsdk::RTLE);
    CICad::SetChainLisp("reg", nos.data());
    if (ids.empty()) return;
    zvsdk::ResultBuffer ename;
    ename.restype = zvsdk::RTENAME;
    ename.rlname = ids.front().entityName();
    CICad::SetChainLisp("ename", &ename);
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
