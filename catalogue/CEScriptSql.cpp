#include "CEScriptSql.h"

#include <QFile>

namespace {

void Fecha(QString& atual, QStringList& instrucoes) {
    const QString instrucao = atual.trimmed();
    if (!instrucao.isEmpty()) instrucoes << instrucao;
    atual.clear();
}

}  // namespace

QStringList CEScriptSql::Instrucoes(const QString& texto) {
    QStringList instrucoes;
    QString atual;
    bool aspas = false;
    for (int i = 0; i < texto.size(); ++i) {
        const QChar c = texto[i];
        if (c == '\'') aspas = !aspas;  // a doubled quote toggles twice and stays inside
        if (!aspas && c == '-' && i + 1 < texto.size() && texto[i + 1] == '-') {
            while (i < texto.size() && texto[i] != '\n')
                ++i;
            atual += '\n';
            continue;
        }
        if (!aspas && c == ';') {
            Fecha(atual, instrucoes);
            continue;
        }
        atual += c;
    }
    Fecha(atual, instrucoes);
    return instrucoes;
}

bool CEScriptSql::LerArquivo(const QString& caminho, QStringList* instrucoes) {
    QFile arquivo(caminho);
    if (!arquivo.open(QIODevice::ReadOnly)) return false;
    *instrucoes = Instrucoes(QString::fromUtf8(arquivo.readAll()));
    return true;
}
