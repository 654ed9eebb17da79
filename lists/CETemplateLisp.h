#pragma once
// A template that is a LISP file, loaded by the product's ZVCarregaTemplate.
#include "CETemplate.h"

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

    // The plain text-to-real rule: the leading number, 0.0 when there is none.
    static double TextoParaReal(const QString& texto);

private:
    // The last filter text read and the expression made of it.
    QString filtroLido_;
    QString avaliacao_;
};
