#include "CCHtmlWriter.h"

#include "CEExportacao.h"

#include <utility>
#include <vector>

namespace {

// The replacements, in the order they run. Entries after the one for U+00C3 U+0192 begin
// with that pair, which is gone by then, so they never match; they stay so the table keeps
// its shape and its order is what decides.
const std::vector<std::pair<QString, QString>>& Tabela() {
    static const std::vector<std::pair<QString, QString>> tabela = [] {
        std::vector<std::pair<QString, QString>> t = {
            {"&", "&amp;"}, {"\"", "&quot;"}, {"'", "&apos;"}, {"<", "&lt;"}, {">", "&gt;"}};
        static const char* const kNomes[] = {
            "Agrave", "Aacute", "Acirc",  "Atilde", "Auml",   "Aring",  "AElig", "Ccedil",
            "Egrave", "Eacute", "Ecirc",  "Euml",   "Igrave", "Iacute", "Icirc", "Iuml",
            "ETH",    "Ntilde", "Ograve", "Oacute", "Ocirc",  "Otilde", "Ouml",  "times",
            "Oslash", "Ugrave", "Uacute", "Ucirc",  "Uuml",   "Yacute", "THORN", "szlig",
            "agrave", "aacute", "acirc",  "atilde", "auml",   "aring",  "aelig", "ccedil",
            "egrave", "eacute", "ecirc",  "euml",   "igrave", "iacute", "icirc", "iuml",
            "eth",    "ntilde", "ograve", "oacute", "ocirc",  "otilde", "ouml",  "divide",
            "oslash", "ugrave", "uacute", "ucirc",  "uuml"};
        // Windows-1252 for the bytes 0x80 to 0x9F; the bytes it leaves out stand for
        // themselves.
        static const char16_t kCp1252[32] = {
            0x20AC, 0x0081, 0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
            0x2039, 0x0152, 0x008D, 0x017D, 0x008F, 0x0090, 0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
            0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0x009D, 0x017E, 0x0178};
        const QString prefixo = QString(QChar(0x00C3)) + QChar(0x0192);
        for (int k = 0; k < int(std::size(kNomes)); ++k) {
            const QString nome = QString("&") + kNomes[k] + ";";
            if (k == 5) {
                t.emplace_back(prefixo, nome);
                continue;
            }
            const int byte = 0x80 + k;
            const char16_t ultimo = byte < 0xA0 ? kCp1252[byte - 0x80] : char16_t(byte);
            t.emplace_back(prefixo + QChar(0x00C2) + QChar(ultimo), nome);
        }
        return t;
    }();
    return tabela;
}

bool PrecisaEscapar(const QString& texto) {
    for (const QChar c : texto) {
        const char16_t u = c.unicode();
        if (u == '&' || u == '"' || u == '\'' || u == '<' || u == '>' || u == 0x00C3) return true;
    }
    return false;
}

}  // namespace

QString CCHtmlWriter::EscapaHtml(const QString& texto) {
    if (!PrecisaEscapar(texto)) return texto;
    QString escapado = texto;
    for (const auto& [busca, troca] : Tabela())
        escapado.replace(busca, troca);
    return escapado;
}

std::string CCHtmlWriter::Conteudo(const VetorItens& itens,
                                   const std::vector<CEPropExport>& colunas) const {
    const std::vector<CEPropExport> visiveis = Visiveis(colunas);
    std::string saida;
    const auto linha = [&saida](const QString& texto) {
        AcrescentaLatin1(saida, texto);
        saida += "\r\n";
    };
    linha("<header>");
    linha("</header>");
    linha("<body>");
    QString borda = Exportacao->GetOpcao("HTML_LARG_TABELA");
    if (borda.isEmpty()) borda = "0";
    linha("<table border=\"" + borda + "\" >");
    if (Exportacao->GetOpcaoSN("HTML_CABECALHO_SN")) {
        const bool negrito = Exportacao->GetOpcaoSN("HTML_CABE_NEG_SN");
        linha("<tr>");
        for (const CEPropExport& c : visiveis)
            linha(negrito ? QString("<td><b>" + EscapaHtml(c.Titulo) + "</b></td>")
                          : QString("<td>" + EscapaHtml(c.Titulo) + "</td>"));
        linha("</tr>");
    }
    for (const CEItemLista* item : itens) {
        if (!item) continue;
        linha("<tr>");
        for (const CEPropExport& c : visiveis) {
            const QString valor = CEExportacao::Ajusta(CEExportacao::ValorColuna(*item, c),
                                                       c.Tamanho, c.Preenche, c.Direita);
            // The empty cell has always been written without the semicolon.
            linha("<td>" + (valor.isEmpty() ? QStringLiteral("&nbsp") : EscapaHtml(valor)) +
                  "</td>");
        }
        linha("</tr>");
    }
    linha("</table>");
    linha("</body>");
    return saida;
}

bool CCHtmlWriter::Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                           const QString& arquivo) {
    return Salva(arquivo, Conteudo(itens, colunas));
}
