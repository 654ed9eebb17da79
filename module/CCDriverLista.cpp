#include "CCDriverLista.h"

#include "ExecutarLista.h"
#include "ZVResultado.h"
#include "cad/CICad.h"
#include "export/CEExportacao.h"
#include "lists/CCBorneGrfWriter.h"
#include "lists/CCCaboGrfWriter.h"
#include "lists/CCFioGrfWriter.h"
#include "lists/CCMaterialGrfWriter.h"
#include "lists/CETemplateLisp.h"
#include "readers/CCBorneDataReader.h"
#include "readers/CCCaboDataReader.h"
#include "readers/CCExportDataReader.h"
#include "readers/CCFioDataReader.h"
#include "readers/CCMaterialDataReader.h"
#include "readers/SelecaoPaginas.h"
#include "strips/CCBorneDwgDataReader.h"
#include "strips/CCBorneDwgWriter.h"
#include "topographic/CCDiagramaTopografico.h"

namespace {

// Message printed where a list or export is not part of this build yet.
constexpr int kMensagemIndisponivel = 900;

struct Driver {
    const char* simboloUsarPadrao;  // null: always ask
    const char* simboloNomePadrao;
    const char* tipoArquivo;
    const char* extensao;
};

Driver DriverDe(TipoLista tipo) {
    switch (tipo) {
        case TipoLista::Bornes:
            return {"*USAR_DEF_LISTA_BORNES*", "*DEF_LISTA_BORNES*", "ZV Terminal Table Template",
                    "grt"};
        case TipoLista::BornesDesenho:
            return {"*USAR_DEF_LISTA_BOR_DES*", "*DEF_LISTA_BOR_DES*",
                    "ZV Terminal Drawing Template", "grx"};
        case TipoLista::Fios:
            return {"*USAR_DEF_LISTA_FIOS*", "*DEF_LISTA_FIOS*", "ZV Wire Table Template", "grw"};
        case TipoLista::Materiais:
            return {"*USAR_DEF_LISTA_MATERIAL*", "*DEF_LISTA_MATERIAL*",
                    "ZV Material Table Template", "grf"};
        case TipoLista::Cabos:
            return {"*USAR_DEF_LISTA_CABOS*", "*DEF_LISTA_CABOS*", "ZV Cable Table Template",
                    "grc"};
        case TipoLista::DiagramaTopografico:
            break;
    }
    return {nullptr, nullptr, "ZV Diagram Template", "dtp"};
}

// A template that only counts as loaded when it set the list's own symbol: a terminal or
// material template picked for the wire list loads, but has no page group for it. The
// symbol is cleared first, so a value left by an earlier template does not count.
class ModeloComSimbolo : public CETemplateLisp {
public:
    ModeloComSimbolo(const QString& caminho, const QString& simbolo)
        : CETemplateLisp(caminho), simbolo_(simbolo) {}
    bool Carregar() override {
        CICad::SetNilLisp(simbolo_);
        return CETemplateLisp::Carregar() && !LerTexto(simbolo_).isEmpty();
    }

private:
    QString simbolo_;
};

}  // namespace

QString CCDriverLista::EscolherModelo(TipoLista tipo) {
    const Driver driver = DriverDe(tipo);
    const QString pasta = CICad::GetStringLisp("*DIR_ZVCFG_TEMPL*");
    // The folder symbol carries its own closing separator: nothing goes in between.
    if (driver.simboloUsarPadrao && CICad::GetBoolLisp(driver.simboloUsarPadrao))
        return pasta + CICad::GetStringLisp(driver.simboloNomePadrao);
    const QString extensao = driver.extensao;
    const QString filtro = QString(driver.tipoArquivo) + "|*." + extensao;
    return CICad::DialogoArquivo(true, filtro, pasta, driver.tipoArquivo, "template");
}

void CCDriverLista::Executar(TipoLista tipo) {
    if (!Disponivel(tipo)) return AvisaIndisponivel();
    if (tipo == TipoLista::DiagramaTopografico) return ExecutarDiagrama();
    const QString caminho = EscolherModelo(tipo);
    if (caminho.isEmpty()) {
        ZVResultado::Cancelado();
        return;
    }
    if (tipo == TipoLista::Fios) {
        CCFioDataReader leitor;
        CCFioGrfWriter escritor;
        ModeloComSimbolo modelo(caminho, "FUNCAO_LSTGRW");
        ExecutarLista(leitor, escritor, modelo);
        return;
    }
    if (tipo == TipoLista::BornesDesenho) {
        CCBorneDwgDataReader leitor;
        CCBorneDwgWriter escritor;
        leitor.Escritor = &escritor;
        CETemplateLisp modelo(caminho);
        ExecutarLista(leitor, escritor, modelo);
        return;
    }
    if (tipo == TipoLista::Cabos) {
        CCCaboDataReader leitor;
        CCCaboGrfWriter escritor;
        ModeloComSimbolo modelo(caminho, "FUNCAO_LSTGRW");
        ExecutarLista(leitor, escritor, modelo);
        return;
    }
    if (tipo == TipoLista::Materiais) return ExecutarMateriais(caminho);
    CCBorneDataReader leitor;
    leitor.CamposDaLista = &CCBorneGrfWriter::CamposDasLinhas;
    CCBorneGrfWriter escritor;
    CETemplateLisp modelo(caminho);
    ExecutarLista(leitor, escritor, modelo);
}

// The material list loads its template before the pipeline does: the page selection
// depends on the template's symbols.
void CCDriverLista::ExecutarMateriais(const QString& caminho) {
    CETemplateLisp modelo(caminho);
    if (!modelo.Carregar()) {
        CICad::ImprimeMensagem(88);
        ZVResultado::Falhou();
        return;
    }
    CESelecao selecao = SelecaoMateriais();
    CCMaterialDataReader leitor;
    CCMaterialGrfWriter escritor;
    ExecutarLista(leitor, escritor, modelo, &selecao);
}

// The diagram has no default template, and without a template folder nothing happens.
void CCDriverLista::ExecutarDiagrama() {
    if (CICad::GetStringLisp("*DIR_ZVCFG_TEMPL*").isEmpty()) {
        ZVResultado::Cancelado();
        return;
    }
    const QString caminho = EscolherModelo(TipoLista::DiagramaTopografico);
    if (caminho.isEmpty()) {
        ZVResultado::Cancelado();
        return;
    }
    CCDiagramaTopografico diagrama;
    diagrama.Executar(caminho);
}

void CCDriverLista::Exporta(const QString& tipo) {
    if (!ExportacaoDisponivel(tipo)) return AvisaIndisponivel();
    CEExportacao::Exporta(tipo, [](CEExportacao& exportacao) {
        CCExportDataReader leitor;
        leitor.Exportacao = &exportacao;
        return std::unique_ptr<VetorItens>(
            leitor.Le(CICad::GetDatabase(), nullptr, true, std::nullopt));
    });
}

// Every list of this edition has its reader and writer; a list that a later edition adds
// is refused here until it is built.
bool CCDriverLista::Disponivel(TipoLista tipo) {
    Q_UNUSED(tipo);
    return true;
}

// Every export command has its reader; the page formats are the run's to refuse.
bool CCDriverLista::ExportacaoDisponivel(const QString& tipo) {
    Q_UNUSED(tipo);
    return true;
}

void CCDriverLista::AvisaIndisponivel() {
    CICad::ImprimeMensagem(kMensagemIndisponivel);
    ZVResultado::Falhou();
}
