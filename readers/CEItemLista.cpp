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

void CEItemLista::partilharNomes(QSet<QString>& nomes) {
    // Each key is swapped for the shared copy of the same text: its hash and place stay.
    for (auto it = campos.begin(); it != campos.end(); ++it) {
        auto nome = nomes.constFind(it.key());
        if (nome == nomes.constEnd()) nome = nomes.insert(it.key());
        if (!nome->isSharedWith(it.key())) const_cast<QString&>(it.key()) = *nome;
    }
}

void CEItemLista::paraLisp() const {
    // The texts are not copied: the host builds `reg` straight from them.
    std::vector<zvsdk::StringPair> pares;
    pares.reserve(size_t(campos.size()));
    for (auto it = campos.constBegin(); it != campos.constEnd(); ++it)
        pares.push_back({&it.key(), &it.value()});
    CICad::SetParesLisp("reg", pares);
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
