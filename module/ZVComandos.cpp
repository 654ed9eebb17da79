#include "ZVComandos.h"

#include "CCDriverLista.h"
#include "ZVPreflight.h"
#include "host/sdk/Document.h"
#include "host/sdk/SystemServices.h"

#include <exception>
#include <functional>

namespace {

enum class Preflight { Listas, Diagrama, Exportacao };

bool RodarPreflight(Preflight tipo) {
    switch (tipo) {
        case Preflight::Listas:
            return ZVPreflight::PreflightListas(false);
        case Preflight::Diagrama:
            return ZVPreflight::PreflightListas(true);
        case Preflight::Exportacao:
            return ZVPreflight::PreflightExportacao();
    }
    return false;
}

// The six steps every handler takes. Nothing escapes a handler.
int RodarComando(Preflight tipo, const std::function<void()>& driver) {
    try {
        if (zvsdk::Document* documento = zvsdk::activeDocument()) documento->startCommand();
        if (!RodarPreflight(tipo)) return 1;
        ZVPreflight::AbrirBracket();
        driver();
        ZVPreflight::FecharBracket();
    } catch (...) {
    }
    return 1;
}

int Lista(TipoLista tipo) {
    return RodarComando(Preflight::Listas, [tipo] { CCDriverLista::Executar(tipo); });
}

int Exporta(const char* tipo) {
    return RodarComando(Preflight::Exportacao, [tipo] { CCDriverLista::Exporta(tipo); });
}

}  // namespace

namespace ZVComandos {

int GerarListaBornesGrf() {
    return Lista(TipoLista::Bornes);
}
int GerarListaBornesDwg() {
    return Lista(TipoLista::BornesDesenho);
}
int GerarListaFiosGrf() {
    return Lista(TipoLista::Fios);
}
int GerarListaMateriaisGrf() {
    return Lista(TipoLista::Materiais);
}
int GerarListaCabosGrf() {
    return Lista(TipoLista::Cabos);
}
int Exportacao() {
    return Exporta("");
}
int ExportacaoFios() {
    return Exporta("FIOS");
}
int ExportacaoAnilhas() {
    return Exporta("ANILHAS");
}
int ExportacaoBornes() {
    return Exporta("BORNES");
}
int ExportacaoMateriais() {
    return Exporta("TUDO");
}
int ExportacaoCabos() {
    return Exporta("CABOS");
}

int DiagramaTopografico() {
    return RodarComando(Preflight::Diagrama,
                        [] { CCDriverLista::Executar(TipoLista::DiagramaTopografico); });
}

}  // namespace ZVComandos
