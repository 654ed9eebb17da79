#include "CEExportConfig.h"

CEExportSecao* CEExportConfig::Secao(const QString& nome) const {
    for (const auto& secao : Secoes)
        if (secao->Nome == nome) return secao.get();
    return nullptr;
}

CEExportSecao& CEExportConfig::NovaSecao(const QString& nome) {
    Secoes.push_back(std::make_unique<CEExportSecao>(nome));
    return *Secoes.back();
}
