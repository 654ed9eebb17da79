#pragma once
// The sort of VetorItens::ordenar, stable: items whose fields tie keep the order they had.
#include "VetorItens.h"

#include <QStringList>

void OrdenaItensEstavel(VetorItens& itens, const QStringList& campos);
