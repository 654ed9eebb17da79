#include "ZVResultado.h"

#include "host/sdk/Document.h"
#include "host/sdk/SystemServices.h"

namespace {

void Informa(zvsdk::CommandResult resultado) {
    if (zvsdk::Document* documento = zvsdk::activeDocument())
        documento->reportCommandResult(resultado);
}

}  // namespace

namespace ZVResultado {

void Falhou() {
    Informa(zvsdk::CommandResult::Failed);
}

void Cancelado() {
    Informa(zvsdk::CommandResult::Cancelled);
}

void SemMemoria() {
    Informa(zvsdk::CommandResult::OutOfMemory);
}

}  // namespace ZVResultado
