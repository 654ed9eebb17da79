// gerarListaBornesDwg through zvhost on a generated project with strips of the test's own
// added: strips of one terminal, numbers that are no numbers, jumpers to other strips,
// strips the picker or the filter empties, and missing block files.
#include "ProductFolder.h"
#include "QtPrinters.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "sample/XDataItems.h"

#include <gtest/gtest.h>

#include <QCryptographicHash>
#include <QFile>
#include <QMap>
#include <QRegularExpression>
#include <QSet>

#include <algorithm>
#include <map>
#include <memory>

namespace {

struct Borne {
    const char* regua;
    const char* numero;
    const char* jumper;
};

// What a drawn strip row shows: its terminals' numbers from left to right and the x of its
// jumper marks by kind.
struct Linha {
    QStringList numeros;
    QMap<QString, QList<double>> pontes;
    QStringList internos, externos;  // the elements above and below each terminal
};

class ComandoReguasTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new zvtest::ProductFolder;
        const QString problema = pasta_->prepare({"--seed", "5", "--terminals", "40"});
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
    }
    static void TearDownTestSuite() {
        delete pasta_;
        pasta_ = nullptr;
    }

    // The generated project with the terminals added on its first schematic page, far from
    // any wire: nothing is wired to them, only their jumpers can keep them.
    static QString Projeto(const QString& nome, const std::vector<Borne>& bornes) {
        auto db = zvdb::DxfLoader::loadFile(pasta_->project().toStdString());
        zvdb::BlockRecord* bloco = nullptr;
        std::string layer;
        for (zvdb::Entity* e : db->modelSpace()->entities())
            if (auto* ref = dynamic_cast<zvdb::BlockReference*>(e))
                if (ref->blockName().starts_with("BORNE") && ref->hasXData("KVR_ZV")) {
                    bloco = db->block(std::string(ref->blockName()));
                    layer = std::string(ref->layer());
                    break;
                }
        EXPECT_TRUE(bloco);
        if (!bloco) return {};
        double x = 5000;
        for (const Borne& b : bornes) {
            zvdb::BlockReference* ref =
                db->modelSpace()->addBlockReference(*bloco, {x, 5000, 0}, {1, 1, 1}, 0, layer);
            ref->addAttribute("REGUA", b.regua, {x + 2, 4997, 0}, 1.0);
            ref->addAttribute("NUMERO", b.numero, {x + 2, 4994, 0}, 1.0);
            if (*b.jumper) ref->addAttribute("JUMPER", b.jumper, {x + 2, 4991, 0}, 1.0);
            ref->setXData("KVR_ZV", zvsample::XDataItems().text("1001\f1").tags());
            x += 40;
        }
        const QString caminho = pasta_->path(nome);
        zvdb::DxfWriter::saveFile(*db, caminho.toStdString());
        return caminho;
    }

    // The shipped template with a few lines of the test's own behind it.
    static QString Modelo(const QString& nome, const QString& linhas) {
        QFile modelo(pasta_->path("produto/templates/" + nome + ".grx"));
        EXPECT_TRUE(modelo.open(QIODevice::WriteOnly));
        modelo.write("(load (strcat *DIR_ZVCFG_TEMPL* \"reguas.grx\"))\n" + linhas.toUtf8() + "\n");
        return nome + ".grx";
    }

    static zvtest::HostRun Desenha(const QString& projeto, const QString& saida,
                                   const QString& modelo, const QStringList& extra = {}) {
        QStringList args{"--quiet", "--load", pasta_->path("produto/config/zvconfig.lsp")};
        if (!modelo.isEmpty())
            args << "--eval"
                 << "(setq *DEF_LISTA_BOR_DES* \"" + modelo + "\")";
        args << extra << projeto << "-o" << saida << "gerarListaBornesDwg";
        return pasta_->zvhost(args);
    }

    // The strip rows of a drawing by strip name (a strip cut in two rows gives two).
    static std::multimap<QString, Linha> Linhas(const QString& arquivo) {
        std::multimap<QString, Linha> linhas;
        if (!QFile::exists(arquivo)) return linhas;
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        struct Marca {
            QString bloco, valor, interno, externo, layer;
            double x, y;
        };
        std::vector<Marca> marcas;
        for (zvdb::Entity* e : db->modelSpace()->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
            if (!ref || !ref->layer().starts_with("REGUAS$")) continue;
            QString valor, interno, externo;
            for (zvdb::Attribute* a : ref->attributes()) {
                const QString texto = QString::fromStdString(std::string(a->textValue()));
                if (a->tag() == "REGUA" || a->tag() == "VARIAVEL_NUMERO" ||
                    a->tag() == "VARIAVEL_NUMBER")
                    valor += texto;
                if (a->tag() == "VARIAVEL_REL_INI") interno = texto;
                if (a->tag() == "VARIAVEL_REL_FIM") externo = texto;
            }
            marcas.push_back({QString::fromStdString(std::string(ref->blockName())), valor, interno,
                              externo, QString::fromStdString(std::string(ref->layer())),
                              ref->position().x, ref->position().y});
        }
        std::sort(marcas.begin(), marcas.end(),
                  [](const Marca& a, const Marca& b) { return a.x < b.x; });
        for (const Marca& cab : marcas) {
            if (cab.bloco != "REGUA_CAB") continue;
            Linha linha;
            for (const Marca& m : marcas) {
                if (m.layer != cab.layer || m.y > cab.y + 0.01 || m.y < cab.y - 20) continue;
                if (m.bloco == "REGUA_BORNE" && std::abs(m.y - cab.y) < 0.01) {
                    linha.numeros << m.valor;
                    linha.internos << m.interno;
                    linha.externos << m.externo;
                } else if (m.bloco.startsWith("REGUA_PONTE"))
                    linha.pontes[m.bloco] << m.x;
            }
            linhas.insert({cab.valor, linha});
        }
        return linhas;
    }

    // A message as zvhost prints it, in English, the second language of the message file.
    static QString Mensagem(int numero) {
        QFile arquivo(QStringLiteral(ZV_SOURCE_DIR "/data/program/ZVListas.config"));
        if (!arquivo.open(QIODevice::ReadOnly)) return {};
        const QString texto = QString::fromUtf8(arquivo.readAll());
        auto achados =
            QRegularExpression("numero=\"" + QString::number(numero) + "\" texto=\"([^\"]+)\"")
                .globalMatch(texto);
        for (int lingua = 1; achados.hasNext(); ++lingua) {
            const QRegularExpressionMatch achado = achados.next();
            if (lingua == 2) return achado.captured(1);
        }
        return {};
    }

    // A block of the product's strip blocks, with the cells given (tag, default text).
    static void Bloco(const QString& nome,
                      const std::vector<std::pair<std::string, std::string>>& celulas) {
        zvdb::Database db;
        db.modelSpace()->addLwPolyline({{0, 0}, {5, 0}, {5, -10}, {0, -10}}, true);
        double y = -2;
        for (const auto& [tag, valor] : celulas)
            db.modelSpace()->addAttributeDefinition(tag, tag, valor, {0, y -= 2, 0}, 1.0);
        zvdb::DxfWriter::saveFile(
            db, pasta_->path("produto/DADOS/1/BLOCOS/" + nome + ".dxf").toStdString());
    }

    // The cells of each reference of a block, in drawing order: the tags' values joined by
    // "|", "-" for a tag the reference lacks.
    static QStringList Celulas(const QString& arquivo, const QString& nome,
                               const QStringList& tags) {
        QStringList linhas;
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        for (zvdb::Entity* e : db->modelSpace()->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
            if (!ref || ref->blockName() != nome.toStdString()) continue;
            QStringList valores;
            for (const QString& tag : tags) {
                zvdb::Attribute* a = ref->attribute(tag.toStdString());
                valores << (a ? QString::fromStdString(std::string(a->textValue())) : "-");
            }
            linhas << valores.join('|');
        }
        return linhas;
    }

    static QByteArray Hash(const QString& arquivo) {
        QFile f(arquivo);
        if (!f.open(QIODevice::ReadOnly)) return {};
        return QCryptographicHash::hash(f.readAll(), QCryptographicHash::Sha256);
    }

    static zvtest::ProductFolder* pasta_;
};

