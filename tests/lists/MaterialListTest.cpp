// The material list from end to end through zvhost, on a generated project with the demo
// catalogue: quantities against a count made from the drawing, and a template whose
// function fails.
#include "ProductFolder.h"
#include "QtPrinters.h"
#include "cad/CICad.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"

#include <gtest/gtest.h>

#include <QCryptographicHash>
#include <QMap>
#include <QSet>
#include <QSqlDatabase>
#include <QSqlQuery>
#include <QVariant>

namespace {

class MaterialListTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new zvtest::ProductFolder;
        const QString problema =
            pasta_->prepare({"--seed", "5", "--terminals", "80", "--pages", "6"});
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
    }
    static void TearDownTestSuite() { delete pasta_; }

    // A template of the suite: the demo's material template, then `texto`.
    static QStringList Modelo(const QString& nome, const QByteArray& texto) {
        QFile arquivo(pasta_->path("produto/templates/" + nome));
        EXPECT_TRUE(arquivo.open(QIODevice::WriteOnly));
        arquivo.write("(load (strcat *DIR_ZVCFG_TEMPL* \"materiais.grf\"))\n" + texto + "\n");
        return {"--eval", "(setq *DEF_LISTA_MATERIAL* \"" + nome + "\")"};
    }
    static zvtest::HostRun Lista(const QStringList& extra, const QString& saida) {
        QStringList args = {"--quiet", "--load", pasta_->path("produto/config/zvconfig.lsp")};
        args << extra << pasta_->project();
        if (!saida.isEmpty()) args << "-o" << saida;
        args << "gerarListaMateriaisGrf";
        return pasta_->zvhost(args);
    }
    // Rows of the list: block name prefix and the attribute values by tag.
    struct Linha {
        QString bloco;
        QHash<QString, QString> valores;
    };
    static std::vector<Linha> Linhas(const QString& arquivo) {
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        std::vector<Linha> linhas;
        for (zvdb::Entity* e : db->modelSpace()->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
            if (!ref || !ref->blockName().starts_with("BLK_CTR_LST_DET")) continue;
            Linha linha{QString::fromStdString(std::string(ref->blockName())), {}};
            for (zvdb::Attribute* a : ref->attributes())
                linha.valores.insert(QString::fromStdString(std::string(a->tag())),
                                     QString::fromStdString(std::string(a->textValue())));
            linhas.push_back(linha);
        }
        return linhas;
    }
    static QByteArray Hash(const QString& arquivo) {
        QFile f(arquivo);
        EXPECT_TRUE(f.open(QIODevice::ReadOnly));
        return QCryptographicHash::hash(f.readAll(), QCryptographicHash::Sha256);
    }
    static zvtest::ProductFolder* pasta_;
};

zvtest::ProductFolder* MaterialListTest::pasta_ = nullptr;

// The catalogue as the test reads it, with plain SQL.
class Catalogo {
public:
    explicit Catalogo(const QString& arquivo) {
        db_ = QSqlDatabase::addDatabase("QSQLITE", "mao");
        db_.setDatabaseName(arquivo);
        EXPECT_TRUE(db_.open());
    }
    ~Catalogo() {
        db_.close();
        db_ = QSqlDatabase();
        QSqlDatabase::removeDatabase("mao");
    }
    bool Listada(const QString& chave, const QString& norma) {
        QSqlQuery q(db_);
        q.prepare("select ZV_LISTA from BDZV where ZV_KEY = ? and ZV_KEY_NOR = ?");
        q.addBindValue(chave);
        q.addBindValue(norma);
        return q.exec() && q.next() && q.value(0).toString().toUpper() == "S";
    }
    std::vector<std::pair<QString, int>> Acessorios(const QString& chave) {
        std::vector<std::pair<QString, int>> lista;
        QSqlQuery q(db_);
        q.prepare("select VL_KEY_B, VL_QTDE from BDVINCL where VL_KEY_A = ?");
        q.addBindValue(chave);
        if (q.exec())
            while (q.next())
                lista.emplace_back(q.value(0).toString(), q.value(1).toInt());
        return lista;
    }

private:
    QSqlDatabase db_;
};

