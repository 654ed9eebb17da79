#pragma once
// The catalogue connection: one module-level object, made on first use, released at unload.
// It holds the connection and nothing else; the answers are cached by their readers.
#include "CEDialetoCatalogo.h"
#include "CERegistrosCatalogo.h"

#include <QHash>
#include <QString>
#include <QStringList>
#include <QtSql/QSqlDatabase>
#include <QtSql/QSqlQuery>

class CEConexaoCatalogo {
public:
    // The connection of this load, made on the first call. The engine opens on the first
    // statement.
    static CEConexaoCatalogo* ObterCatalogo();
    // Closes and frees the connection if it was ever made; harmless otherwise.
    static void LiberarCatalogo();
    static bool Existe();

    // Runs a statement and gives its rows. When the engine refuses it and `atualizar` is
    // set, the schema upgrades run and the statement runs once more, showing its failure;
    // with `mostrar` alone a failure is shown in a message box. No rows when no catalogue
    // opens or the statement fails.
    CERegistrosCatalogo Consultar(const QString& instrucao, bool atualizar = false,
                                  bool mostrar = false);
    // A look-up of one shape asked again and again with other values: `modelo` is its text
    // with a `?` for each value, `instrucao` the same statement with the values pasted in.
    // The shape names its columns. On an SQLite catalogue it is compiled once and run again with
    // the new values until the catalogue changes; otherwise, or when that fails, `instrucao` runs
    // as Consultar(instrucao, true) does.
    CERegistrosCatalogo ConsultarValores(const QString& modelo, const QStringList& valores,
                                         const QString& instrucao);
    // Runs a statement without rows; false when there is no catalogue or it failed (the
    // failure goes to the log).
    bool Executar(const QString& instrucao);

    // Opens the catalogue of the settings when it is not open; false when none opens.
    bool Conectar();
    bool Conectado() const { return banco_.isOpen(); }
    // The engine and SQL family; the family of an ODBC source is known once it is open.
    const CEDialetoCatalogo& Dialeto() const { return dialeto_; }
    // The connection text of the last opening, without its password.
    QString TextoConexao() const { return CEDialetoCatalogo::TextoSemSenha(texto_); }

    // Does a table, or a column of it, exist on the open catalogue? Asked of the engine by
    // a statement that reads nothing, so every engine answers the same way.
    bool ExisteTabela(const QString& tabela);
    bool ExisteColuna(const QString& tabela, const QString& coluna);
    // The declared width of a character column; -1 when the engine doesn't tell.
    int LarguraColuna(const QString& tabela, const QString& coluna);

    // What the catalogue of the settings holds. Only an empty database or a catalogue of
    // this product takes the upgrades' tables.
    enum Conteudo {
        SemConexao,  // nothing opens
        Ilegivel,    // it opens, but no statement runs on it (a file that is no database)
        Vazio,       // no table at all
        Catalogo,    // a table that every catalogue has
        Outro,       // tables, but none of a catalogue
    };
    Conteudo Examinar();
    // The tables that tell a catalogue of this product.
    static const QStringList& TabelasDoCatalogo();

    // Statements sent to the engine by this object, and the last one with its error.
    int InstrucoesEnviadas() const { return enviadas_; }
    QString UltimaInstrucao() const { return ultima_; }
    QString UltimoErro() const { return erro_; }

    // The text shown for a failed statement: at most 47 characters and "..." when it has
    // 51 or more.
    static QString InstrucaoCortada(const QString& instrucao);

private:
    CEConexaoCatalogo();
    ~CEConexaoCatalogo();
    CEConexaoCatalogo(const CEConexaoCatalogo&) = delete;
    CEConexaoCatalogo& operator=(const CEConexaoCatalogo&) = delete;

    // Runs the statement on the open connection; an answer that did not run on failure.
    CERegistrosCatalogo Rodar(const QString& instrucao);
    // Brings SQLite's idea of the tables' shape up to date (another program may change it).
    void AtualizarEsquema();
    // The rows of a statement that ran.
    CERegistrosCatalogo Linhas(QSqlQuery& consulta) const;
    // The compiled statement of a shape, made on first use; null when the engine keeps
    // none or the shape does not compile.
    QSqlQuery* Preparada(const QString& modelo);
    // A write or an upgrade may change what a compiled statement reads: all go.
    void EsquecerPreparadas() { preparadas_.clear(); }
    bool Abrir(const CEDialetoCatalogo::Ligacao& ligacao);
    void Fechar();
    bool AvisoLocalDb();

    QString nome_;
    QSqlDatabase banco_;
    CEDialetoCatalogo dialeto_;
    QString texto_;
    bool avisouLocalDb_ = false;
    int enviadas_ = 0;
    QString ultima_;
    QString erro_;
    QHash<QString, QSqlQuery> preparadas_;
};
