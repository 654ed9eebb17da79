#include "CEDialetoCatalogo.h"

#include "settings/CIRegistro.h"

#include <QRegularExpression>

namespace {

// Debian's names of the unixODBC drivers for Access files and for SQL Server.
const char* const kDriverMdb = "MDBTools";
const char* const kDriverTds = "FreeTDS";
// The instance that "LOCALDB" names when `DBServer` is empty.
const char* const kInstanciaLocal = "FV2022SP0";

// A value of an ODBC connection text; braces keep separators inside it.
QString ValorOdbc(const QString& valor) {
    if (!valor.contains(QRegularExpression("[;{}=\\s]"))) return valor;
    return "{" + QString(valor).replace("}", "}}") + "}";
}

CEDialetoCatalogo::Familia FamiliaDoMotor(CEDialetoCatalogo::Motor motor) {
    switch (motor) {
        case CEDialetoCatalogo::Mdb:
            return CEDialetoCatalogo::Arquivo;
        case CEDialetoCatalogo::Sqlite:
            return CEDialetoCatalogo::Embutido;
        case CEDialetoCatalogo::Odbc:
            return CEDialetoCatalogo::OutroServidor;
        default:
            return CEDialetoCatalogo::ServidorSql;
    }
}

QString TextoSqlServer() {
    // "host,port" is how users write a port; the driver wants it apart.
    const QString servidor = CIRegistro::DBServer();
    const int virgula = servidor.indexOf(',');
    QString texto = QString("DRIVER={%1};SERVER=%2;").arg(kDriverTds);
    texto = texto.arg(ValorOdbc(virgula < 0 ? servidor : servidor.left(virgula).trimmed()));
    if (virgula >= 0) texto += "PORT=" + servidor.mid(virgula + 1).trimmed() + ";";
    return texto + "DATABASE=" + ValorOdbc(CIRegistro::DBName()) + ";TDS_Version=7.4;";
}

}  // namespace

CEDialetoCatalogo::CEDialetoCatalogo(Motor motor)
    : motor_(motor), familia_(FamiliaDoMotor(motor)) {}

CEDialetoCatalogo CEDialetoCatalogo::DaConfiguracao() {
    return CEDialetoCatalogo(MotorDaPalavra(CIRegistro::Database()));
}

CEDialetoCatalogo::Motor CEDialetoCatalogo::MotorDaPalavra(const QString& palavra) {
    for (Motor motor : {Sqlite, Mdb, SqlServer, LocalDb, Odbc})
        if (palavra == PalavraDoMotor(motor)) return motor;
    return Nenhum;
}

QString CEDialetoCatalogo::PalavraDoMotor(Motor motor) {
    switch (motor) {
        case Sqlite:
            return "SQLITE";
        case Mdb:
            return "MDB";
        case SqlServer:
            return "SQLSERVER";
        case LocalDb:
            return "LOCALDB";
        case Odbc:
            return "ODBC";
        default:
            return {};
    }
}

QString CEDialetoCatalogo::NomeFamilia() const {
    switch (familia_) {
        case Arquivo:
            return "Access file";
        case Embutido:
            return "SQLite";
        case ServidorSql:
            return "SQL Server";
        case Postgres:
            return "PostgreSQL";
        default:
            return "other server";
    }
}

void CEDialetoCatalogo::DefinirServidor(QSqlDriver::DbmsType tipo) {
    if (motor_ != Odbc) return;
    if (tipo == QSqlDriver::PostgreSQL)
        familia_ = Postgres;
    else if (tipo == QSqlDriver::MSSqlServer || tipo == QSqlDriver::Sybase)
        familia_ = ServidorSql;
    else if (tipo == QSqlDriver::SQLite)
        familia_ = Embutido;
    else
        familia_ = OutroServidor;
}

