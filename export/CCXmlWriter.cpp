#include "CCXmlWriter.h"

#include "CEExportacao.h"
#include "readers/ZVString.h"

QString CCXmlWriter::EscapaXml(const QString& texto) {
    QString e = texto;
    e.replace('"', QLatin1String("&quot;"));
    e.replace('&', QLatin1String("&amp;"));
    e.replace('\'', QLatin1String("&apos;"));
    e.replace('<', QLatin1String("&lt;"));
    e.replace('>', QLatin1String("&gt;"));
    return e;
}

QString CCXmlWriter::Handle(const CEItemLista& item) {
    if (!item.ids.empty() && item.ids.front().handle() != 0)
        return ZVString::DeHandle(item.ids.front().handle());
    return item.valorCampo("HANDLE");
}

std::string CCXmlWriter::Conteudo(const VetorItens& itens,
                                  const std::vector<CEPropExport>& colunas) const {
    const std::vector<CEPropExport> visiveis = Visiveis(colunas);
    const bool vazias = Exportacao->GetOpcaoSN("XML_VAZIAS_SN");
    const bool prompt = Exportacao->GetOpcaoSN("XML_PROMPT_SN");
    std::string saida;
    const auto linha = [&saida](const QString& texto) {
        AcrescentaLatin1(saida, texto);
        saida += "\r\n";
    };
    linha("<?xml version='1.0' encoding='UTF-8' ?>");
    linha("<proj>");
    for (const CEItemLista* item : itens) {
        if (!item) continue;
        linha("  <comp handle=\"" + EscapaXml(Handle(*item)) + "\" >");
        for (const CEPropExport& c : visiveis) {
            // Whether a property is empty goes by the field of that exact name, so an
            // expression or a literal counts as empty here.
            if (item->valorCampo(c.Tag).isEmpty() && !vazias) continue;
            QString texto = "    <prop tag=\"" + EscapaXml(c.Tag);
            if (prompt) texto += "\" prompt=\"" + EscapaXml(c.Titulo);
            texto += "\" >" +
                     EscapaXml(CEExportacao::Ajusta(CEExportacao::ValorColuna(*item, c), c.Tamanho,
                                                    c.Preenche, c.Direita)) +
                     "</prop>";
            linha(texto);
        }
        linha("  </comp>");
    }
    linha("</proj>");
    saida += "\r\n";
    return saida;
}

bool CCXmlWriter::Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                          const QString& arquivo) {
    return Salva(arquivo, Conteudo(itens, colunas));
}
