// The wires of the bill of materials: a wire drawn as several polylines is one item whose
// stretches follow it, each polyline found by the name its own fields give.
#include "readers/FioFixture.h"

#include "cad/CELayoutRotasFios.h"
#include "module/CIProgress.h"
#include "readers/CCMaterialDataReader.h"

#include <functional>
#include <string>
#include <vector>

namespace {

class MaterialWiresTest : public FioFixture {
protected:
    void SetUp() override {
        FioFixture::SetUp();
        modelo_.simbolos["PROC_SIMB_BARR"] = "2";
        modelo_.simbolos["PBLLSTAGRUPAMENTO"] = QStringList{"ZV_KEY"};
        modelo_.simbolos["*LISTA_DE_SORT*"] = QStringList{"ZV_KEY"};
        modelo_.simbolos["*ORDEM_CRESCENTE*"] = "C";
    }
    // A wire polyline of key 10006 with these fields after the key and the numbering rule.
    zvdb::Polyline* trecho(double x, const std::vector<std::string>& campos,
                           const std::string& layer = kPagina1) {
        zvdb::Polyline* linha =
            db().modelSpace()->addLwPolyline({{x, 100, 0}, {x, 50, 0}}, false, layer);
        zvsample::XDataItems dados;
        dados.text("10006\f1").text("1");
        for (const std::string& campo : campos)
            dados.text(campo);
        linha->setXData("KVR_ZV_WIRE", dados.tags());
        return linha;
    }
    // The stretches read, of every material, as "MARCA_INI>MARCA_FIM" texts in order.
    QStringList trechos() {
        CCMaterialDataReader leitor;
        CIProgress progresso;
        std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
        QStringList texto;
        for (CEItemLista* item : *lidos)
            for (CEItemLista* m = item; m;) {
                texto << m->valorCampo("MARCA_INI") + ">" + m->valorCampo("MARCA_FIM");
                CEItemLista* seguinte = m->ligado;
                delete m;
                m = seguinte;
            }
        texto.sort();
        return texto;
    }
};

TEST_F(MaterialWiresTest, AWiresPolylinesAreItsStretchesInPageOrder) {
    trecho(10, {"FIO\f12", "MARCA\fA"});
    trecho(20, {"FIO\f12", "MARCA\fC"}, kPagina2);
    trecho(30, {"FIO\f12", "MARCA\fB"});
    EXPECT_EQ(trechos(), QStringList({"A>B", "B>C"}));
}

TEST_F(MaterialWiresTest, APolylinesNameIsItsFirstNonBlankNameFieldWithItsLastValue) {
    trecho(10, {"FIO\f12", "MARCA\fA"});
    // CABO is blank, WIRE comes before FIO, and the second WIRE wins: this is wire 12.
    trecho(20, {"CABO\f  ", "WIRE\f5", "WIRE\f 12 ", "FIO\f99", "MARCA\fB"});
    // Named 99 by FIO alone: another wire, of the same key.
    trecho(30, {"FIO\f99", "MARCA\fD"});
    EXPECT_EQ(trechos(), QStringList({"A>B", "D>"}));
}

TEST_F(MaterialWiresTest, NoRouteOfAWireIsLookedUpForTheList) {
    trecho(10, {"FIO\f12", "MARCA\fA"});
    CELayoutRotasFios rota;
    rota.strKeyFio = "12";
    rota.strRotaData = "FFFFF-EEEEE-P1";
    rota.Gravar();
    CCMaterialDataReader leitor;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
    ASSERT_EQ(lidos->size(), 1u);
    EXPECT_EQ(leitor.Caminhos("12"), nullptr);
    lidos->destruirItens();
    // The wire list of the same drawing does read it.
    CCFioDataReader fios;
    le(fios);
    EXPECT_NE(fios.Caminhos("12"), nullptr);
}

// The readings of the entities go once the items are read, before the accessories are
// expanded and grouped: the list needs that memory more.
TEST_F(MaterialWiresTest, NoReadingOfAWireOutlivesTheRead) {
    const zvdb::Polyline* a = trecho(10, {"FIO\f12", "MARCA\fA"});
    const zvdb::Polyline* b = trecho(20, {"FIO\f12", "MARCA\fB"}, kPagina2);
    modelo_.simbolos["*IMP_VINCL*"] = 1;
    CCMaterialDataReader leitor;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
    ASSERT_EQ(lidos->size(), 1u);
    EXPECT_EQ(lidos->at(0)->valorCampo("MARCA_FIM"), "B");
    EXPECT_FALSE(leitor.LeituraGuardada(id(a)));
    EXPECT_FALSE(leitor.LeituraGuardada(id(b)));
    lidos->destruirItens();
}

// Notes, as each wire's item is made, which polylines of the wires before it are still kept
// read.
class LeitorQueOlha : public CCMaterialDataReader {
public:
    std::function<void(const OdDbObjectId&)> aoCriar;
    void LerLadoIni(CEItemLista& item, const OdDbObjectId& fio, CETemplate& modelo) override {
        if (aoCriar) aoCriar(fio);
        CCMaterialDataReader::LerLadoIni(item, fio, modelo);
    }
};

TEST_F(MaterialWiresTest, AWiresStretchesAreReadBeforeTheNextWireAndFewReadingsAreKept) {
    // Enough wires of two stretches that the kept readings turn over more than once.
    const int n = 2600;
    std::vector<const zvdb::Polyline*> primeiros, segundos;
    for (int f = 0; f < n; ++f) {
        const std::string nome = "FIO\f" + std::to_string(f);
        const std::string marca = "MARCA\f" + std::to_string(f);
        primeiros.push_back(trecho(10 + f, {nome, marca + "a"}));
        segundos.push_back(trecho(10 + f, {nome, marca + "b"}, kPagina2));
    }
    LeitorQueOlha leitor;
    int criados = 0, anteriorLido = 0;
    leitor.aoCriar = [&](const OdDbObjectId&) {
        // The wire before this one was copied in full already: its second stretch is read.
        if (criados > 0 && leitor.LeituraGuardada(id(segundos[std::size_t(criados - 1)])))
            ++anteriorLido;
        if (criados == n - 1) {
            EXPECT_FALSE(leitor.LeituraGuardada(id(primeiros.front())));
            EXPECT_FALSE(leitor.LeituraGuardada(id(segundos.front())));
        }
        ++criados;
    };
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
    EXPECT_EQ(criados, n);
    EXPECT_EQ(anteriorLido, n - 1);
    // Every wire still joins its own two stretches, though their readings went since.
    std::size_t trechos = 0;
    for (CEItemLista* item : *lidos)
        for (CEItemLista* m = item; m; m = m->ligado) {
            const QString inicio = m->valorCampo("MARCA_INI");
            EXPECT_TRUE(inicio.endsWith('a')) << inicio.toStdString();
            EXPECT_EQ(m->valorCampo("MARCA_FIM"), inicio.chopped(1) + "b");
            ++trechos;
        }
    EXPECT_EQ(trechos, std::size_t(n));
    lidos->destruirItens();
}

}  // namespace
