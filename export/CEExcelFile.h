#pragma once
// A small workbook writer of our own: text cells into the first sheet of a new workbook,
// or of a copy of a template workbook, keeping every other part of the template as it is
// (styles, other sheets, formulas, images). Cells are written as inline strings, so a text
// that looks like a formula ("=A1", "+1", "-", "@x") stays text.
#include <QByteArray>
#include <QString>

#include <utility>
#include <vector>

namespace zv {

class CEExcelFile {
public:
    static constexpr int kMaxLinhas = 1048576;
    static constexpr int kMaxColunas = 16384;

    // A new workbook when the path is empty or names no file; otherwise the workbook in the
    // file, which must be one (false, with Erro() saying why, when it is not).
    bool Abre(const QString& caminho);
    // Text at a zero-based row and column of the first sheet.
    void SetCelula(int linha, int coluna, const QString& texto);
    // Saves atomically; false with Erro() when it can't (the old file stays as it was).
    bool Salva(const QString& caminho);
    // The bytes of the workbook as Salva writes them; empty with Erro() on failure.
    QByteArray Conteudo();
    const QString& Erro() const { return erro_; }

    // "A1" for row 0, column 0.
    static QString Referencia(int linha, int coluna);

private:
    QByteArray NovaPasta();
    QByteArray PastaDoModelo();
    QByteArray PlanilhaNova() const;

    QString modelo_;       // the template's path, empty for a new workbook
    QByteArray original_;  // the template's bytes
    // Per row, its cells as written: (column, text); the last write of a cell wins.
    std::vector<std::vector<std::pair<int, QString>>> linhas_;
    int ignoradas_ = 0;  // cells beyond the sheet's limits
    QString erro_;
};

}  // namespace zv
