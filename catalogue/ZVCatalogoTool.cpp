// The catalogue tool, exported for the command-line host, which cannot link module code.
#include "ZVCatalogoTool.h"

#include "CEConexaoCatalogo.h"

#include <QStringList>

extern "C" __attribute__((visibility("default"))) int zvCatalogueTool(
    int argc, const char* const* argv, CIFerramentaCatalogo::Escrita escrita, void* contexto) {
    QStringList argumentos;
    for (int i = 0; i < argc; ++i)
        argumentos << QString::fromUtf8(argv[i]);
    const int estado = CIFerramentaCatalogo(escrita, contexto).Executar(argumentos);
    // The tool runs on its own: the connection goes with it.
    CEConexaoCatalogo::LiberarCatalogo();
    return estado;
}
