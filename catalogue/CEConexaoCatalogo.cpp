#include "CEConexaoCatalogo.h"

#include "CEAtualizacaoCatalogo.h"
#include "cad/CICad.h"
#include "settings/CIMensagens.h"

#include <QFileInfo>
#include <QVariant>
#include <QtSql/QSqlError>
#include <QtSql/QSqlField>
#include <QtSql/QSqlQuery>
#include <QtSql/QSqlRecord>

namespace {

CEConexaoCatalogo* conexao = nullptr;

// Messages of section ZVLISTAS.
const int kMsgSemMotorLocal = 950;
const int kMsgSemDriver = 951;

QString TextoDe(const QVariant& valor) {
    if (valor.isNull()) return {};
    if (valor.type() == QVariant::Bool) return valor.toBool() ? "1" : "0";
    if (valor.type() == QVariant::Double) return QString::number(valor.toDouble(), 'g', 15);
    return valor.toString();
}

QString DescricaoErro(const QSqlError& erro) {
    return erro.databaseText().isEmpty() ? erro.driverText() : erro.databaseText();
}

}  // namespace

CEConexaoCatalogo* CEConexaoCatalogo::ObterCatalogo() {
    if (!conexao) conexao = new CEConexaoCatalogo;
    return conexao;
}

void CEConexaoCatalogo::LiberarCatalogo() {
    delete conexao;
    conexao = nullptr;
}

bool CEConexaoCatalogo::Existe() {
    return conexao != nullptr;
}

CEConexaoCatalogo::CEConexaoCatalogo()
    : nome_(QString("zvcatalogo-%1").arg(quintptr(this), 0, 16)) {}

CEConexaoCatalogo::~CEConexaoCatalogo() {
    Fechar();
}

QString CEConexaoCatalogo::InstrucaoCortada(const QString& instrucao) {
    return instrucao.size() >= 51 ? instrucao.left(47) + "..." : instrucao;
}

CERegistrosCatalogo CEConexaoCatalogo::Consultar(const QString& instrucao, bool atualizar,
                                                 bool mostrar) {
    if (!Conectar()) return {};
    CERegistrosCatalogo registros = Rodar(instrucao);
    if (registros.Executada()) return registros;
    if (atualizar) {
        // A failing statement is how an old catalogue shows: upgrade it and try once more.
        CEAtualizacaoCatalogo(*this).Executar();
        return Consultar(instrucao, false, true);
    }
    if (mostrar) CICad::MessageBox("SQL ERROR: " + erro_ + "\n \n " + InstrucaoCortada(instrucao));
    return {};
}

CERegistrosCatalogo CEConexaoCatalogo::ConsultarValores(const QString& modelo,
                                                        const QStringList& valores,
                                                        const QString& instrucao) {
    if (!Conectar()) return {};
    if (QSqlQuery* preparada = Preparada(modelo)) {
        ++enviadas_;
        ultima_ = instrucao;
        erro_.clear();
        for (int i = 0; i < valores.size(); ++i)
            preparada->bindValue(i, valores[i]);
        if (preparada->exec()) {
            CERegistrosCatalogo registros = Linhas(*preparada);
            // A statement left open keeps the file locked against writers.
            preparada->finish();
            return registros;
        }
        // The text tells what went wrong, and upgrades as usual.
        preparadas_.remove(modelo);
    }
    return Consultar(instrucao, true);
}

QSqlQuery* CEConexaoCatalogo::Preparada(const QString& modelo) {
    if (dialeto_.motor() != CEDialetoCatalogo::Sqlite) return nullptr;
    auto it = preparadas_.find(modelo);
    if (it != preparadas_.end()) return &it.value();
    QSqlQuery consulta(banco_);
    consulta.setForwardOnly(true);
    if (!consulta.prepare(modelo)) return nullptr;
    return &preparadas_.insert(modelo, consulta).value();
}

bool CEConexaoCatalogo::Executar(const QString& instrucao) {
    if (!Conectar()) return false;
    EsquecerPreparadas();
    if (Rodar(instrucao).Executada()) return true;
    CICad::Log("Catalogue statement failed: " + erro_ + " - " + instrucao);
    return false;
}

bool CEConexaoCatalogo::Conectar() {
    if (banco_.isOpen()) return true;
    // After a failure every query tries again and shows why it fails: the settings may
    // have been put right meanwhile, and an attempt costs only the opening itself.
    dialeto_ = CEDialetoCatalogo::DaConfiguracao();
    if (dialeto_.motor() == CEDialetoCatalogo::LocalDb) return AvisoLocalDb();
    const CEDialetoCatalogo::Ligacao ligacao = dialeto_.LigacaoDaConfiguracao();
    texto_ = ligacao.texto;
    if (ligacao.driver.isEmpty()) return false;
    // A catalogue file that isn't there opens nothing and says nothing.
    const bool arquivo =
        dialeto_.motor() == CEDialetoCatalogo::Sqlite || dialeto_.motor() == CEDialetoCatalogo::Mdb;
    if (arquivo && !QFileInfo(ligacao.arquivo).isFile()) return false;
    if (!QSqlDatabase::isDriverAvailable(ligacao.driver)) {
        CICad::MessageBox(CIMensagens::Mensagem("ZVLISTAS", kMsgSemDriver) + "\n" + ligacao.driver);
        return false;
    }
    return Abrir(ligacao);
}

bool CEConexaoCatalogo::AvisoLocalDb() {
    if (!avisouLocalDb_) CICad::ImprimeMensagem(kMsgSemMotorLocal);
    avisouLocalDb_ = true;
    return false;
}

