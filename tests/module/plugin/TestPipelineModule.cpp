// A test plug-in: commands that run the list pipeline with a reader, writer and template
// of the test's own, so a run can be watched through zvhost.
//   testePipeline          two selection parts read, one item shared, writer prints counts
//   testeModeloRuim        the template does not load
//   testeEscritorPara      the writer stops the run with a text
#include "cad/CICad.h"
#include "lists/CETemplate.h"
#include "module/CCDataWriter.h"
#include "module/CCEntryPoint.h"
#include "module/CIProgress.h"
#include "module/ExecutarLista.h"
#include "readers/CCDataReader.h"

namespace {

class ModeloTeste : public CETemplate {
public:
    ModeloTeste(bool carrega) : CETemplate("teste.grt"), carrega_(carrega) {}
    bool Carregar() override { return carrega_; }
    int LerInteiro(const QString&) override { return 0; }
    double LerReal(const QString&) override { return 0.0; }
    QString LerTexto(const QString&) override { return {}; }
    QStringList LerListaTexto(const QString&) override { return {}; }
    bool LerLogico(const QString&) override { return false; }
    void LerPonto(const QString&, double& x, double& y) override { x = y = 0.0; }
    bool FiltraItem(const CEItemLista&) override { return true; }

private:
    bool carrega_;
};

// Each read gives two new items and the one item it shares across reads.
class LeitorTeste : public CCDataReader {
public:
    ~LeitorTeste() override { delete compartilhado_; }
    void LerLadoIni(CEItemLista&, const OdDbObjectId&, CETemplate&) override {}
    void LerLadoFim(CEItemLista&, const OdDbObjectId&, CETemplate&) override {}
    VetorItens* LerDados(zvdb::Database*, const std::optional<QStringList>& paginas, CETemplate&,
                         CIProgress& progresso) override {
        ++leituras_;
        progresso.Definir(40 * leituras_, "leitura " + QString::number(leituras_));
        auto* itens = new VetorItens;
        for (int i = 0; i < 2; ++i) {
            itens->push_back(new CEItemLista);
            itens->back()->definirCampo("PAGINAS", paginas ? paginas->join(",") : "todas");
        }
        if (!compartilhado_) compartilhado_ = new CEItemLista;
        itens->push_back(compartilhado_);
        return itens;
    }
    // The pipeline destroys the shared item once; forget it so the reader does not.
    void Esquecer() { compartilhado_ = nullptr; }

private:
    int leituras_ = 0;
    CEItemLista* compartilhado_ = nullptr;
};

class EscritorTeste : public CCDataWriter {
public:
    EscritorTeste(LeitorTeste& leitor, bool para) : leitor_(leitor), para_(para) {}
    void EscreverItens(VetorItens& itens, CETemplate&) override {
        leitor_.Esquecer();
        CICad::Imprime("\nitens=" + QString::number(itens.size()));
        for (const CEItemLista* item : itens)
            if (item->temCampo("PAGINAS")) CICad::Imprime(" " + item->valorCampo("PAGINAS"));
        if (para_) throw ZVString("escritor parou");
    }

private:
    LeitorTeste& leitor_;
    bool para_;
};

void Rodar(bool carrega, bool para) {
    LeitorTeste leitor;
    EscritorTeste escritor(leitor, para);
    ModeloTeste modelo(carrega);
    CESelecao selecao(2);
    selecao[1].paginas = QStringList({"ESQ$0001$A", "ESQ$0002$A"});
    ExecutarLista(leitor, escritor, modelo, &selecao);
}

int TestePipeline() {
    Rodar(true, false);
    return 1;
}
int TesteModeloRuim() {
    Rodar(false, false);
    return 1;
}
int TesteEscritorPara() {
    Rodar(true, true);
    return 1;
}

class ModuloTeste : public CCEntryPoint {
public:
    void deleteModule() override { delete this; }

protected:
    void RegistrarComandos() override {
        RegistrarComando("testePipeline", TestePipeline);
        RegistrarComando("testeModeloRuim", TesteModeloRuim);
        RegistrarComando("testeEscritorPara", TesteEscritorPara);
    }
    void AposDescarregar() override {}
    void AoCriarDocumento(zvsdk::Document*) override {}
    void AoDestruirDocumento(zvsdk::Document*) override {}
};

}  // namespace

extern "C" __attribute__((visibility("default"))) zvsdk::RxModule* odrxCreateModuleObject() {
    return new ModuloTeste;
}

extern "C" __attribute__((visibility("default"))) int odrxGetAPIVersion() {
    return zvsdk::kApiVersion;
}