CEDialetoCatalogo::Ligacao CEDialetoCatalogo::LigacaoDaConfiguracao() const {
    Ligacao ligacao;
    switch (motor_) {
        case Sqlite:
            ligacao.arquivo = CIRegistro::NetworkZV() + CIRegistro::DBName();
            ligacao.driver = "QSQLITE";
            ligacao.texto = ligacao.arquivo;
            break;
        case Mdb:
            // Nothing is put between the folder and the name: the folder ends in its separator.
            ligacao.arquivo = CIRegistro::NetworkZV() + CIRegistro::DBName();
            ligacao.driver = "QODBC";
            ligacao.texto =
                QString("DRIVER={%1};DBQ=%2;").arg(kDriverMdb, ValorOdbc(ligacao.arquivo));
            break;
        case SqlServer:
            ligacao.driver = "QODBC";
            ligacao.texto = TextoSqlServer();
            ligacao.usuario = CIRegistro::DBUser();
            ligacao.senha = CIRegistro::DBPass();
            break;
        case LocalDb: {
            const QString servidor = CIRegistro::DBServer();
            ligacao.texto = "Server=(localdb)\\MSSQLLocalDB;Database=" +
                            (servidor.isEmpty() ? QString(kInstanciaLocal) : servidor) + ";";
            break;
        }
        case Odbc:
            ligacao.driver = "QODBC";
            ligacao.texto = CIRegistro::DBName();
            ligacao.usuario = CIRegistro::DBUser();
            ligacao.senha = CIRegistro::DBPass();
            break;
        default:
            break;
    }
    return ligacao;
}

QString CEDialetoCatalogo::TextoSemSenha(const QString& texto) {
    static const QRegularExpression senha("(PWD|PASSWORD)\\s*=\\s*(\\{([^}]|\\}\\})*\\}|[^;]*)",
                                          QRegularExpression::CaseInsensitiveOption);
    return QString(texto).replace(senha, "\\1=****");
}

QString CEDialetoCatalogo::Texto(int largura) const {
    const bool arquivo = familia_ == Arquivo || familia_ == Embutido;
    return QString(arquivo ? "char(%1)" : "varchar(%1)").arg(largura);
}

QString CEDialetoCatalogo::Logico() const {
    return familia_ == Postgres ? "SMALLINT" : "BIT";
}

QString CEDialetoCatalogo::InteiroDe(const QString& expressao) const {
    switch (familia_) {
        case Arquivo:
            return "val(" + expressao + ")";
        case ServidorSql:
            return "convert(INT, " + expressao + ")";
        default:
            return "CAST(" + expressao + " AS INTEGER)";
    }
}

QString CEDialetoCatalogo::Trecho(const QString& expressao, int inicio, int tamanho) const {
    const QString funcao = familia_ == Arquivo    ? "MID"
                           : familia_ == Embutido ? "substr"
                                                  : "SUBSTRING";
    return QString("%1(%2, %3, %4)").arg(funcao, expressao).arg(inicio).arg(tamanho);
}

QString CEDialetoCatalogo::AlargarColuna(const QString& tabela, const QString& coluna,
                                         const QString& tipo) const {
    if (!LimitaLargura()) return {};
    if (familia_ == Postgres)
        return "ALTER TABLE " + tabela + " ALTER COLUMN " + coluna + " TYPE " + tipo;
    return "ALTER TABLE " + tabela + " ALTER COLUMN " + coluna + " " + tipo;
}

QString CEDialetoCatalogo::ConsultaLargura(const QString& tabela, const QString& coluna) const {
    if (familia_ == Arquivo || familia_ == Embutido) return {};
    return "SELECT CHARACTER_MAXIMUM_LENGTH FROM INFORMATION_SCHEMA.COLUMNS WHERE "
           "UPPER(TABLE_NAME) = '" +
           tabela.toUpper() + "' AND UPPER(COLUMN_NAME) = '" + coluna.toUpper() + "'";
}

QString CEDialetoCatalogo::ConsultaTabelas() const {
    const QString servidores =
        "SELECT TABLE_NAME FROM INFORMATION_SCHEMA.TABLES WHERE TABLE_TYPE = 'BASE TABLE'";
    switch (familia_) {
        case Embutido:
            return "SELECT name FROM sqlite_master WHERE type = 'table'";
        case ServidorSql:
            return servidores;
        case Postgres:
            return servidores + " AND TABLE_SCHEMA NOT IN ('pg_catalog', 'information_schema')";
        default:
            return {};
    }
}

QString CEDialetoCatalogo::NomeColuna(const QString& nome) const {
    if (familia_ != Postgres || nome != nome.toLower()) return nome;
    return nome.toUpper();
}