zvtest::ProductFolder* ComandoReguasTest::pasta_ = nullptr;

TEST_F(ComandoReguasTest, LoneStripsOddNumbersAndJumpersToOtherStrips) {
    const QString projeto = Projeto("estranhos.dxf", {
                                                         {"ZA", "1", "3"},
                                                         {"ZA", "2", ""},
                                                         {"ZA", "3", "1"},
                                                         {"ZA", "4", "9"},
                                                         {"ZA", "5", "2"},
                                                         {"ZB", "9", ""},
                                                         {"ZC", "1", "1"},
                                                         {"ZD", "PE", "N"},
                                                         {"ZD", "N", "PE"},
                                                         {"ZD", "A", "zz,,x"},
                                                     });
    ASSERT_FALSE(projeto.isEmpty());
    const QString saida = pasta_->path("estranhos-reguas.dxf");
    const zvtest::HostRun r = Desenha(projeto, saida, QString());
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    const auto linhas = Linhas(saida);
    // Bridged 1 and 3 stay, and 5, whose jumper names 2; 2 names none and goes, and 4's
    // jumper reaches only another strip's 9. 5 alone in its chain has no mark.
    ASSERT_EQ(linhas.count("ZA"), 1u);
    const Linha& za = linhas.find("ZA")->second;
    EXPECT_EQ(za.numeros, QStringList({"1", "3", "5"}));
    EXPECT_EQ(za.pontes.value("REGUA_PONTEI").size(), 1);
    EXPECT_EQ(za.pontes.value("REGUA_PONTEF").size(), 1);
    EXPECT_EQ(linhas.count("ZB"), 0u);
    // A strip of one terminal, bridged to itself: drawn, with no jumper mark.
    ASSERT_EQ(linhas.count("ZC"), 1u);
    EXPECT_EQ(linhas.find("ZC")->second.numeros, QStringList({"1"}));
    EXPECT_TRUE(linhas.find("ZC")->second.pontes.isEmpty());
    // Numbers that are no numbers: PE and N bridged and drawn, A's jumper finds nothing.
    ASSERT_EQ(linhas.count("ZD"), 1u);
    const Linha& zd = linhas.find("ZD")->second;
    QStringList numeros = zd.numeros;
    numeros.sort();
    EXPECT_EQ(numeros, QStringList({"N", "PE"}));
    EXPECT_EQ(zd.pontes.value("REGUA_PONTEI").size(), 1);
    EXPECT_EQ(zd.pontes.value("REGUA_PONTEF").size(), 1);

    // With every terminal kept, each added one is drawn.
    const QString todos = pasta_->path("estranhos-todos.dxf");
    ASSERT_EQ(
        Desenha(projeto, todos, Modelo("reguas-todos", "(setq *BORNES_SEM_LIG_GRX* T)")).status, 0);
    const auto todas = Linhas(todos);
    ASSERT_EQ(todas.count("ZA"), 1u);
    EXPECT_EQ(todas.find("ZA")->second.numeros, QStringList({"1", "2", "3", "4", "5"}));
    ASSERT_EQ(todas.count("ZB"), 1u);
    EXPECT_EQ(todas.find("ZB")->second.numeros, QStringList({"9"}));
    ASSERT_EQ(todas.count("ZD"), 1u);
    EXPECT_EQ(todas.find("ZD")->second.numeros.size(), 3);
}

