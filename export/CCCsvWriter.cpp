#include "CCCsvWriter.h"

#include "CEExportacao.h"

std::string CCCsvWriter::Conteudo(const VetorItens& itens,
                                  const std::vector<CEPropExport>& colunas) const {
    const QString separador = Exportacao->GetOpcao("CSV_DELIM_CAMPO");
    const QString delimitador = Exportacao->GetOpcao("CSV_DELIM_TEXTO");
    const std::vector<CEPropExport> visiveis = Visiveis(colunas);
    std::string saida;
    const auto linha = [&](auto&& texto) {
        for (size_t c = 0; c < visiveis.size(); ++c) {
            if (c > 0) AcrescentaLatin1(saida, separador);
            // Delimiters inside a value are not doubled: readers of these files expect that.
            AcrescentaLatin1(saida, delimitador);
            AcrescentaLatin1(saida, texto(visiveis[c]));
            AcrescentaLatin1(saida, delimitador);
        }
        saida += "\r\n";
    };
    if (Exportacao->GetOpcaoSN("CSV_CABECALHO_SN"))
        // The heading is always padded with blanks on the right, whatever the column says.
        linha([](const CEPropExport& c) {
            return CEExportacao::Ajusta(c.Titulo, c.Tamanho, " ", false);
        });
    // Text that went through UTF-8 twice shows this pair where an ellipsis was.
    static const QString kReticenciasQuebradas = QString(QChar(0x00C3)) + QChar(0x201A);
    for (const CEItemLista* item : itens) {
        if (!item) continue;
        linha([item](const CEPropExport& c) {
            QString valor = CEExportacao::Ajusta(CEExportacao::ValorColuna(*item, c), c.Tamanho,
                                                 c.Preenche, c.Direita);
            if (valor.contains(QChar(0x00C3))) valor.replace(kReticenciasQuebradas, "...");
            return valor;
        });
    }
    return saida;
}

bool CCCsvWriter::Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                          const QString& arquivo) {
    return Salva(arquivo, Conteudo(itens, colunas));
}
