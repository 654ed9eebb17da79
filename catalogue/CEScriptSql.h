#pragma once
// An SQL script cut into statements: at each ";" outside quotes, without "--" comments.
// The engines run one statement at a time.
#include <QString>
#include <QStringList>

class CEScriptSql {
public:
    static QStringList Instrucoes(const QString& texto);
    // The statements of a UTF-8 file; false when it can't be read.
    static bool LerArquivo(const QString& caminho, QStringList* instrucoes);
};
