#pragma once
// The handlers of the twelve commands. Each takes nothing and returns 1.
namespace ZVComandos {

int GerarListaBornesGrf();
int GerarListaBornesDwg();
int GerarListaFiosGrf();
int GerarListaMateriaisGrf();
int GerarListaCabosGrf();
int Exportacao();
int ExportacaoFios();
int ExportacaoAnilhas();
int ExportacaoBornes();
int ExportacaoMateriais();
int ExportacaoCabos();
int DiagramaTopografico();

}  // namespace ZVComandos
