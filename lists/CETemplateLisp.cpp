#include "CETemplateLisp.h"

#include "cad/CICad.h"
#include "readers/CEItemLista.h"

#include <QRegularExpression>

bool CETemplateLisp::Carregar() {
    zvsdk::ResultBuffer* resultado = CICad::zvInvokeLista("ZVCarregaTemplate", {Caminho()});
    const bool carregou = resultado && resultado->restype == zvsdk::RTT;
    CICad::LiberaLista(resultado);
    return carregou;
}

int CETemplateLisp::LerInteiro(const QString& simbolo) {
    return CICad::GetIntLisp(simbolo, 0);
}

double CETemplateLisp::LerReal(const QString& simbolo) {
    return CICad::GetRealLisp(simbolo, 0.0);
}

QString CETemplateLisp::LerTexto(const QString& simbolo) {
    return CICad::GetStringLisp(simbolo, QString());
}

QStringList CETemplateLisp::LerListaTexto(const QString& simbolo) {
    return CICad::GetListaLisp(simbolo);
}

bool CETemplateLisp::LerLogico(const QString& simbolo) {
    return CICad::GetBoolLisp(simbolo);
}

void CETemplateLisp::LerPonto(const QString& simbolo, double& x, double& y) {
    const QStringList partes = LerTexto(simbolo).split(',');
    x = TextoParaReal(partes.value(0));
    y = TextoParaReal(partes.value(1));
}

bool CETemplateLisp::FiltraItem(const CEItemLista& item) {
    static const QString simboloFiltro("*FILTRO_TEMPLATE*");
    static const QString simboloResposta("INVOKELISP_LISTAS_TMP");
    const QString filtro = LerTexto(simboloFiltro).trimmed();
    if (filtro.isEmpty()) return true;
    // The text to evaluate is made again only when the filter changes: the host keeps what
    // it read of the same text.
    if (filtro != filtroLido_) {
        filtroLido_ = filtro;
        avaliacao_ = "(progn (setq " + simboloResposta + " " + filtro + " ) (princ))";
    }
    item.paraLisp();
    CICad::AvaliaLisp(avaliacao_);
    zvsdk::ResultBuffer* valor = CICad::LeSimboloLisp(simboloResposta);
    CEItemLista::limparLisp();
    // Anything but nil passes, 0 and "" too.
    const bool passa = valor && valor->restype != zvsdk::RTNIL && valor->restype != zvsdk::RTNONE;
    CICad::LiberaLista(valor);
    return passa;
}

double CETemplateLisp::TextoParaReal(const QString& texto) {
    // Whatever the locale, the decimal mark of a template is the point.
    static const QRegularExpression numero(
        QStringLiteral("^[+-]?(\\d+\\.?\\d*|\\.\\d+)([eE][+-]?\\d+)?"));
    const QRegularExpressionMatch m = numero.match(texto.trimmed());
    return m.hasMatch() ? m.captured(0).toDouble() : 0.0;
}
