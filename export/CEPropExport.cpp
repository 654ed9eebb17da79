#include "CEPropExport.h"

CEPropExport CEPropExport::DaLinha(const CEExportSecao::LinhaColuna& linha) {
    CEPropExport coluna(linha.Tag);
    coluna.Titulo = linha.Titulo;
    coluna.Tamanho = linha.Tamanho;
    coluna.Preenche = linha.Preenche;
    coluna.Visivel = linha.Visivel;
    coluna.Agrupa = linha.Agrupa;
    coluna.Concatena = linha.Concatena;
    coluna.Direita = linha.Direita;
    return coluna;
}