TEST_F(ComandoReguasTest, TheDrawnTerminalsShowTheSidesTheTerminalExportLists) {
    const QString saida = pasta_->path("lados.dxf");
    zvtest::HostRun r = Desenha(pasta_->project(), saida, QString());
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    // The terminal export reads the sides with the terminal list's own reader.
    const QString csv = pasta_->path("bornes.csv");
    r = pasta_->zvhost({"--quiet", "--load", pasta_->path("produto/config/zvconfig.lsp"),
                        "--answer", "export:config=Completa", "--answer", "export:type=BORNES",
                        "--answer", "export:format=CSV", "--answer", "export:file=" + csv,
                        pasta_->project(), "exportacaoBornes"});
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    QFile arquivo(csv);
    ASSERT_TRUE(arquivo.open(QIODevice::ReadOnly));
    const QStringList linhasCsv = QString::fromUtf8(arquivo.readAll()).split('\n');
    ASSERT_GT(linhasCsv.size(), 2);
    const QStringList cabecalho = linhasCsv[0].trimmed().split(';');
    ASSERT_EQ(cabecalho.size(), 5) << linhasCsv[0].toStdString();
    QMap<QString, QPair<QString, QString>> exportados;
    for (const QString& linha : linhasCsv.mid(1)) {
        QStringList campos = linha.trimmed().split(';');
        if (campos.size() != 5) continue;
        for (QString& campo : campos)
            campo = campo.mid(1, campo.size() - 2);  // the quotes
        if (campos[0].isEmpty()) continue;           // an accessory
        bool numerico = false;
        const int numero = campos[1].toInt(&numerico);
        const QString chave = campos[0] + ":" + (numerico ? QString::number(numero) : campos[1]);
        exportados.insert(chave, {campos[2], campos[3]});
    }
    int desenhados = 0, comLado = 0;
    QSet<QString> vistos;
    for (const auto& [regua, linha] : Linhas(saida))
        for (int i = 0; i < linha.numeros.size(); ++i) {
            const QString chave = regua + ":" + linha.numeros[i];
            ++desenhados;
            vistos.insert(chave);
            ASSERT_TRUE(exportados.contains(chave))
                << chave.toStdString() << " in " << linha.numeros.join(",").toStdString();
            EXPECT_EQ(linha.internos[i], exportados[chave].first) << chave.toStdString();
            EXPECT_EQ(linha.externos[i], exportados[chave].second) << chave.toStdString();
            if (!linha.internos[i].isEmpty() || !linha.externos[i].isEmpty()) ++comLado;
        }
    EXPECT_GT(comLado, desenhados / 2);
    // No terminal with something wired is left out.
    for (auto it = exportados.cbegin(); it != exportados.cend(); ++it) {
        if (it.value().first.isEmpty() && it.value().second.isEmpty()) continue;
        EXPECT_TRUE(vistos.contains(it.key())) << it.key().toStdString();
    }
    // The components wired to the strips stand under them.
    int simbolos = 0;
    const auto db = zvdb::DxfLoader::loadFile(saida.toStdString());
    for (zvdb::Entity* e : db->modelSpace()->entities())
        if (auto* ref = dynamic_cast<zvdb::BlockReference*>(e))
            simbolos += ref->blockName() == "REGUA_COMP" && ref->layer().starts_with("REGUAS$") &&
                        ref->hasXData("KVR_ZV_REPRESENTACAO");
    EXPECT_GT(simbolos, 0);
}