TEST_F(MaterialListTest, QuantitiesAgreeWithACountMadeFromTheDrawing) {
    const QStringList modelo = Modelo("contagem.grf",
                                      "(setq *IMP_VINCL* 2 PROC_SIMB_BARR \"1\" PBLCTOBORNE nil\n"
                                      "      PBLACERECUR nil *FILTRO_TEMPLATE* \"\")");
    const QString saida = pasta_->path("contagem.dxf");
    const zvtest::HostRun run = Lista(modelo, saida);
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    QMap<QString, int> lista;
    for (const Linha& linha : Linhas(saida))
        lista[linha.valores.value("VARIAVEL_CHAVE")] += linha.valores.value("VARIAVEL_QTD").toInt();

    // The same count by hand: every listed symbol of model space (a bus bar once per
    // relation), each with its QTD or 1, and each one's accessories from the catalogue and
    // from its own extended data, a unit a row with the owner's quantity.
    Catalogo catalogo(pasta_->path("dados/catalogo.db"));
    const auto db = zvdb::DxfLoader::loadFile(pasta_->project().toStdString());
    const QChar ff(0x0C);
    QMap<QString, int> mao;
    QSet<QString> barras, conectores;
    int acessoriosDeSimbolo = 0, paginas = 0;
    QSet<QString> layersPorChave[2];
    auto conta = [&](const QString& chave, const QString& norma, int qtd,
                     const CEListaXData& aditivos) {
        mao[chave] += qtd;
        QStringList contados;
        std::vector<std::pair<QString, int>> todos = catalogo.Acessorios(chave);
        for (size_t i = 0; i + 1 < aditivos.size(); i += 2) {
            todos.emplace_back(aditivos[i + 1].texto, aditivos[i].texto.toInt());
            ++acessoriosDeSimbolo;
        }
        for (const auto& [k, q] : todos)
            if (q > 0) contados << k;
        for (const auto& [k, q] : todos) {
            if (!catalogo.Listada(k, norma)) continue;
            if (q > 0)
                mao[k] += q * qtd;
            else if (!contados.contains(k))
                mao[k] += 0;
        }
    };
    for (zvdb::Entity* e : db->modelSpace()->entities()) {
        auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
        if (!ref) continue;
        const QString nome = QString::fromStdString(std::string(ref->blockName())).toUpper();
        const OdDbObjectId id(db.get(), ref->handle());
        if (nome.startsWith("PIN-")) {
            const CEListaXData pino = CICad::GetXData(id, "ZV_PINO");
            zvdb::Attribute* conector = ref->attribute("CONECTOR");
            if (!conector) conector = ref->attribute("CONNECTOR");
            if (pino.size() < 4 || !conector || conectores.contains(pino[0].texto)) continue;
            conectores.insert(pino[0].texto);
            if (catalogo.Listada(pino[1].texto, pino[2].texto)) mao[pino[1].texto] += 1;
            continue;
        }
        if (nome.startsWith('*') || nome.startsWith("BOR-")) continue;
        const CEListaXData dados = CICad::GetXData(id, "KVR_ZV");
        if (dados.empty()) continue;
        const QString chave = dados[0].texto.section(ff, 0, 0);
        const QString norma = dados[0].texto.section(ff, 1, 1);
        if (chave.isEmpty() || !catalogo.Listada(chave, norma)) continue;
        if (nome.startsWith("BUS")) {
            zvdb::Attribute* relacao = ref->attribute("RELACAO");
            const QString texto =
                relacao ? QString::fromStdString(std::string(relacao->textValue())) : "";
            if (barras.contains(texto)) continue;
            barras.insert(texto);
        }
        zvdb::Attribute* qtd = ref->attribute("QTD");
        const QString q = qtd ? QString::fromStdString(std::string(qtd->textValue())) : "";
        conta(chave, norma, q.isEmpty() ? 1 : q.toInt(), CICad::GetXData(id, "ZV_VINC_ADITIVO"));
        layersPorChave[0].insert(chave + "@" + QString::fromStdString(std::string(ref->layer())));
        ++paginas;
    }
    int virtuais = 0;
    for (const auto& [nome, id] : CICad::GetEntradasDicionario({"ESQ_VIRTUAL_ZV"}, db.get())) {
        const CEListaXData dados = CICad::GetXData(id, "KVR_ZV");
        if (dados.empty()) continue;
        const QString chave = dados[0].texto.section(ff, 0, 0);
        const QString norma = dados[0].texto.section(ff, 1, 1);
        if (chave.isEmpty() || !catalogo.Listada(chave, norma)) continue;
        std::unique_ptr<zv::CEListaAtributos> atributos;
        CICad::GetAtributosVirtuais(id, atributos);
        QString q;
        for (int i = 0; atributos && i < atributos->Quantidade(); ++i)
            if ((*atributos)[i].GetTag() == "QTD") q = (*atributos)[i].GetValor();
        conta(chave, norma, q.trimmed().isEmpty() ? 1 : q.toInt(), {});
        ++virtuais;
    }
    // The project has what makes the count worth checking.
    EXPECT_GT(virtuais, 0);
    EXPECT_GT(acessoriosDeSimbolo, 0);
    EXPECT_GT(barras.size(), 0);
    QSet<QString> chavesEmVariasPaginas;
    QHash<QString, int> paginasPorChave;
    for (const QString& k : layersPorChave[0])
        if (++paginasPorChave[k.section('@', 0, 0)] == 2) chavesEmVariasPaginas.insert(k);
    EXPECT_FALSE(chavesEmVariasPaginas.isEmpty());
    EXPECT_EQ(lista, mao);
}