bool CEConexaoCatalogo::Abrir(const CEDialetoCatalogo::Ligacao& ligacao) {
    banco_ = QSqlDatabase::addDatabase(ligacao.driver, nome_);
    banco_.setDatabaseName(ligacao.texto);
    // Access files are read-only here: upgrades that would write fail like any statement.
    if (dialeto_.motor() == CEDialetoCatalogo::Mdb)
        banco_.setConnectOptions("SQL_ATTR_ACCESS_MODE=SQL_MODE_READ_ONLY");
    if (banco_.open(ligacao.usuario, ligacao.senha)) {
        dialeto_.DefinirServidor(banco_.driver()->dbmsType());
        CICad::Log("Catalogue opened: " + dialeto_.PalavraDoMotor(dialeto_.motor()) + " " +
                   TextoConexao());
        return true;
    }
    const QSqlError erro = banco_.lastError();
    CICad::MessageBox("Connection Error\nCode = " + erro.nativeErrorCode() +
                      "\nCode meaning = " + erro.driverText() + "\nSource = " + ligacao.driver +
                      "\nDescription = " + erro.databaseText());
    Fechar();
    return false;
}

void CEConexaoCatalogo::Fechar() {
    EsquecerPreparadas();
    if (!banco_.isValid()) return;
    banco_.close();
    banco_ = QSqlDatabase();
    QSqlDatabase::removeDatabase(nome_);
}

CERegistrosCatalogo CEConexaoCatalogo::Rodar(const QString& instrucao) {
    ++enviadas_;
    ultima_ = instrucao;
    erro_.clear();
    // Anything but a read may change the catalogue under the compiled statements.
    if (!preparadas_.isEmpty() && !instrucao.trimmed().startsWith("select", Qt::CaseInsensitive))
        EsquecerPreparadas();
    if (dialeto_.motor() == CEDialetoCatalogo::Sqlite && instrucao.contains('*'))
        AtualizarEsquema();
    QSqlQuery consulta(banco_);
    consulta.setForwardOnly(true);
    if (!consulta.exec(instrucao)) {
        erro_ = DescricaoErro(consulta.lastError());
        return {};
    }
    return Linhas(consulta);
}

void CEConexaoCatalogo::AtualizarEsquema() {
    // SQLite compiles a statement against the tables' shape it last saw and compiles it again
    // when it runs if another program changed that shape meanwhile; a row of "*" then has
    // another number of columns than the driver counted, which it does not survive. A read of
    // the schema table brings the shape up to date first.
    QSqlQuery esquema(banco_);
    esquema.setForwardOnly(true);
    esquema.exec("SELECT count(*) FROM sqlite_master");
}

CERegistrosCatalogo CEConexaoCatalogo::Linhas(QSqlQuery& consulta) const {
    const QSqlRecord registro = consulta.record();
    QStringList nomes;
    for (int i = 0; i < registro.count(); ++i)
        nomes << dialeto_.NomeColuna(registro.fieldName(i));
    CERegistrosCatalogo registros(nomes);
    while (consulta.next()) {
        QStringList valores;
        for (int i = 0; i < nomes.size(); ++i)
            valores << TextoDe(consulta.value(i));
        registros.AdicionarLinha(valores);
    }
    return registros;
}

bool CEConexaoCatalogo::ExisteTabela(const QString& tabela) {
    return Conectar() && Rodar("SELECT * FROM " + tabela + " WHERE 1=0").Executada();
}

bool CEConexaoCatalogo::ExisteColuna(const QString& tabela, const QString& coluna) {
    return Conectar() && Rodar("SELECT " + coluna + " FROM " + tabela + " WHERE 1=0").Executada();
}

int CEConexaoCatalogo::LarguraColuna(const QString& tabela, const QString& coluna) {
    if (!Conectar()) return -1;
    const QString consulta = dialeto_.ConsultaLargura(tabela, coluna);
    if (!consulta.isEmpty()) {
        const QString largura = Rodar(consulta).Primeiro("CHARACTER_MAXIMUM_LENGTH");
        if (!largura.isEmpty()) return largura.toInt();
    }
    // The driver's own description of the table, under the name as given or folded.
    for (const QString& nome : {tabela, tabela.toLower()}) {
        const QSqlRecord registro = banco_.record(nome);
        for (int i = 0; i < registro.count(); ++i)
            if (registro.fieldName(i).compare(coluna, Qt::CaseInsensitive) == 0)
                return registro.field(i).length();
    }
    return -1;
}

const QStringList& CEConexaoCatalogo::TabelasDoCatalogo() {
    static const QStringList tabelas = {"BDZV", "BDMENUS", "BDWIRE", "BDWENUS", "BDVERSAO"};
    return tabelas;
}

CEConexaoCatalogo::Conteudo CEConexaoCatalogo::Examinar() {
    if (!Conectar()) return SemConexao;
    // An engine on a file opens anything: only a statement tells a database.
    QStringList tabelas;
    const QString listagem = dialeto_.ConsultaTabelas();
    if (!listagem.isEmpty()) {
        const CERegistrosCatalogo linhas = Rodar(listagem);
        if (!linhas.Executada()) return Ilegivel;
        for (int i = 0; i < linhas.Linhas(); ++i)
            tabelas << linhas.Valor(i, 0);
    } else {
        tabelas = banco_.tables(QSql::Tables);
    }
    for (const QString& tabela : TabelasDoCatalogo())
        if (ExisteTabela(tabela)) return Catalogo;
    return tabelas.isEmpty() ? Vazio : Outro;
}