TEST_F(ComandoReguasTest, NoTerminalLeftDrawsNoPageAndSaysSo) {
    const QString semBornes = Mensagem(64);
    ASSERT_FALSE(semBornes.isEmpty());
    const QByteArray antes = Hash(pasta_->project());
    // A picked strip that the project does not have.
    const QString saida = pasta_->path("nenhuma.dxf");
    zvtest::HostRun r = Desenha(pasta_->project(), saida,
                                Modelo("reguas-escolha", "(setq *SEL_REGUA_BORNE_CFG* T)"),
                                {"--answer", "strips=NAO_HA"});
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains(semBornes)) << r.out.toStdString();
    EXPECT_TRUE(Linhas(saida).empty());
    // A filter that refuses every terminal.
    const QString filtrada = pasta_->path("filtrada.dxf");
    r = Desenha(pasta_->project(), filtrada,
                Modelo("reguas-filtro", "(setq *FILTRO_TEMPLATE* \"(= 1 2)\")"));
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains(semBornes)) << r.out.toStdString();
    const auto db = zvdb::DxfLoader::loadFile(filtrada.toStdString());
    for (zvdb::Entity* e : db->modelSpace()->entities())
        EXPECT_FALSE(e->layer().starts_with("REGUAS$")) << e->layer();
    EXPECT_EQ(Hash(pasta_->project()), antes);
}

