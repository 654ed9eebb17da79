#include "CZVListasApp.h"

#include "ZVComandos.h"

namespace {
CZVListasApp* instancia = nullptr;
}

CZVListasApp* CZVListasApp::Instancia() {
    return instancia;
}

CZVListasApp* CZVListasApp::CriarInstancia() {
    if (!instancia) instancia = new CZVListasApp;
    return instancia;
}

void CZVListasApp::deleteModule() {
    if (instancia == this) instancia = nullptr;
    delete this;
}

void CZVListasApp::RegistrarComandos() {
    RegistrarComando("gerarListaBornesGrf", ZVComandos::GerarListaBornesGrf);
    RegistrarComando("gerarListaBornesDwg", ZVComandos::GerarListaBornesDwg);
    RegistrarComando("gerarListaFiosGrf", ZVComandos::GerarListaFiosGrf);
    RegistrarComando("gerarListaMateriaisGrf", ZVComandos::GerarListaMateriaisGrf);
    RegistrarComando("gerarListaCabosGrf", ZVComandos::GerarListaCabosGrf);
    RegistrarComando("exportacao", ZVComandos::Exportacao);
    RegistrarComando("exportacaoFios", ZVComandos::ExportacaoFios);
    RegistrarComando("exportacaoAnilhas", ZVComandos::ExportacaoAnilhas);
    RegistrarComando("exportacaoBornes", ZVComandos::ExportacaoBornes);
    RegistrarComando("exportacaoMateriais", ZVComandos::ExportacaoMateriais);
    RegistrarComando("exportacaoCabos", ZVComandos::ExportacaoCabos);
    RegistrarComando("diagramaTopografico", ZVComandos::DiagramaTopografico);
}
