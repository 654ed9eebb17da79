#pragma once
// The catalogue tool of the command-line host ("zvhost catalogue"): what the settings point
// at, whether it opens, its schema, one statement, one look-up as the readers run it, and
// the making of an SQLite catalogue from SQL scripts. It writes through a callback so the
// host keeps its own streams.
#include <QString>
#include <QStringList>

class CIFerramentaCatalogo {
public:
    // Channel 1 is the output, 2 the errors; text in UTF-8.
    using Escrita = void (*)(void* contexto, int canal, const char* texto);
    CIFerramentaCatalogo(Escrita escrita, void* contexto);

    // The tool's arguments (after "catalogue"); the exit status: 0 done, 1 failed,
    // 2 a usage error.
    int Executar(const QStringList& argumentos);
    static QString Uso();
    // The look-up operations and the arguments each takes.
    static QStringList Operacoes();

private:
    int Verificar();
    int Sql(const QString& instrucao);
    int Consulta(const QStringList& argumentos);
    int Construir(const QStringList& argumentos);
    int Configurar(const QStringList& atribuicoes);
    void Saida(const QString& linha);
    void Erro(const QString& linha);

    Escrita escrita_;
    void* contexto_;
};