// The template's filter keeps a component out as it does a terminal: a wired component it
// refuses stands under no strip, and the others still do.
TEST_F(ComandoReguasTest, TheTemplatesFilterKeepsARefusedComponentFromTheStrips) {
    // The handles of the components drawn under the strips, which their symbols link back to.
    const auto sobReguas = [](const QString& arquivo) {
        QStringList handles;
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        for (zvdb::Entity* e : db->modelSpace()->entities())
            if (auto* ref = dynamic_cast<zvdb::BlockReference*>(e))
                if (ref->layer().starts_with("REGUAS$")) {
                    const auto itens = ref->xdataItems("KVR_ZV_REPRESENTACAO");
                    if (itens.empty()) continue;
                    const std::string_view handle = itens.back().value;
                    handles << QString::fromUtf8(handle.data(), int(handle.size()));
                }
        handles.sort();
        return handles;
    };
    const QString todos = pasta_->path("componentes-todos.dxf");
    zvtest::HostRun r = Desenha(pasta_->project(), todos, QString());
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    const QStringList antes = sobReguas(todos);
    ASSERT_GT(antes.size(), 1);
    const QString recusado = antes.front();
    ASSERT_NE(antes.back(), recusado);
    const QString filtrada = pasta_->path("componente-recusado.dxf");
    r = Desenha(pasta_->project(), filtrada,
                Modelo("reguas-recusa",
                       "(setq *FILTRO_TEMPLATE* \"(/= (cdr (assoc \\\"HANDLE\\\" reg)) \\\"" +
                           recusado + "\\\")\")"));
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    const QStringList depois = sobReguas(filtrada);
    EXPECT_FALSE(depois.contains(recusado)) << recusado.toStdString();
    EXPECT_TRUE(depois.contains(antes.back())) << antes.back().toStdString();
}

TEST_F(ComandoReguasTest, AMissingBlockFileEndsTheCommandAndNothingIsSaved) {
    const QByteArray antes = Hash(pasta_->project());
    const QString saida = pasta_->path("sem-bloco.dxf");
    const zvtest::HostRun r =
        Desenha(pasta_->project(), saida,
                Modelo("reguas-sem-bloco",
                       "(setq *BLOCO_PONTE_GRX* \"DADOS\\\\1\\\\BLOCOS\\\\NAO_EXISTE\")"));
    EXPECT_EQ(r.status, 3) << r.err.toStdString();
    const QString texto = r.out + r.err;
    ASSERT_FALSE(Mensagem(150).isEmpty());
    EXPECT_TRUE(texto.contains(Mensagem(150))) << texto.toStdString();
    EXPECT_TRUE(texto.contains("NAO_EXISTE.dwg")) << texto.toStdString();
    EXPECT_FALSE(QFile::exists(saida));
    EXPECT_EQ(Hash(pasta_->project()), antes);
}

