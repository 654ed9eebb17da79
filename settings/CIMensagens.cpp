#include "CIMensagens.h"

#include "CIRegistro.h"
#include "cad/CICad.h"
#include "host/sdk/SystemServices.h"

#include <QFile>
#include <QHash>
#include <QXmlStreamReader>

namespace {

using Tabela = QHash<QString, QString>;

// Loaded tables by section; they live until the module unloads.
QHash<QString, Tabela>& Tabelas() {
    static QHash<QString, Tabela> tabelas;
    return tabelas;
}

QString ArquivoDaSecao(const QString& secao) {
    static const QHash<QString, QString> arquivos = {
        {"ZVLOADER", "ZVLoaderMsg.config"},
        {"ZVPALETTE", "ZVPaletteMsg.config"},
        {"ZVINSERTAUTO", "ZVInsertAutoMsg.config"},
        {"ZVPESQSIMB", "ZVPesqSimbMsg.config"},
        {"ZVAUTOUPDATE", "ZVAutoUpdate.config"},
        {"ZVCABOS", "ZVCabos.config"},
        {"ZVUTIL", "ZVUtil.config"},
        {"ZVIBD", "ZVIbd.config"},
        {"ZVFILECONFIG", "ZVFileConfg.config"},
        {"ZVMODULOCLP", "ZVModuloClp.config"},
        {"ZVOFFICE", "ZVOffice.config"},
        {"ZVIBDSETTING", "ZVIbdSetting.config"},
        {"ZVTRADUTOR", "ZVTradutor.config"},
        {"LIBPAG", "LibSelPaginas.config"},
        {"ZVPROCURA", "ZVProcura.config"},
        {"ZVIDIOMAS", "ZVIdiomas.config"},
        {"ZVCONECTOR", "ZVConectores.config"},
        {"ZVINSERE", "ZVInsere.config"},
        {"ZVPLOT", "ZVPlot.config"},
        {"ZVSETTINGS", "ZVSettings.config"},
        {"ZVWIZARD", "ZVWizard.config"},
        {"ZVINC", "ZVINC.config"},
        {"ZVLISTAS", "ZVListas.config"},
        {"ZVVIEWER", "ZVPaletteMsg.config"},
        {"ZVROTAS", "ZVRotas.config"},
        {"ZVSUPORTE", "ZVSuporte.config"},
        {"ZVCIRCLOCAL", "ZVCircLocal.config"},
        {"FVECLASS", "FVEClass.config"},
    };
    const QString arquivo = arquivos.value(secao);
    if (arquivo.isEmpty()) return {};
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    const QString pasta = servicos ? servicos->executableFolder() : QString();
    return pasta + "/program/" + arquivo;
}

QString SubstituiNomes(QString texto) {
    return texto.replace("[PRODUCTNAME]", "Ferrovolt Electrical")
        .replace("[SHORTPRODUCTNAME]", "FV");
}

void AdicionaMensagem(const QXmlStreamAttributes& atributos, Tabela& tabela) {
    if (atributos.size() < 2) return;
    tabela.insert(atributos.at(0).value().toString(),
                  SubstituiNomes(atributos.at(1).value().toString()));
}

// Depth 1 is the document element, 2 one child per language, 3 the children of a language:
// its first one holds, at depth 4, one element per message. Only the attributes' order
// counts (first the number, then the text), so the parse keeps the document's order.
bool LeTabela(const QString& conteudo, int idioma, Tabela& tabela) {
    QXmlStreamReader leitor(conteudo);
    int profundidade = 0;
    int lingua = 0;
    int filhosDaLingua = 0;
    while (!leitor.atEnd()) {
        const QXmlStreamReader::TokenType token = leitor.readNext();
        if (token == QXmlStreamReader::EndElement) --profundidade;
        if (token != QXmlStreamReader::StartElement) continue;
        ++profundidade;
        if (profundidade == 2) {
            ++lingua;
            filhosDaLingua = 0;
        } else if (lingua == idioma && profundidade == 3) {
            ++filhosDaLingua;
        } else if (lingua == idioma && profundidade == 4 && filhosDaLingua == 1) {
            AdicionaMensagem(leitor.attributes(), tabela);
        }
    }
    return !leitor.hasError();
}

}  // namespace

int CIMensagens::IdiomaAtual() {
    const int idioma = CIRegistro::IdiomaMenuSel();
    return idioma == 0 ? 2 : idioma;
}

QString CIMensagens::Mensagem(const QString& secao, int numero) {
    QHash<QString, Tabela>& tabelas = Tabelas();
    auto it = tabelas.constFind(secao);
    if (it == tabelas.constEnd()) {
        const QString caminho = ArquivoDaSecao(secao);
        CICad::Log("Loading " + caminho);
        QFile arquivo(caminho);
        if (caminho.isEmpty() || !arquivo.exists()) return QStringLiteral("Arquivo nÃƒÂ£o existe.");
        // A file that can't be read or parsed is not stored, so it is tried again next time.
        Tabela tabela;
        if (!arquivo.open(QIODevice::ReadOnly) ||
            !LeTabela(QString::fromUtf8(arquivo.readAll()), IdiomaAtual(), tabela))
            return QString();
        it = tabelas.insert(secao, tabela);
    }
    return it.value().value(QString::number(numero));
}

void CIMensagens::Descarregar() {
    Tabelas().clear();
}
