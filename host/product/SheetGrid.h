#pragma once
// A page model's grid of columns and rows, which the lists use to tell where on its page a
// symbol stands. Columns run right from the sheet's left edge (x = 0), rows down from its top
// edge (y = 297, the A3 sheet every page lies on); a position is the row's label followed by
// the column's ("B3"). A model may give only columns or only rows: the other axis then adds
// nothing and bounds nothing.
#include <QString>
#include <QStringList>

#include <optional>
#include <vector>

namespace zvproduct {

class SheetGrid {
public:
    // From a BDPAGE row: labels cut at ";"; an interval in drawing units, one for every cell
    // or one per cell cut at ";" (the last one repeats). Nothing when neither axis has labels
    // or an interval is not a positive number.
    static std::optional<SheetGrid> fromModel(const QString& columnLabels,
                                              const QString& columnInterval,
                                              const QString& rowLabels, const QString& rowInterval);
    // The grid used where no page model gives one: rows A-H of 37.125 and columns 1-12 of 35.
    static SheetGrid fixed();

    // "??" outside the grid; a point on the far edge is in the last cell.
    QString position(double x, double y) const;

private:
    struct Axis {
        QStringList labels;
        std::vector<double> ends;  // distance from the start to each cell's far side
        bool parse(const QString& labelText, const QString& intervalText);
        // The cell at a distance from the start (0 on an axis without labels); nothing
        // outside.
        std::optional<int> at(double distance) const;
        int cells() const;
        QString label(int cell) const;
    };
    Axis columns_;
    Axis rows_;
    QStringList cells_;  // row by row, each cell's position text
};

}  // namespace zvproduct