// The terminal block's cells may name any field of the terminal, of a side's neighbour or of
// a wire: a block of plain cells shows the same as one that also holds a function that sees
// every field, and a function that looks a field up by name shows what it would see with
// every field kept.
TEST_F(ComandoReguasTest, TerminalCellsShowTheNeighboursFieldsThatAFunctionCellWouldSee) {
    const std::vector<std::pair<std::string, std::string>> celulas{
        {"VARIAVEL_NUMERO", "NUMERO"},
        {"VARIAVEL_NUMBER", "NUMBER"},
        {"VARIAVEL_A", " DESCRICAO_FIM "},
        {"VARIAVEL_B", "FABRICANTE_INI"},
        {"COR_SEGFIM", ""},
        {"REFERENCIA_FIM", "?"},
        {"VARIAVEL_C", "SECAO_MM2_SEGINI"},
        {"VARIAVEL_E", "DESCRICAO"},
        {"FABRICANTE", ""}};
    const std::pair<std::string, std::string> porNome{"FUNCAO_D",
                                                      "(cdr (assoc \"DESCRICAO_INI\" reg))"};
    const std::pair<std::string, std::string> todos{"FUNCAO_N", "(itoa (length reg))"};
    auto com = [&celulas](std::vector<std::pair<std::string, std::string>> mais) {
        mais.insert(mais.begin(), celulas.begin(), celulas.end());
        return mais;
    };
    Bloco("REGUA_BORNE_C", celulas);
    Bloco("REGUA_BORNE_F", com({todos, porNome}));
    Bloco("REGUA_BORNE_D", com({porNome}));
    const QStringList tags{"VARIAVEL_NUMERO", "VARIAVEL_NUMBER", "VARIAVEL_A",
                           "VARIAVEL_B",      "COR_SEGFIM",      "REFERENCIA_FIM",
                           "VARIAVEL_C",      "VARIAVEL_E",      "FABRICANTE"};
    const auto desenha = [&](const QString& nome, const QStringList& quais) {
        const QString saida = pasta_->path(nome + ".dxf");
        const zvtest::HostRun r = Desenha(
            pasta_->project(), saida,
            Modelo(nome, "(setq *BLOCO_BORNE_GRX* \"DADOS\\\\1\\\\BLOCOS\\\\" + nome + "\")"));
        EXPECT_EQ(r.status, 0) << r.err.toStdString();
        return Celulas(saida, nome, quais);
    };
    const QStringList simples = desenha("REGUA_BORNE_C", tags);
    const QStringList comFuncao = desenha("REGUA_BORNE_F", tags);
    ASSERT_GT(simples.size(), 10);
    EXPECT_EQ(simples, comFuncao);
    // The cells hold values: neighbours' fields under both sides, the wires', and the
    // terminal's own.
    int descricao = 0, fabricante = 0, cor = 0, referencia = 0, secao = 0, proprios = 0;
    for (const QString& linha : simples) {
        const QStringList v = linha.split('|');
        descricao += !v[2].isEmpty();
        fabricante += !v[3].isEmpty();
        cor += !v[4].isEmpty();
        referencia += !v[5].isEmpty() && v[5] != "?";
        secao += !v[6].isEmpty();
        proprios += !v[7].isEmpty() && !v[8].isEmpty();
    }
    EXPECT_GT(descricao, 0);
    EXPECT_GT(fabricante, 0);
    EXPECT_GT(cor, 0);
    EXPECT_GT(referencia, 0);
    EXPECT_GT(secao, 0);
    EXPECT_GT(proprios, 0);
    // A function that reads a field no plain cell names, by its name alone.
    const QStringList comD = QStringList(tags) << "FUNCAO_D";
    const QStringList porNomeVisto = desenha("REGUA_BORNE_D", comD);
    EXPECT_EQ(porNomeVisto, desenha("REGUA_BORNE_F", comD));
    EXPECT_GT(std::count_if(porNomeVisto.begin(), porNomeVisto.end(),
                            [](const QString& linha) { return !linha.endsWith('|'); }),
              0);
    // A terminal block that is missing still ends the command with its message.
    const QString saida = pasta_->path("sem-borne.dxf");
    const zvtest::HostRun r = Desenha(
        pasta_->project(), saida,
        Modelo("reguas-sem-borne", "(setq *BLOCO_BORNE_GRX* \"DADOS\\\\1\\\\BLOCOS\\\\NAO_HA\")"));
    EXPECT_EQ(r.status, 3) << r.err.toStdString();
    EXPECT_TRUE(QString(r.out + r.err).contains("NAO_HA.dwg"));
    EXPECT_FALSE(QFile::exists(saida));
}

