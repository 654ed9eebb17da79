#include "CECacheCatalogo.h"

#include "settings/CIMensagens.h"

#include <QChar>

QString CECacheCatalogo::Chave(const QString& a, const QString& b, const QString& c) {
    const QChar separador(0x000C);
    QString chave = a + separador + b;
    if (!c.isNull()) chave += separador + c;
    return chave;
}

QString CECacheCatalogo::Descricao(const QString& texto, int mensagem) {
    return texto.isEmpty() ? CIMensagens::Mensagem("ZVLISTAS", mensagem) : texto;
}

QString CECacheCatalogo::DescricaoComp(const QString& chave) {
    return Lembra(descricoesComp_, chave,
                  [&] { return Descricao(consultas_.DescricaoComp(chave), kMsgSemDescricaoComp); });
}

QString CECacheCatalogo::DescricaoFio(const QString& chave) {
    return Lembra(descricoesFio_, chave,
                  [&] { return Descricao(consultas_.DescricaoFio(chave), kMsgSemDescricaoFio); });
}

QString CECacheCatalogo::DescricaoCabo(const QString& chave) {
    return Lembra(descricoesCabo_, chave,
                  [&] { return Descricao(consultas_.DescricaoCabo(chave), kMsgSemDescricaoCabo); });
}

QString CECacheCatalogo::ListaComp(const QString& chave, const QString& norma) {
    return Lembra(listaComp_, Chave(chave, norma),
                  [&] { return consultas_.ListaComp(chave, norma).toUpper(); });
}

QString CECacheCatalogo::ListaFio(const QString& chave, const QString& norma) {
    return Lembra(listaFio_, Chave(chave, norma),
                  [&] { return consultas_.ListaFio(chave, norma).toUpper(); });
}

QString CECacheCatalogo::ListaCabo(const QString& chave, const QString& norma) {
    return Lembra(listaCabo_, Chave(chave, norma),
                  [&] { return consultas_.ListaCabo(chave, norma).toUpper(); });
}

QStringList CECacheCatalogo::ColunasComp(const QString& chave) {
    return Lembra(colunasComp_, chave, [&] { return consultas_.ColunasComp(chave); });
}

QStringList CECacheCatalogo::ColunasFio(const QString& chave) {
    return Lembra(colunasFio_, chave, [&] { return consultas_.ColunasFio(chave); });
}

QStringList CECacheCatalogo::ColunasCabo(const QString& chave) {
    return Lembra(colunasCabo_, chave, [&] { return consultas_.ColunasCabo(chave); });
}

QString CECacheCatalogo::MaterialSap(const QString& chave) {
    return Lembra(materiais_, chave, [&] { return consultas_.MaterialSap(chave); });
}

QStringList CECacheCatalogo::AcessoriosDe(const QString& chave) {
    return Lembra(acessorios_, chave, [&] { return consultas_.AcessoriosDe(chave); });
}

QString CECacheCatalogo::TipoComp(const QString& chave) {
    return Lembra(tipos_, chave, [&] { return consultas_.TipoComp(chave); });
}

QString CECacheCatalogo::BlocoRepresentacao(const QString& chave, const QString& norma,
                                            const QString& representacao) {
    return Lembra(blocos_, Chave(chave, norma, representacao),
                  [&] { return consultas_.BlocoRepresentacao(chave, norma, representacao); });
}
