#include "ZVPreflight.h"

#include "cad/CICad.h"
#include "host/sdk/Document.h"
#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"
#include "settings/CIMensagens.h"

namespace {

// The page the user was on when the last bracket opened; it outlives the commands.
QString paginaSalva;

void HabilitaJanelaPrincipal() {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    if (servicos && servicos->userInterface()) servicos->userInterface()->enableMainWindow(true);
}

// The symbol says whether a project build must pass first; `mensagem` tells a failed one.
bool Preflight(const QString& simbolo, int mensagem) {
    if (!CICad::GetBoolLisp(simbolo)) return true;
    const bool construiu = CICad::zvInvokeBool("zvBuild");
    if (!construiu) CICad::Imprime(CIMensagens::Mensagem("ZVLISTAS", mensagem));
    HabilitaJanelaPrincipal();
    return construiu;
}

// Layer "0" current and every page frozen: the state readers and writers work in.
void CongelaPaginas() {
    CICad::DescongelaLayer("0");
    CICad::SetLayerCorrente("0");
    CICad::CongelaTodosLayers();
}

void Abrir() {
    paginaSalva = CICad::GetLayerCorrente(CICad::GetDatabase());
    CongelaPaginas();
    // A tiny window at the origin keeps regenerations cheap while the run works.
    if (zvsdk::activeDocument() && zvsdk::systemServices())
        CICad::Comando({"_.zoom", "_W", "0,0,0", "0.5,0.5,0"});
    CICad::Regenera();
}

QString PrimeiraPagina() {
    zvsdk::ResultBuffer* resposta = CICad::zvInvokeLista("getprimeirapagina");
    QString pagina;
    for (const zvsdk::ResultBuffer* no = resposta; no && pagina.isEmpty(); no = no->rbnext)
        if (no->restype == zvsdk::RTSTR) pagina = no->rstring;
    CICad::LiberaLista(resposta);
    return pagina;
}

void Fechar() {
    CongelaPaginas();
    if (CICad::MostraPagina(paginaSalva, true) == 1) {
        // The page is gone (or was "0"): the user lands on the first page.
        paginaSalva = PrimeiraPagina();
        CICad::MostraPagina(paginaSalva, true);
    }
    CICad::zvInvokeVoid("atualizarpaginas");
    CICad::zvInvokeVoid("Descongela_as_layers_da_pagina", {paginaSalva});
}

}  // namespace

namespace ZVPreflight {

bool PreflightListas(bool diagrama) {
    return Preflight("PBLBLNRUNONLSTS", diagrama ? 328 : 326);
}

bool PreflightExportacao() {
    return Preflight("PBLBLNRUNONEXPORT", 327);
}

void Bracket(int abrir) {
    if (abrir)
        Abrir();
    else
        Fechar();
}

}  // namespace ZVPreflight