// The components' symbols show what they would with every field of the component kept: their
// plain cells, and a function that reads a field by name; a function that may read any field
// sees all of them, as it does when the template's filter may.
TEST_F(ComandoReguasTest, SymbolCellsShowTheComponentsFieldsAsWhenEveryFieldIsKept) {
    // The product's symbol block comes back however the test ends.
    struct Guarda {
        QString arquivo;
        QByteArray produto;
        ~Guarda() {
            QFile f(arquivo);
            if (f.open(QIODevice::WriteOnly)) f.write(produto);
        }
    } guarda{pasta_->path("produto/DADOS/1/BLOCOS/REGUA_COMP.dxf"), {}};
    QFile original(guarda.arquivo);
    ASSERT_TRUE(original.open(QIODevice::ReadOnly));
    guarda.produto = original.readAll();
    using ListaCelulas = std::vector<std::pair<std::string, std::string>>;
    const ListaCelulas celulas{{"VARIAVEL_RELACAO", "RELACAO"},
                               {"VARIAVEL_D", "DESCRICAO"},
                               {"FABRICANTE", ""},
                               {"FUNCAO_R", "(cdr (assoc \"REFERENCIA\" reg))"}};
    ListaCelulas todas = celulas;
    todas.emplace_back("FUNCAO_N", "(itoa (length reg))");
    const QStringList tags{"VARIAVEL_RELACAO", "VARIAVEL_D", "FABRICANTE", "FUNCAO_R", "FUNCAO_N"};
    const auto desenha = [&](const QString& nome, const ListaCelulas& bloco,
                             const QString& linhas) {
        Bloco("REGUA_COMP", bloco);
        const QString saida = pasta_->path(nome + ".dxf");
        const zvtest::HostRun r = Desenha(pasta_->project(), saida, Modelo(nome, linhas));
        EXPECT_EQ(r.status, 0) << r.err.toStdString();
        return Celulas(saida, "REGUA_COMP", tags);
    };
    const QStringList cortados = desenha("simbolos-cortados", celulas, QString());
    const QStringList inteiros = desenha("simbolos-inteiros", todas, QString());
    // A filter that may read any field keeps every field, whatever the blocks read.
    const QStringList semCorte =
        desenha("simbolos-sem-corte", todas, "(setq *FILTRO_TEMPLATE* \"(not (null reg))\")");
    ASSERT_GT(cortados.size(), 1);
    ASSERT_EQ(cortados.size(), inteiros.size());
    for (int i = 0; i < cortados.size(); ++i)
        EXPECT_EQ(cortados[i].section('|', 0, 3), inteiros[i].section('|', 0, 3)) << i;
    EXPECT_EQ(inteiros, semCorte);
    QMap<QString, int> fabricantes;
    int referencia = 0;
    for (const QString& linha : cortados) {
        const QStringList v = linha.split('|');
        if (!v[2].isEmpty()) ++fabricantes[v[2]];
        referencia += !v[3].isEmpty();
        EXPECT_EQ(v[4], "-");
    }
    ASSERT_FALSE(fabricantes.isEmpty());
    EXPECT_GT(referencia, 0);

    // The template's filter reads a field that no cell shows: it sees it as the walk read it,
    // whether it names the field or not, as when a cell keeps every field. Terminals (with a
    // strip) pass as the shipped template lets them.
    const auto relacoes = [](const QStringList& linhas) {
        QStringList primeiras;
        for (const QString& linha : linhas)
            primeiras << linha.section('|', 0, 0);
        return primeiras;
    };
    for (const char* forma : {"\\\"%1\\\"", "(strcase \\\"%1\\\")"}) {
        const auto campo = [forma](const char* nome) -> QString {
            return "(cdr (assoc " + QString(forma).arg(nome) + " reg))";
        };
        const QString filtro = "(setq *FILTRO_TEMPLATE* \"(if " + campo("REGUA") +
                               " (/= " + campo("REGUA") + " \\\"XV\\\") (= " + campo("FABRICANTE") +
                               " \\\"" + fabricantes.firstKey() + "\\\"))\")";
        const QStringList filtrados = desenha("simbolos-filtrados", {celulas.front()}, filtro);
        const QStringList vistos =
            desenha("simbolos-vistos", {celulas.front(), todas.back()}, filtro);
        EXPECT_GT(vistos.size(), 0);
        EXPECT_LT(vistos.size(), cortados.size());
        EXPECT_EQ(relacoes(filtrados), relacoes(vistos)) << filtro.toStdString();
    }
}

