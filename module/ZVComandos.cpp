#include "ZVComandos.h"

#include "CCDriverLista.h"
#include "ZVPreflight.h"
#include "ZVResultado.h"
#include "cad/CICad.h"
#include "host/sdk/Document.h"
#include "host/sdk/SystemServices.h"

#include <functional>
#include <new>

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

// Printed when a command runs out of memory.
constexpr int kMensagemSemMemoria = 901;

void IniciaComando() {
    if (zvsdk::Document* documento = zvsdk::activeDocument()) documento->startCommand();
}

// The command's whole batch, bracket included, is one step of the host's Undo; the step
// closes however the command ends.
class PassoDesfazer {
public:
    PassoDesfazer() { CICad::AbreDesfazer(); }
    ~PassoDesfazer() { CICad::FechaDesfazer(); }
    PassoDesfazer(const PassoDesfazer&) = delete;
    PassoDesfazer& operator=(const PassoDesfazer&) = delete;
};

// The six steps every handler takes. Nothing escapes a handler.
int RodarComando(Preflight tipo, const std::function<void()>& driver) {
    try {
        IniciaComando();
        const PassoDesfazer passo;
        if (!RodarPreflight(tipo)) {
            ZVResultado::Falhou();
            return 1;
        }
        ZVPreflight::AbrirBracket();
        driver();
        ZVPreflight::FecharBracket();
    } catch (const std::bad_alloc&) {
        CICad::ImprimeMensagem(kMensagemSemMemoria);
        ZVResultado::SemMemoria();
    } catch (...) {
        ZVResultado::Falhou();
    }
    return 1;
}

// A command this edition does not have yet says so before it touches anything.
int Indisponivel() {
    IniciaComando();
    CCDriverLista::AvisaIndisponivel();
    return 1;
}

int Lista(TipoLista tipo) {
    if (!CCDriverLista::Disponivel(tipo)) return Indisponivel();
    return RodarComando(Preflight::Listas, [tipo] { CCDriverLista::Executar(tipo); });
}

int Exporta(const char* tipo) {
    if (!CCDriverLista::ExportacaoDisponivel(tipo)) return Indisponivel();
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
    if (!CCDriverLista::Disponivel(TipoLista::DiagramaTopografico)) return Indisponivel();
    return RodarComando(Preflight::Diagrama,
                        [] { CCDriverLista::Executar(TipoLista::DiagramaTopografico); });
}

}  // namespace ZVComandos
