#pragma once
// Abstract access to a template: a set of LISP symbols left by loading its file.
#include <QString>
#include <QStringList>

class CEItemLista;

class CETemplate {
public:
    explicit CETemplate(const QString& caminho) : caminho_(caminho) {}
    virtual ~CETemplate() = default;
    const QString& Caminho() const { return caminho_; }

    // Loads the template file; false when it can't be used.
    virtual bool Carregar() = 0;
    virtual int LerInteiro(const QString& simbolo) = 0;
    virtual double LerReal(const QString& simbolo) = 0;
    virtual QString LerTexto(const QString& simbolo) = 0;
    virtual QStringList LerListaTexto(const QString& simbolo) = 0;
    virtual bool LerLogico(const QString& simbolo) = 0;
    // "X,Y" text as two reals.
    virtual void LerPonto(const QString& simbolo, double& x, double& y) = 0;
    // Does the item pass the template's filter?
    virtual bool FiltraItem(const CEItemLista& item) = 0;

private:
    QString caminho_;
};
