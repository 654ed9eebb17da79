#pragma once
// A reader with no list of its own, for tests that ask only the base's services.
#include "readers/CCDataReader.h"

class LeitorBase : public CCDataReader {
public:
    void LerLadoIni(CEItemLista&, const OdDbObjectId&, CETemplate&) override {}
    void LerLadoFim(CEItemLista&, const OdDbObjectId&, CETemplate&) override {}
    VetorItens* LerDados(zvdb::Database*, const std::optional<QStringList>&, CETemplate&,
                         CIProgress&) override {
        return nullptr;
    }
};
