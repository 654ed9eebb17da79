#pragma once
// Picks a stored export configuration: a list of the names of all but the unnamed one.
#include <QDialog>
#include <QStringList>

class QTreeWidget;

class CIDlgExportConfig : public QDialog {
public:
    CIDlgExportConfig(const QStringList& nomes, const QString& atual, QWidget* pai = nullptr);

    // The selected line; empty when none is.
    QString Selecionada() const;
    QTreeWidget* Lista() const { return lista_; }

private:
    QTreeWidget* lista_;
};
