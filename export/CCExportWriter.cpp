#include "CCExportWriter.h"

#include "host/sdk/AtomicFile.h"

std::vector<CEPropExport> CCExportWriter::Visiveis(const std::vector<CEPropExport>& colunas) {
    std::vector<CEPropExport> visiveis;
    for (const CEPropExport& coluna : colunas)
        if (coluna.Visivel) visiveis.push_back(coluna);
    return visiveis;
}

void CCExportWriter::AcrescentaLatin1(std::string& saida, const QString& texto) {
    const QChar* p = texto.constData();
    const QChar* fim = p + texto.size();
    saida.reserve(saida.size() + size_t(texto.size()));
    for (; p < fim; ++p) {
        const char16_t c = p->unicode();
        if (c <= 0xFF) {
            saida.push_back(char(c));
        } else {
            saida.push_back('?');
            // A pair of surrogates is one character: one "?".
            if (QChar::isHighSurrogate(c) && p + 1 < fim && p[1].isLowSurrogate()) ++p;
        }
    }
}

bool CCExportWriter::Salva(const QString& arquivo, const std::string& bytes) {
    erro_.clear();
    if (zvsdk::saveFileAtomically(arquivo, bytes, &erro_)) return true;
    if (erro_.isEmpty()) erro_ = "could not save " + arquivo;
    return false;
}
