#include "CCXlsxWriter.h"

#include "CEExcelFile.h"
#include "CEExportacao.h"

int CCXlsxWriter::LinhaInicial(const QString& opcao) {
    bool ok = false;
    const int n = opcao.trimmed().toInt(&ok, 10);
    return ok && n > 1 ? n - 1 : 0;
}

bool CCXlsxWriter::Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                           const QString& arquivo) {
    erro_.clear();
    int r = LinhaInicial(Exportacao->GetOpcao("XLSX_LINHA_INI_INT"));
    const std::vector<CEPropExport> visiveis = Visiveis(colunas);
    zv::CEExcelFile pasta;
    if (!pasta.Abre(Exportacao->GetOpcao("XLSX_TEMPLATE").trimmed())) {
        erro_ = pasta.Erro();
        return false;
    }
    if (Exportacao->GetOpcaoSN("XLSX_CABECALHO_SN")) {
        for (size_t c = 0; c < visiveis.size(); ++c)
            pasta.SetCelula(r, int(c), visiveis[c].Titulo);
        ++r;
    }
    for (const CEItemLista* item : itens) {
        if (!item) continue;
        for (size_t c = 0; c < visiveis.size(); ++c) {
            const CEPropExport& coluna = visiveis[c];
            pasta.SetCelula(r, int(c),
                            CEExportacao::Ajusta(CEExportacao::ValorColuna(*item, coluna),
                                                 coluna.Tamanho, coluna.Preenche, coluna.Direita));
        }
        ++r;
    }
    if (pasta.Salva(arquivo)) return true;
    erro_ = pasta.Erro();
    return false;
}
