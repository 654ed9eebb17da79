#pragma once
// The one place that knows the catalogue engines: how the setting `Database` picks one, how
// it is reached, and where its SQL differs from the others'.
#include <QString>
#include <QtSql/QSqlDriver>

class CEDialetoCatalogo {
public:
    // The engine named by `Database`.
    enum Motor { Nenhum, Sqlite, Mdb, SqlServer, LocalDb, Odbc };
    // The SQL family: what the statements may use. An ODBC source learns its family when
    // it opens.
    enum Familia { Arquivo, Embutido, ServidorSql, Postgres, OutroServidor };

    // How a connection is made: the Qt driver, its database text, user and password; the
    // file for the engines on a file. Empty driver: no connection can be made.
    struct Ligacao {
        QString driver;
        QString texto;
        QString usuario;
        QString senha;
        QString arquivo;
    };

    explicit CEDialetoCatalogo(Motor motor = Nenhum);
    // The dialect of the settings as they are now.
    static CEDialetoCatalogo DaConfiguracao();
    // The engine of a `Database` word, compared exactly: any other word, or none, is Nenhum.
    static Motor MotorDaPalavra(const QString& palavra);
    static QString PalavraDoMotor(Motor motor);

    Motor motor() const { return motor_; }
    Familia familia() const { return familia_; }
    QString NomeFamilia() const;
    // What the open connection tells of its server; only an ODBC source changes family.
    void DefinirServidor(QSqlDriver::DbmsType tipo);

    // The connection of the settings as they are now. The local engine of "LOCALDB" names
    // its instance in the text but has no driver here.
    Ligacao LigacaoDaConfiguracao() const;
    // A connection text fit to show: passwords replaced by stars.
    static QString TextoSemSenha(const QString& texto);

    // ---- SQL that differs
    // The file database of "MDB" takes the char forms, the servers the varchar forms.
    bool ArquivoAccess() const { return motor_ == Mdb; }
    QString Texto(int largura) const;
    QString Logico() const;
    // The integer value of a text expression.
    QString InteiroDe(const QString& expressao) const;
    // A piece of a text, from position `inicio` (from 1), `tamanho` characters long.
    QString Trecho(const QString& expressao, int inicio, int tamanho) const;
    // Does the engine hold character columns to their declared width?
    bool LimitaLargura() const { return familia_ != Embutido; }
    // The statement that widens a column to `tipo`; empty when the engine needs none.
    QString AlargarColuna(const QString& tabela, const QString& coluna, const QString& tipo) const;
    // A statement giving a column's declared width in its first column; empty when the
    // engine has no such view (the driver's record is asked then).
    QString ConsultaLargura(const QString& tabela, const QString& coluna) const;
    // A statement listing the tables of the database in its first column; empty when the
    // engine has none (the driver lists them then).
    QString ConsultaTabelas() const;
    // A column name as the readers know it: upper-case when the engine folded it to lower.
    QString NomeColuna(const QString& nome) const;

private:
    Motor motor_;
    Familia familia_;
};
