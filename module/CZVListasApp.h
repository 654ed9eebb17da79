#pragma once
// The ZVListas module: its twelve commands.
#include "CCEntryPoint.h"

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
};