// The components of a key known already are read for the fields the drawing keeps of them;
// one whose own ZV_LISTA_TIPO makes it a terminal is read whole, and drawn in its strip.
TEST_F(ComandoReguasTest, AComponentBlockOfATerminalsKindIsDrawnWithItsWholeFields) {
    const QString normal = pasta_->path("tipo-normal.dxf");
    ASSERT_EQ(Desenha(pasta_->project(), normal, QString()).status, 0);
    // A component drawn under the strips: its key is listed and cut.
    std::string handle;
    {
        const auto db = zvdb::DxfLoader::loadFile(normal.toStdString());
        for (zvdb::Entity* e : db->modelSpace()->entities())
            if (auto* ref = dynamic_cast<zvdb::BlockReference*>(e))
                if (ref->layer().starts_with("REGUAS$") && handle.empty()) {
                    const auto itens = ref->xdataItems("KVR_ZV_REPRESENTACAO");
                    if (!itens.empty()) handle = std::string(itens.back().value);
                }
    }
    ASSERT_FALSE(handle.empty());
    auto db = zvdb::DxfLoader::loadFile(pasta_->project().toStdString());
    auto* componente =
        dynamic_cast<zvdb::BlockReference*>(db->objectByHandle(std::stoull(handle, nullptr, 16)));
    ASSERT_TRUE(componente);
    zvdb::BlockRecord* bloco = db->block(std::string(componente->blockName()));
    ASSERT_TRUE(bloco);
    const std::vector<zvdb::Tag> chave = componente->xdata("KVR_ZV");
    ASSERT_FALSE(chave.empty());
    // One more of its key and block, after it, of a terminal's kind by its own attribute.
    zvdb::BlockReference* ref = db->modelSpace()->addBlockReference(
        *bloco, {9000, 9000, 0}, {1, 1, 1}, 0, std::string(componente->layer()));
    ref->setXData("KVR_ZV", chave);
    ref->addAttribute("ZV_LISTA_TIPO", "BORNE", {9000, 8990, 0}, 1.0);
    ref->addAttribute("REGUA", "ZK", {9000, 8987, 0}, 1.0);
    ref->addAttribute("NUMERO", "7", {9000, 8984, 0}, 1.0);
    const QString projeto = pasta_->path("tipo-borne.dxf");
    zvdb::DxfWriter::saveFile(*db, projeto.toStdString());
    const QString saida = pasta_->path("tipo-borne-reguas.dxf");
    ASSERT_EQ(
        Desenha(projeto, saida, Modelo("reguas-tipo", "(setq *BORNES_SEM_LIG_GRX* T)")).status, 0);
    const auto linhas = Linhas(saida);
    ASSERT_EQ(linhas.count("ZK"), 1u);
    EXPECT_EQ(linhas.find("ZK")->second.numeros, QStringList({"7"}));
}

}  // namespace
