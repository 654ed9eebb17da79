#pragma once
// The catalogue connection: one module-level object, made on first use, released at unload.
class CEConexaoCatalogo {
public:
    // The connection of this load, made on the first call.
    static CEConexaoCatalogo* ObterCatalogo();
    // Releases the connection if it was ever made; harmless otherwise.
    static void LiberarCatalogo();
    static bool Existe();

private:
    CEConexaoCatalogo() = default;
};
