#pragma once
// The rows a catalogue statement gives: every value as text, columns read by name.
#include <QHash>
#include <QString>
#include <QStringList>
#include <QVector>

class CERegistrosCatalogo {
public:
    // No rows, and a statement that did not run.
    CERegistrosCatalogo() = default;
    // An answer of a statement that ran, with its column names in order.
    explicit CERegistrosCatalogo(const QStringList& colunas);

    // Did the statement run? An answer without rows may still have run.
    bool Executada() const { return executada_; }
    bool Vazio() const { return linhas_.isEmpty(); }
    int Linhas() const { return int(linhas_.size()); }
    int Colunas() const { return int(colunas_.size()); }
    const QStringList& NomesColunas() const { return colunas_; }

    // A value by row and column name, ignoring the case of the name (engines differ in
    // how they spell names). Empty when the row or the column is not there.
    QString Valor(int linha, const QString& coluna) const;
    QString Valor(int linha, int coluna) const;
    // The first row's value of a column, or empty.
    QString Primeiro(const QString& coluna) const { return Valor(0, coluna); }
    int IndiceColuna(const QString& coluna) const { return indices_.value(coluna.toUpper(), -1); }

    // The values of one row, in column order.
    void AdicionarLinha(const QStringList& valores);

private:
    bool executada_ = false;
    QStringList colunas_;
    QHash<QString, int> indices_;
    QVector<QStringList> linhas_;
};
