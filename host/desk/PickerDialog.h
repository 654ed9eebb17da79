#pragma once
// A choice of several names from a list (pages, terminal strips): each with a check box,
// all or none at a click. Free text is taken when the list is empty.
#include <QDialog>
#include <QStringList>

class QLineEdit;
class QListWidget;

namespace zvdesk {

class PickerDialog : public QDialog {
public:
    PickerDialog(QWidget* parent, const QString& title, const QString& prompt,
                 const QStringList& names);

    // The checked names in list order (or the typed ones when there was no list).
    QStringList chosen() const;
    void setChecked(const QStringList& names);
    QListWidget* list() const { return list_; }

private:
    QListWidget* list_;
    QLineEdit* free_ = nullptr;
};

}  // namespace zvdesk
