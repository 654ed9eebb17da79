#include "ExecutarLista.h"

#include "CCDataWriter.h"
#include "CIProgress.h"
#include "ZVResultado.h"
#include "cad/CICad.h"
#include "host/sdk/Document.h"
#include "host/sdk/SystemServices.h"
#include "lists/CETemplate.h"
#include "readers/CCDataReader.h"

#include <exception>
#include <memory>

namespace {

zvdb::Database* DatabaseAtiva() {
    zvsdk::Document* documento = zvsdk::activeDocument();
    return documento ? documento->database() : nullptr;
}

void Junta(VetorItens& todos, VetorItens* lidos) {
    if (!lidos) return;
    todos.juntarSemRepetir(*lidos);
    delete lidos;
}

VetorItens Ler(CCDataReader& leitor, CETemplate& modelo, const CESelecao* selecao,
               CIProgress& progresso) {
    VetorItens todos;
    if (!selecao) {
        Junta(todos, leitor.LerDados(DatabaseAtiva(), std::nullopt, modelo, progresso));
        // The items are made: what the reader kept to make them goes before the writer's
        // blocks come in.
        leitor.LiberaLeituras();
        return todos;
    }
    for (const CEParteSelecao& parte : *selecao) {
        const std::optional<QStringList> paginas = parte.paginas;  // the reader gets a copy
        Junta(todos, leitor.LerDados(parte.database, paginas, modelo, progresso));
    }
    leitor.LiberaLeituras();
    return todos;
}

// The writer's stop: a ZVString goes to a message box, anything else to the command line.
void Escrever(CCDataWriter& escritor, VetorItens& itens, CETemplate& modelo) {
    try {
        escritor.EscreverItens(itens, modelo);
    } catch (const ZVString& texto) {
        CICad::MessageBox(texto);
        throw;
    } catch (const std::exception& erro) {
        CICad::Imprime("\n\nERROR=" + QString::fromLocal8Bit(erro.what()));
        throw;
    } catch (...) {
        CICad::Imprime("\n\nERROR: check your template");
        throw;
    }
}

}  // namespace

void ExecutarLista(CCDataReader& leitor, CCDataWriter& escritor, CETemplate& modelo,
                   const CESelecao* selecao) {
    if (!modelo.Carregar()) {
        CICad::ImprimeMensagem(88);
        ZVResultado::Falhou();
        return;
    }
    auto progresso = std::make_unique<CIProgress>();
    progresso->Mostrar();
    progresso->Definir(0, QString());
    VetorItens itens;
    try {
        itens = Ler(leitor, modelo, selecao, *progresso);
    } catch (...) {
        progresso->Fechar();
        throw;
    }
    progresso->Definir(95);
    try {
        Escrever(escritor, itens, modelo);
    } catch (...) {
        // The writer stopped the run: nothing leaks, and there is no end message.
        ZVResultado::Falhou();
        itens.destruirItens();
        progresso->Fechar();
        return;
    }
    itens.destruirItens();
    progresso->Definir(100);
    progresso->Fechar();
    progresso.reset();
    CICad::ImprimeMensagem(63);
}
