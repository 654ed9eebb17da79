// The material reader on small drawings: what is read, how equal materials are grouped and
// counted (compared with a count made from the drawing), accessories, pages and bad keys.
#include "QtPrinters.h"
#include "ReaderFixture.h"
#include "lists/CCMaterialGrfWriter.h"
#include "lists/TemplateDouble.h"
#include "module/CIProgress.h"
#include "readers/CCMaterialDataReader.h"

#include <QMap>

namespace {

class MaterialReaderTest : public ReaderFixture {
protected:
    TemplateDouble modelo;
    void SetUp() override {
        ReaderFixture::SetUp();
        modelo.simbolos["PROC_SIMB_BARR"] = "1";
        modelo.simbolos["PBLLSTAGRUPAMENTO"] = QStringList{"ZV_KEY"};
        modelo.simbolos["*LISTA_DE_SORT*"] = QStringList{"ZV_KEY"};
        modelo.simbolos["*ORDEM_CRESCENTE*"] = "C";
    }
    // Rows as "KEY:members[:ACE]", in order.
    QStringList Le(std::optional<QStringList> paginas = std::nullopt) {
        CCMaterialDataReader leitor;
        CIProgress progresso;
        std::unique_ptr<VetorItens> itens(leitor.LerDados(&db(), paginas, modelo, progresso));
        QStringList linhas;
        for (CEItemLista* item : *itens) {
            int membros = 0;
            for (CEItemLista* m = item; m; m = m->ligado)
                ++membros;
            linhas << item->valorCampo("ZV_KEY") + ":" + QString::number(membros) +
                          (item->valorCampo("ZV_LISTA_TIPO") == "ACE" ? ":ACE" : "");
            descricoes[item->valorCampo("ZV_KEY")] = item->valorCampo("DESCRICAO");
        }
        CCMaterialGrfWriter::SomaGrupos(*itens, 0);
        quantidades.clear();
        for (CEItemLista* item : *itens)
            quantidades[item->valorCampo("ZV_KEY")] += item->valorCampo("QTD").toInt();
        for (CEItemLista* item : *itens)
            for (CEItemLista* m = item; m;) {
                CEItemLista* seguinte = m->ligado;
                delete m;
                m = seguinte;
            }
        return linhas;
    }
    // The quantity of each key counted from the drawing itself: every model-space symbol
    // with a listed key, its QTD attribute or 1, and every virtual symbol.
    QMap<QString, int> ContaNoDesenho(const QSet<QString>& listadas) {
        QMap<QString, int> conta;
        for (zvdb::Entity* e : db().modelSpace()->entities()) {
            auto* ref = dynamic_cast<zvdb::BlockReference*>(e);
            if (!ref) continue;
            const CEListaXData dados = CICad::GetXData(Id(ref), "KVR_ZV");
            if (dados.empty()) continue;
            const QString chave = dados[0].texto.section(QChar(0x0C), 0, 0);
            if (!listadas.contains(chave)) continue;
            zvdb::Attribute* qtd = ref->attribute("QTD");
            const QString texto = qtd ? QString::fromStdString(std::string(qtd->textValue())) : "";
            conta[chave] += texto.isEmpty() ? 1 : texto.toInt();
        }
        for (const auto& [nome, id] : CICad::GetEntradasDicionario({"ESQ_VIRTUAL_ZV"}, &db())) {
            const QString chave =
                CICad::GetXData(id, "KVR_ZV").at(0).texto.section(QChar(0x0C), 0, 0);
            if (listadas.contains(chave)) conta[chave] += 1;
        }
        return conta;
    }
    QMap<QString, int> quantidades;
    QMap<QString, QString> descricoes;
};

TEST_F(MaterialReaderTest, OneKeyOnSeveralPagesAndAsVirtualSymbolIsOneRowCountedExactly) {
    Simbolo("K", "SO", "ESQ$0001$A", {}, 0);
    Simbolo("K", "SO", "ESQ$0002$A", {{"QTD", "3"}}, 10);
    Simbolo("K2", "SO", "ESQ$0002$A", {}, 20);
    Simbolo("K", "SY", "ESQ$0001$A", {}, 30);
    Simbolo("K", "SY", "ESQ$0003$A", {}, 40);
    Simbolo("K", "NL", "ESQ$0003$A", {}, 50);
    Virtual("V1", "SO");
    EXPECT_EQ(Le(), QStringList({"SO:4", "SY:2"}));
    const QMap<QString, int> mao = ContaNoDesenho({"SO", "SY"});
    EXPECT_EQ(mao.value("SO"), 6);
    EXPECT_EQ(quantidades, mao);
}

TEST_F(MaterialReaderTest, AKeyFieldKeepsEqualMaterialsApartAndNoGroupingKeepsEveryItem) {
    Simbolo("K", "SO", "ESQ$0001$A", {}, 0);
    Simbolo("K", "SO", "ESQ$0002$A", {}, 10);
    Simbolo("K", "SO", "ESQ$0001$A", {}, 20);
    modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{"PAGINA"};
    EXPECT_EQ(Le(), QStringList({"SO:2", "SO:1"}));
    modelo.simbolos["PBLLSTAGRUPAMENTO"] = QStringList{};
    EXPECT_EQ(Le(), QStringList({"SO:1", "SO:1", "SO:1"}));
    // Descending unless the order is exactly "C".
    modelo.simbolos["PBLLSTAGRUPAMENTO"] = QStringList{"ZV_KEY"};
    modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{};
    Simbolo("K", "SY", "ESQ$0001$A", {}, 30);
    modelo.simbolos["*ORDEM_CRESCENTE*"] = "";
    EXPECT_EQ(Le(), QStringList({"SY:1", "SO:3"}));
}

TEST_F(MaterialReaderTest, ABusBarDrawnTwiceIsOneRow) {
    Simbolo("BUSBAR", "BUSX", "ESQ$0001$A", {{"RELACAO", "-W1"}}, 0);
    Simbolo("BUSBAR", "BUSX", "ESQ$0002$A", {{"RELACAO", "-W1"}}, 10);
    Simbolo("BUSBAR", "BUSX", "ESQ$0002$A", {{"RELACAO", "-W2"}}, 20);
    EXPECT_EQ(Le(), QStringList({"BUSX:2"}));
}

TEST_F(MaterialReaderTest, AccessoriesGroupedLikeMaterialsOrBehindTheirOwner) {
    Simbolo("K", "A1", "ESQ$0001$A", {}, 0);
    Simbolo("K", "A1", "ESQ$0002$A", {}, 10);
    Simbolo("K", "B3", "ESQ$0002$A", {}, 20);
    modelo.simbolos["*IMP_VINCL*"] = 2;
    // B3: one drawn, three per owner; Z0: two per owner. Drawn and accessory units of one
    // key are one material, whichever of them heads the group.
    EXPECT_EQ(Le().replaceInStrings(":ACE", ""), QStringList({"A1:2", "B3:7", "Z0:4"}));
    EXPECT_EQ(quantidades.value("B3"), 7);
    modelo.simbolos["*IMP_VINCL*"] = 1;
    // Behind A1 its accessories, grouped, in reverse order; the drawn B3 stands alone.
    EXPECT_EQ(Le(), QStringList({"A1:2", "Z0:4:ACE", "B3:6:ACE", "B3:1"}));
    modelo.simbolos["*IMP_VINCL*"] = 0;
    EXPECT_EQ(Le(), QStringList({"A1:2", "B3:1"}));
}

// The fields of an item as a map of names to values.
QMap<QString, QString> Campos(const CEItemLista& item) {
    QMap<QString, QString> campos;
    for (auto it = item.campos.constBegin(); it != item.campos.constEnd(); ++it)
        campos.insert(it.key(), it.value());
    return campos;
}

// The chains of the items again, each member with fields of its own, shared with none.
VetorItens CopiasProprias(const VetorItens& itens) {
    VetorItens copias;
    for (const CEItemLista* item : itens) {
        CEItemLista** lugar = &copias.emplace_back();
        for (const CEItemLista* m = item; m; m = m->ligado) {
            *lugar = new CEItemLista;
            (*lugar)->campos.juntar(m->campos);
            EXPECT_FALSE((*lugar)->campos.partilhado());
            lugar = &(*lugar)->ligado;
        }
    }
    return copias;
}

void Destroi(VetorItens& itens) {
    for (CEItemLista* item : itens)
        for (CEItemLista* m = item; m;) {
            CEItemLista* seguinte = m->ligado;
            delete m;
            m = seguinte;
        }
}

// The list writes its sums into every member: the reader leaves room for them, so that no
// member's own fields move then. Members that read one shared array (an accessory's units)
// read one summed array after; every member reads what fields of its own would.
TEST_F(MaterialReaderTest, EveryMemberTakesTheGroupsSumsWithoutMovingOrCopyingItsFields) {
    Simbolo("K", "A1", "ESQ$0001$A", {}, 0);
    Simbolo("K", "A1", "ESQ$0002$A", {{"QTD", "2"}}, 10);
    Simbolo("K", "B3", "ESQ$0002$A", {}, 20);
    for (int vinculos : {1, 2}) {
        modelo.simbolos["*IMP_VINCL*"] = vinculos;
        CCMaterialDataReader leitor;
        CIProgress progresso;
        std::unique_ptr<VetorItens> itens(leitor.LerDados(&db(), std::nullopt, modelo, progresso));
        VetorItens copias = CopiasProprias(*itens);
        // Behind each head (which also gets its sequence number) its members, each with its
        // array and the first member before it that read the same shared one.
        struct Membro {
            CEItemLista* item;
            const CamposItem::Campo* campos;
            CEItemLista* igual;
        };
        std::vector<Membro> membros;
        int partilhados = 0;
        for (CEItemLista* item : *itens)
            for (CEItemLista* m = item->ligado; m; m = m->ligado) {
                CEItemLista* igual = nullptr;
                for (const Membro& antes : membros)
                    if (!igual && antes.item->campos.partilhaCom(m->campos)) igual = antes.item;
                partilhados += igual ? 1 : 0;
                membros.push_back({m, m->campos.todos().data(), igual});
            }
        ASSERT_GT(membros.size(), 5u);
        // Each key's units read two arrays, one per owner's quantity: three members of B3
        // and one of Z0 read an array that a member before them reads.
        EXPECT_EQ(partilhados, 4);
        CCMaterialGrfWriter::SomaGrupos(*itens, 0);
        CCMaterialGrfWriter::SomaGrupos(copias, 0);
        for (const Membro& m : membros) {
            const std::string chave = m.item->valorCampo("ZV_KEY").toStdString();
            if (!m.item->campos.partilhado()) {
                EXPECT_EQ(m.item->campos.todos().data(), m.campos) << chave;
            }
            if (m.igual) {
                EXPECT_TRUE(m.igual->campos.partilhaCom(m.item->campos)) << chave;
            }
            EXPECT_EQ(CCMaterialGrfWriter::SomasAusentes(m.item->campos), 0u);
        }
        ASSERT_EQ(itens->size(), copias.size());
        for (size_t i = 0; i < itens->size(); ++i) {
            const CEItemLista* m = (*itens)[i];
            const CEItemLista* c = copias[i];
            for (; m && c; m = m->ligado, c = c->ligado)
                EXPECT_EQ(Campos(*m), Campos(*c)) << vinculos << " " << i;
            EXPECT_EQ(m, c);
        }
        EXPECT_EQ(itens->at(0)->valorCampo("ZV_KEY"), "A1");
        EXPECT_EQ(itens->at(0)->valorCampo("QTD"), "3");
        Destroi(*itens);
        Destroi(copias);
    }
}

TEST_F(MaterialReaderTest, AccessoriesOfAnUnlistedSymbolCountOnlyWhenAsked) {
    Simbolo("K", "NL", "ESQ$0001$A");
    modelo.simbolos["*IMP_VINCL*"] = 2;
    EXPECT_EQ(Le(), QStringList());
    modelo.simbolos["PBLACEORF"] = true;
    EXPECT_EQ(Le(), QStringList({"B3:1:ACE"}));
}

TEST_F(MaterialReaderTest, KeysWithoutDescriptionMakeRowsAndUnknownKeysAreSkipped) {
    Simbolo("K", "MD", "ESQ$0001$A", {}, 0);
    Simbolo("K", "GONE", "ESQ$0001$A", {}, 10);
    Simbolo("K", "it's", "ESQ$0001$A", {}, 20);
    EXPECT_EQ(Le(), QStringList({"MD:1"}));
    EXPECT_EQ(descricoes.value("MD"), CIMensagens::Mensagem("ZVLISTAS", 108));
    EXPECT_FALSE(descricoes.value("MD").isEmpty());
}

TEST_F(MaterialReaderTest, SelectedPagesLimitSymbolsAndLeaveOutVirtualOnes) {
    Simbolo("K", "SO", "ESQ$0001$A", {}, 0);
    Simbolo("K", "SO", "ESQ$0002$A", {}, 10);
    Simbolo("K", "SY", "ESQ$0002$A", {}, 20);
    Virtual("V1", "SO");
    modelo.simbolos["*SELECAO_PAG_MATTABLE*"] = true;
    EXPECT_EQ(Le(QStringList{"ESQ$0002$A"}), QStringList({"SO:1", "SY:1"}));
    // No page list: every page, still no virtual symbol.
    EXPECT_EQ(Le(), QStringList({"SO:2", "SY:1"}));
    // An empty list: nothing.
    EXPECT_EQ(Le(QStringList{}), QStringList());
    modelo.simbolos["*SELECAO_PAG_MATTABLE*"] = false;
    EXPECT_EQ(Le(), QStringList({"SO:3", "SY:1"}));
    // A database that no file gave reads as nothing.
    CCMaterialDataReader leitor;
    CIProgress progresso;
    EXPECT_EQ(leitor.LerDados(nullptr, std::nullopt, modelo, progresso), nullptr);
}

TEST_F(MaterialReaderTest, ADrawingReadBesideTheActiveOneGivesItsOwnSymbols) {
    Simbolo("K", "SY", "ESQ$0001$A");
    zvdb::Database lado;
    lado.createLayer("ESQ$0001$A");
    zvdb::BlockRecord* bloco = lado.createBlock("K");
    for (double x : {0.0, 10.0}) {
        zvdb::BlockReference* ref =
            lado.modelSpace()->addBlockReference(*bloco, {x, 0, 0}, {1, 1, 1}, 0, "ESQ$0001$A");
        CICad::SetXData(OdDbObjectId(&lado, ref->handle()), "KVR_ZV",
                        {{1000, QString("SO") + QChar(0x0C) + "1"}});
    }
    modelo.simbolos["PROC_SIMB_BARR"] = "3";
    CCMaterialDataReader leitor;
    CIProgress progresso;
    std::unique_ptr<VetorItens> itens(leitor.LerDados(&lado, std::nullopt, modelo, progresso));
    ASSERT_EQ(itens->size(), 1u);
    EXPECT_EQ(itens->at(0)->valorCampo("ZV_KEY"), "SO");
    ASSERT_NE(itens->at(0)->ligado, nullptr);
    EXPECT_EQ(itens->at(0)->ligado->ligado, nullptr);
    // The active drawing is the facade's default again afterwards.
    EXPECT_EQ(CICad::GetDatabase(), &db());
    delete itens->at(0)->ligado;
    delete itens->at(0);
}

// A material reader that shows the block references it gathered.
class LeitorReferencias : public CCMaterialDataReader {
public:
    size_t Quantas(zvdb::Database* database, const QString& bloco) {
        const auto& referencias = ReferenciasPorBloco(database);
        const auto it = referencias.constFind(bloco);
        return it == referencias.constEnd() ? 0 : it->size();
    }
};

TEST_F(MaterialReaderTest, TheReferencesGatheredOnceFollowAChangeOfTheDrawing) {
    Simbolo("K", "SO", "ESQ$0001$A", {}, 0);
    LeitorReferencias leitor;
    EXPECT_EQ(leitor.Quantas(&db(), "K"), 1u);
    Simbolo("K", "SO", "ESQ$0002$A", {}, 10);
    EXPECT_EQ(leitor.Quantas(&db(), "K"), 2u);
    // The same reader reads again after a symbol came in: it counts the new one too.
    CIProgress progresso;
    const auto membros = [&] {
        std::unique_ptr<VetorItens> itens(leitor.LerDados(&db(), std::nullopt, modelo, progresso));
        int n = 0;
        for (CEItemLista* item : *itens)
            for (CEItemLista* m = item; m;) {
                CEItemLista* seguinte = m->ligado;
                ++n;
                delete m;
                m = seguinte;
            }
        return n;
    };
    EXPECT_EQ(membros(), 2);
    Simbolo("K", "SO", "ESQ$0003$A", {}, 20);
    EXPECT_EQ(membros(), 3);
}

TEST_F(MaterialReaderTest, GroupingAHundredThousandItemsStaysNearLinear) {
    VetorItens itens;
    for (int i = 0; i < 100000; ++i) {
        auto* item = new CEItemLista;
        item->definirCampo("ZV_KEY", QString::number(i % 7));
        item->definirCampo("PAGINA", QString::number(i % 3));
        itens.push_back(item);
    }
    modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{"PAGINA"};
    CCMaterialDataReader::Agrupa(itens, modelo);
    ASSERT_EQ(itens.size(), 21u);
    size_t total = 0;
    for (CEItemLista* item : itens)
        for (CEItemLista* m = item; m; m = m->ligado) {
            EXPECT_EQ(m->valorCampo("ZV_KEY"), item->valorCampo("ZV_KEY"));
            ++total;
        }
    EXPECT_EQ(total, 100000u);
    for (CEItemLista* item : itens)
        for (CEItemLista* m = item; m;) {
            CEItemLista* seguinte = m->ligado;
            delete m;
            m = seguinte;
        }
}

}  // namespace
