#include "ZVPreflight.h"

#include "cad/CICad.h"
#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"
#include "settings/CIMensagens.h"

namespace {

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

}  // namespace

namespace ZVPreflight {

bool PreflightListas(bool diagrama) {
    return Preflight("PBLBLNRUNONLSTS", diagrama ? 328 : 326);
}

bool PreflightExportacao() {
    return Preflight("PBLBLNRUNONEXPORT", 327);
}

void Bracket(int abrir) {
    // The page state is saved and restored here once the facade has pages to show.
    Q_UNUSED(abrir);
}

}  // namespace ZVPreflight
