#pragma once
// The data writers of exports: each writes the items of a run, column by column, into one
// file, and reads its options through the driver. Files are saved atomically: the old file
// stays byte for byte when a write fails.
#include "CEPropExport.h"
#include "readers/VetorItens.h"

#include <QString>

#include <string>
#include <vector>

class CEExportacao;

class CCExportWriter {
public:
    explicit CCExportWriter(CEExportacao* exportacao) : Exportacao(exportacao) {}
    virtual ~CCExportWriter() = default;

    // Writes the file. False when it could not be written, with the reason in Erro().
    virtual bool Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                         const QString& arquivo) = 0;
    const QString& Erro() const { return erro_; }

    // The columns that are written, in order.
    static std::vector<CEPropExport> Visiveis(const std::vector<CEPropExport>& colunas);
    // Appends a text as one byte a character (Latin-1), "?" for what has no byte.
    static void AcrescentaLatin1(std::string& saida, const QString& texto);
    // Saves bytes as the whole file; false with Erro() set when it can't.
    bool Salva(const QString& arquivo, const std::string& bytes);

protected:
    CEExportacao* Exportacao;
    QString erro_;
};
