#pragma once
// The route of a wire through the panel layout, as another module of the product stores it.
#include "CESerializable.h"

class CELayoutRotasFios : public ZVData::CESerializable {
public:
    explicit CELayoutRotasFios(zvdb::Database* database = nullptr)
        : CESerializable("CELayoutRotasFios", database) {}

    QString strKeyFio;
    // Segments cut by "$"; a segment's parts cut by "-": two ends, then the route.
    QString strRotaData;

    void Limpar() override;
    bool Carregar(const ZVData::CEMapaCampos& campos) override;
    ZVData::CEMapaCampos Salvar() const override;
};
