#pragma once
// The ZVListas module: its twelve commands.
#include "CCEntryPoint.h"
#include "readers/Descarte.h"

class CZVListasApp : public CCEntryPoint {
public:
    // The one instance of this load, made by odrxCreateModuleObject.
    static CZVListasApp* Instancia();
    static CZVListasApp* CriarInstancia();
    void deleteModule() override;

protected:
    void RegistrarComandos() override;
    void AposDescarregar() override {}
    void AoCriarDocumento(zvsdk::Document*) override {}
    void AoDestruirDocumento(zvsdk::Document*) override {}

private:
    CZVListasApp() { Descarte::DefinirDoModulo(&descarte_); }
    // What the commands are done with is freed on its thread while they go on, and all of it
    // before the module goes (deleteModule, which the host calls before it unloads the
    // code). A later command does not wait for the frees of the one before: nothing it
    // reaches is among them, and the texts they share are counted atomically.
    Descarte descarte_;
};
