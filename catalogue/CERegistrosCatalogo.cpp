#include "CERegistrosCatalogo.h"

CERegistrosCatalogo::CERegistrosCatalogo(const QStringList& colunas)
    : executada_(true), colunas_(colunas) {
    // The first of two equal names wins, as a reader by name would find it.
    for (int i = 0; i < colunas_.size(); ++i)
        if (!indices_.contains(colunas_[i].toUpper())) indices_.insert(colunas_[i].toUpper(), i);
}

QString CERegistrosCatalogo::Valor(int linha, const QString& coluna) const {
    return Valor(linha, IndiceColuna(coluna));
}

QString CERegistrosCatalogo::Valor(int linha, int coluna) const {
    if (linha < 0 || linha >= linhas_.size()) return {};
    const QStringList& valores = linhas_[linha];
    return coluna >= 0 && coluna < valores.size() ? valores[coluna] : QString();
}

void CERegistrosCatalogo::AdicionarLinha(const QStringList& valores) {
    linhas_.append(valores);
}
