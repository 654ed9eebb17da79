#pragma once
// A template that is a LISP file, loaded by the product's ZVCarregaTemplate.
#include "CETemplate.h"

#include <QHash>
#include <QSet>

#include <cstdint>
#include <optional>
#include <utility>
#include <vector>

class CETemplateLisp : public CETemplate {
public:
    using CETemplate::CETemplate;

    bool Carregar() override;
    int LerInteiro(const QString& simbolo) override;
    double LerReal(const QString& simbolo) override;
    QString LerTexto(const QString& simbolo) override;
    QStringList LerListaTexto(const QString& simbolo) override;
    bool LerLogico(const QString& simbolo) override;
    void LerPonto(const QString& simbolo, double& x, double& y) override;
    bool FiltraItem(const CEItemLista& item) override;

    // The fields a LISP expression over an item (a filter, a function cell) reads, when all it
    // does with them is look them up by name, (assoc "NAME" reg), among plain functions; none
    // when it could read any field (reg used otherwise, a function of the product's own, a
    // quoted form).
    static std::optional<QSet<QString>> CamposDaExpressao(const QString& expressao);

    // The plain text-to-real rule: the leading number, 0.0 when there is none.
    static double TextoParaReal(const QString& texto);

private:
    // The last filter text read and the expression made of it.
    QString filtroLido_;
    QString avaliacao_;
    // The names the filter looks fields up by, with their numbers once numbered, when that
    // is all it reads; and its answers by those fields' values: the symbol's type and text.
    struct Resposta {
        short tipo;
        QString texto;
    };
    std::optional<std::vector<std::pair<QString, std::uint32_t>>> nomesDoFiltro_;
    QHash<QString, Resposta> respostas_;
    QString chave_;  // the item's values of those fields, as the answers are found by
    void LeFiltro(const QString& filtro);
    void ChaveDoFiltro(const CEItemLista& item, QString& chave);
};
