#include "CEExportaPaginas.h"

#include "CEExportaPdf.h"
#include "cad/CICad.h"

#include <QFileInfo>

namespace {

constexpr int kMsgFormatoIndisponivel = 902;

}  // namespace

CEExportaPaginas::CEExportaPaginas(Opcoes opcoes) : opcoes_(std::move(opcoes)) {}

QString CEExportaPaginas::NomeArquivo(const QString& arquivo, int n, int paginas,
                                      const QString& separador, int digitos) {
    if (paginas <= 1) return arquivo;
    const int ponto = arquivo.lastIndexOf('.');
    const QString base = ponto < 0 ? QString() : arquivo.left(ponto);
    const QString extensao = ponto < 0 ? arquivo : arquivo.mid(ponto);
    return base + separador + QString("%1").arg(n, std::max(digitos, 0), 10, QChar('0')) + extensao;
}

bool CEExportaPaginas::Exporta(int formato, const QString& arquivo) {
    Arquivos.clear();
    if (formato == DWG || formato == DWF) {
        CICad::ImprimeMensagem(kMsgFormatoIndisponivel);
        return false;
    }
    if (formato != PNG && formato != DXF && formato != EMF) return false;
    const QString lembrada = CICad::GetLayerCorrente();
    const QStringList paginas = CEExportaPdf::ListaPaginas(opcoes_.value("PAGINAS"));
    const QString separador = opcoes_.value("DWG_SEPARADOR", "_");
    const int digitos = opcoes_.value("DWG_NUMERO_DIGITOS", "3").toInt();
    bool todas = !paginas.isEmpty();
    int n = 1;
    for (const QString& pagina : paginas) {
        // n counts the entries of the list: a page that fails leaves a gap in the numbers.
        const QString nome = NomeArquivo(QString(arquivo).replace("\\", "\\\\"), n++,
                                         paginas.size(), separador, digitos);
        if (!CICad::ExisteLayer(pagina)) {
            CICad::Imprime("\nno such page: " + pagina + "\n");
            todas = false;
            continue;
        }
        CICad::MostraPagina(pagina, true);
        CICad::zvInvokeVoid("AtualizaModemacro");
        bool feito = false;
        if (formato == DXF)
            feito = CICad::zvInvokeBool("zvExportaLayerDxf", {nome, pagina});
        else
            feito = CICad::Comando({"_.export", formato == PNG ? "PNG" : "EMF", nome});
        if (feito)
            Arquivos << QString(nome).replace("\\\\", "\\");
        else
            todas = false;
    }
    if (!lembrada.isEmpty() && lembrada != "0") CICad::MostraPagina(lembrada, true);
    return todas;
}
