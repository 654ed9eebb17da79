#pragma once
// The list pipeline: template, reader over the project, writer over the items.
#include "CESelecao.h"

class CCDataReader;
class CCDataWriter;
class CETemplate;

// `selecao` may be null: then the active database is read, all pages.
void ExecutarLista(CCDataReader& leitor, CCDataWriter& escritor, CETemplate& modelo,
                   const CESelecao* selecao = nullptr);