// A detail block of the test's own: the key, optionally a function that fails, and the
// description wrapped at 12 characters.
QStringList BlocoProprio(zvtest::ProductFolder& pasta, bool comErro) {
    zvdb::Database bloco;
    bloco.modelSpace()->addAttributeDefinition("VARIAVEL_CHAVE", "k", "ZV_KEY", {0, 0, 0}, 1);
    if (comErro)
        bloco.modelSpace()->addAttributeDefinition("FUNCAO_ERRO", "e", "(car 5)", {20, 0, 0}, 1);
    bloco.modelSpace()->addAttributeDefinition("VARIAVEL_DESC", "d", "DESCRICAO%M$12$L$ %",
                                               {40, 0, 0}, 1);
    const QString nome = comErro ? "LST_T_ERR" : "LST_T_DET";
    zvdb::DxfWriter::saveFile(bloco,
                              pasta.path("produto/DADOS/1/BLOCOS/" + nome + ".dxf").toStdString());
    QFile arquivo(pasta.path("produto/templates/" + nome + ".grf"));
    EXPECT_TRUE(arquivo.open(QIODevice::WriteOnly));
    arquivo.write(
        "(load (strcat *DIR_ZVCFG_TEMPL* \"materiais.grf\"))\n(setq LISTA_DETALHE "
        "\"DADOS\\\\1\\\\BLOCOS\\\\" +
        nome.toUtf8() + "\" LISTA_DETALHE_VINCL \"\" *IMP_VINCL* 0)\n");
    return {"--eval", "(setq *DEF_LISTA_MATERIAL* \"" + nome + ".grf\")"};
}

TEST_F(MaterialListTest, AFailingTemplateFunctionIsReportedAndNothingIsSaved) {
    const QStringList modelo = BlocoProprio(*pasta_, true);
    const QByteArray antes = Hash(pasta_->project());
    const QString saida = pasta_->path("erro.dxf");
    const zvtest::HostRun run = Lista(modelo, saida);
    // The list is made, the error shown; a command that met a LISP error is not saved.
    EXPECT_EQ(run.status, 3);
    EXPECT_TRUE(run.out.contains("; error: bad argument type") ||
                run.err.contains("; error: bad argument type"))
        << run.out.toStdString() << run.err.toStdString();
    EXPECT_FALSE(QFile::exists(saida));
    EXPECT_EQ(Hash(pasta_->project()), antes);
}

TEST_F(MaterialListTest, DescriptionsLongerThanARowGoOnInRowsOfTheirOwn) {
    const QStringList modelo = BlocoProprio(*pasta_, false);
    const QByteArray antes = Hash(pasta_->project());
    const QString saida = pasta_->path("longo.dxf");
    const zvtest::HostRun run = Lista(modelo, saida);
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(Hash(pasta_->project()), antes);
    const std::vector<Linha> linhas = Linhas(saida);
    ASSERT_FALSE(linhas.empty());
    int chaves = 0, continuacoes = 0;
    QString texto;
    for (const Linha& linha : linhas) {
        EXPECT_LE(linha.valores.value("VARIAVEL_DESC").size(), 12);
        if (linha.valores.value("VARIAVEL_CHAVE").isEmpty())
            ++continuacoes;
        else
            ++chaves;
    }
    EXPECT_GT(chaves, 0);
    EXPECT_GT(continuacoes, 0);
    // The rows of the first item read back as its description.
    QStringList partes;
    for (size_t i = 0; i < linhas.size(); ++i) {
        if (i > 0 && !linhas[i].valores.value("VARIAVEL_CHAVE").isEmpty()) break;
        partes << linhas[i].valores.value("VARIAVEL_DESC");
    }
    EXPECT_GT(partes.size(), 1);
    EXPECT_FALSE(partes.join(" ").trimmed().isEmpty());
}

}  // namespace
