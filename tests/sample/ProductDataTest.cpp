// The product data: every block file the templates name is written, each holds layer "0"
// only and no block references, list rows carry their VARIAVEL and FUNCAO attributes, and the
// templates and the user configuration are LISP the host runs.
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/LayerRecord.h"
#include "sample/ProductDataWriter.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <set>

namespace {

class ProductData : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        dir_ = new QTemporaryDir;
        files_ = zvsample::ProductDataWriter(dir_->path().toStdString()).writeAll();
    }
    static void TearDownTestSuite() {
        delete dir_;
        dir_ = nullptr;
    }
    static std::unique_ptr<zvdb::Database> load(const QString& relative) {
        return zvdb::DxfLoader::loadFile(QString(dir_->path() + "/" + relative).toStdString());
    }
    static QTemporaryDir* dir_;
    static std::vector<std::string> files_;
};
QTemporaryDir* ProductData::dir_ = nullptr;
std::vector<std::string> ProductData::files_;

QString templateText(const QString& name) {
    QFile file(QStringLiteral(ZV_SOURCE_DIR "/data/templates/") + name);
    return file.open(QIODevice::ReadOnly) ? QString::fromUtf8(file.readAll()) : QString();
}

}  // namespace

TEST_F(ProductData, EveryFileHoldsLayerZeroOnlyAndNoReferences) {
    ASSERT_GT(files_.size(), 200u);
    for (const std::string& path : files_) {
        auto db = zvdb::DxfLoader::loadFile(path);
        ASSERT_NE(db, nullptr) << path;
        for (const zvdb::LayerRecord* layer : db->layers())
            EXPECT_EQ(layer->name(), "0") << path;
        std::size_t entities = 0;
        db->modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
            EXPECT_FALSE(entity.isType("INSERT")) << path;
            EXPECT_EQ(entity.layer(), "0") << path;
            ++entities;
        });
        EXPECT_GT(entities, 0u) << path;
    }
}

TEST_F(ProductData, EveryBlockTheTemplatesNameExists) {
    const QRegularExpression block(R"re("(DADOS\\\\[0-9]\\\\BLOCOS\\\\[A-Z0-9_]+)")re");
    int named = 0;
    for (const QString& name : QDir(ZV_SOURCE_DIR "/data/templates").entryList(QDir::Files)) {
        auto it = block.globalMatch(templateText(name));
        while (it.hasNext()) {
            QString relative = it.next().captured(1).replace("\\\\", "/") + ".dxf";
            EXPECT_TRUE(QFile::exists(dir_->path() + "/" + relative))
                << name.toStdString() << ": " << relative.toStdString();
            ++named;
        }
    }
    EXPECT_GT(named, 25);
}

TEST_F(ProductData, ListRowsCarryFieldsFunctionsAndTotals) {
    auto detail = load("DADOS/1/BLOCOS/LST_BORNE_DET.dxf");
    ASSERT_NE(detail, nullptr);
    std::set<std::string> fields;
    bool function = false;
    detail->modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        auto* definition = dynamic_cast<zvdb::Attribute*>(&entity);
        if (!definition) return;
        if (definition->tag().starts_with("VARIAVEL"))
            fields.insert(std::string(definition->textValue()));
        function = function || definition->tag().starts_with("FUNCAO");
    });
    for (const char* field : {"NUMERO", "RELACAO_INI", "RELACAO_FIM", "FIO_SEGINI"})
        EXPECT_TRUE(fields.count(field)) << field;
    EXPECT_TRUE(function);
    auto total = load("DADOS/1/BLOCOS/LST_MAT_TOT.dxf");
    ASSERT_NE(total, nullptr);
    EXPECT_EQ(total->modelSpace()->attributeDefinitions().size(), 1u);
    for (const char* view : {"DADOS/1/BLOCOS/TOPO_BX2_5_GY.dxf", "DADOS/2/BLOCOS/TOPO_DM4.dxf",
                             "DADOS/1/BLOCOS/REGUA_BX2_5_GY.dxf", "DADOS/1/BLOCOS/JMP_INI.dxf",
                             "DADOS/1/BLOCOS/LST_CABO_PRIM.dxf", "DADOS/1/BLOCOS/LST_MAT_ACE.dxf"})
        EXPECT_TRUE(QFile::exists(dir_->path() + "/" + view)) << view;
}

TEST(ProductLisp, TemplatesAndConfigurationRunInTheHostLisp) {
    QStringList files = {ZV_SOURCE_DIR "/data/config/zvconfig.lsp"};
    for (const QString& name : QDir(ZV_SOURCE_DIR "/data/templates").entryList(QDir::Files))
        if (name != "bornes-sequencial.grt") files << ZV_SOURCE_DIR "/data/templates/" + name;
    for (const QString& file : files) {
        QProcess host;
        host.start(ZV_BIN_DIR "/zvhost", {"lisp", file});
        ASSERT_TRUE(host.waitForFinished(60000));
        EXPECT_EQ(host.exitCode(), 0) << file.toStdString() << "\n"
                                      << host.readAllStandardError().toStdString();
    }
}

TEST(ProductLisp, TemplateSymbolsHaveTheShapesTheWritersRead) {
    QTemporaryDir dir;
    const QString probe = dir.filePath("probe.lsp");
    QFile file(probe);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    const QString templates = QStringLiteral(ZV_SOURCE_DIR "/data/templates/");
    file.write(QString("(setq *DIR_ZVCFG_TEMPL* \"%1\")\n"
                       "(load (strcat *DIR_ZVCFG_TEMPL* \"bornes.grt\"))\n"
                       "(princ (list (type *LINHAS_POR_PAGINA*) (type *NUMERO_COLUNA*)\n"
                       "  (type *Y_INIC_LISTA*) (type *ESPACO_HORIZONTAL*) (type TAM_DETALHE)\n"
                       "  (type *LISTA_DE_SORT*) *VISUALIZAR_JUMPER_CFG* *NUM_COLUNAS_CFG*))\n"
                       "(load (strcat *DIR_ZVCFG_TEMPL* \"bornes-sequencial.grt\"))\n"
                       "(princ (list *INIC_SEQUENCIAL* *COLUNA_SN* LISTA_DETALHE))\n")
                   .arg(templates)
                   .toUtf8());
    file.close();
    QProcess host;
    host.start(ZV_BIN_DIR "/zvhost", {"lisp", probe});
    ASSERT_TRUE(host.waitForFinished(60000));
    ASSERT_EQ(host.exitCode(), 0) << host.readAllStandardError().toStdString();
    EXPECT_EQ(host.readAllStandardOutput().toStdString(),
              "(INT INT REAL REAL STR LIST 1 3)(T nil DADOS\\1\\BLOCOS\\LST_BORNE_DET)");
}
