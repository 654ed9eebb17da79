#include "CIMensagens.h"

#include "CIRegistro.h"
#include "cad/CICad.h"
#include "host/sdk/SystemServices.h"

#include <QDomDocument>
#include <QFile>
#include <QHash>

#include <mutex>

namespace {

using Tabela = QHash<QString, QString>;

// Loaded tables by section; they live until the module unloads.
QHash<QString, Tabela>& Tabelas() {
    static QHash<QString, Tabela> tabelas;
    return tabelas;
}

QString ArquivoDaSecao(const QString& secao) {
    static const QHash<QString, QString> arquivos = {
        {"ZVLOADER", "ZVLoaderMsg.config"},   {"ZVPALETTE", "ZVPaletteMsg.config"},
        {"ZVINSERTAUTO", "ZVInsertAutoMsg.config"}, {"ZVPESQSIMB", "ZVPesqSimbMsg.config"},
        {"ZVAUTOUPDATE", "ZVAutoUpdate.config"}, {"ZVCABOS", "ZVCabos.config"},
        {"ZVUTIL", "ZVUtil.config"},           {"ZVIBD", "ZVIbd.config"},
        {"ZVFILECONFIG", "ZVFileConfg.config"}, {"ZVMODULOCLP", "ZVModuloClp.config"},
        {"ZVOFFICE", "ZVOffice.config"},       {"ZVIBDSETTING", "ZVIbdSetting.config"},
        {"ZVTRADUTOR", "ZVTradutor.config"},   {"LIBPAG", "LibSelPaginas.config"},
        {"ZVPROCURA", "ZVProcura.config"},     {"ZVIDIOMAS", "ZVIdiomas.config"},
        {"ZVCONECTOR", "ZVConectores.config"}, {"ZVINSERE", "ZVInsere.config"},
        {"ZVPLOT", "ZVPlot.config"},           {"ZVSETTINGS", "ZVSettings.config"},
        {"ZVWIZARD", "ZVWizard.config"},       {"ZVINC", "ZVINC.config"},
        {"ZVLISTAS", "ZVListas.config"},       {"ZVVIEWER", "ZVPaletteMsg.config"},
        {"ZVROTAS", "ZVRotas.config"},         {"ZVSUPORTE", "ZVSuporte.config"},
        {"ZVCIRCLOCAL", "ZVCircLocal.config"}, {"FVECLASS", "FVEClass.config"},
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

// The language's child holds, in its first child, one element per message: the first
// attribute is the number, the second the text. Attribute names are not looked at.
Tabela LeTabela(const QDomDocument& documento, int idioma) {
    Tabela tabela;
    QDomElement lingua = documento.documentElement().firstChildElement();
    for (int i = 1; i < idioma && !lingua.isNull(); ++i) lingua = lingua.nextSiblingElement();
    if (lingua.isNull()) return tabela;
    for (QDomElement e = lingua.firstChildElement().firstChildElement(); !e.isNull();
         e = e.nextSiblingElement()) {
        const QDomNamedNodeMap atributos = e.attributes();
        if (atributos.count() < 2) continue;
        tabela.insert(atributos.item(0).nodeValue(), SubstituiNomes(atributos.item(1).nodeValue()));
    }
    return tabela;
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
        QDomDocument documento;
        if (!arquivo.open(QIODevice::ReadOnly) || !documento.setContent(&arquivo))
            return QString();
        it = tabelas.insert(secao, LeTabela(documento, IdiomaAtual()));
    }
    return it.value().value(QString::number(numero));
}

void CIMensagens::Descarregar() { Tabelas().clear(); }
