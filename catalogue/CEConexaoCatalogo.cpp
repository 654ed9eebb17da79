#include "CEConexaoCatalogo.h"

namespace {
CEConexaoCatalogo* conexao = nullptr;
}

CEConexaoCatalogo* CEConexaoCatalogo::ObterCatalogo() {
    if (!conexao) conexao = new CEConexaoCatalogo;
    return conexao;
}

void CEConexaoCatalogo::LiberarCatalogo() {
    delete conexao;
    conexao = nullptr;
}

bool CEConexaoCatalogo::Existe() { return conexao != nullptr; }
