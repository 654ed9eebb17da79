#include "CELayoutRotasFios.h"

void CELayoutRotasFios::Limpar() {
    strKeyFio.clear();
    strRotaData.clear();
}

bool CELayoutRotasFios::Carregar(const ZVData::CEMapaCampos& campos) {
    strKeyFio = campos.value("strKeyFio");
    strRotaData = campos.value("strRotaData");
    return true;
}

ZVData::CEMapaCampos CELayoutRotasFios::Salvar() const {
    return {{"strKeyFio", strKeyFio}, {"strRotaData", strRotaData}};
}
