#include "PickerDialog.h"

#include "DeskTexts.h"

#include <QDialogButtonBox>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QRegularExpression>
#include <QSet>
#include <QVBoxLayout>

namespace zvdesk {

PickerDialog::PickerDialog(QWidget* parent, const QString& title, const QString& prompt,
                           const QStringList& names)
    : QDialog(parent), list_(new QListWidget(this)) {
    setObjectName("pickerDialog");
    setWindowTitle(title);
    auto* layout = new QVBoxLayout(this);
    auto* label = new QLabel(prompt, this);
    label->setWordWrap(true);
    layout->addWidget(label);
    for (const QString& name : names) {
        auto* item = new QListWidgetItem(name, list_);
        item->setFlags(Qt::ItemIsEnabled | Qt::ItemIsUserCheckable);
        item->setCheckState(Qt::Unchecked);
    }
    layout->addWidget(list_);
    if (names.isEmpty()) {
        list_->hide();
        free_ = new QLineEdit(this);
        layout->addWidget(free_);
    }
    auto* buttons = new QDialogButtonBox(this);
    if (!names.isEmpty()) {
        QPushButton* all = buttons->addButton(words(Text::SelectAll), QDialogButtonBox::ActionRole);
        QPushButton* none =
            buttons->addButton(words(Text::SelectNone), QDialogButtonBox::ActionRole);
        connect(all, &QPushButton::clicked, this, [this] { setChecked({"*"}); });
        connect(none, &QPushButton::clicked, this, [this] { setChecked({}); });
    }
    buttons->addButton(words(Text::Ok), QDialogButtonBox::AcceptRole);
    buttons->addButton(words(Text::Cancel), QDialogButtonBox::RejectRole);
    connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    layout->addWidget(buttons);
}

void PickerDialog::setChecked(const QStringList& names) {
    const bool all = names.contains("*");
    const QSet<QString> wanted(names.begin(), names.end());
    for (int i = 0; i < list_->count(); ++i) {
        QListWidgetItem* item = list_->item(i);
        item->setCheckState(all || wanted.contains(item->text()) ? Qt::Checked : Qt::Unchecked);
    }
    if (free_) free_->setText(names.join(';'));
}

QStringList PickerDialog::chosen() const {
    if (free_)
        return free_->text()
            .split(QRegularExpression("[;,]"), Qt::SkipEmptyParts)
            .replaceInStrings(QRegularExpression("^\\s+|\\s+$"), QString());
    QStringList names;
    for (int i = 0; i < list_->count(); ++i)
        if (list_->item(i)->checkState() == Qt::Checked) names << list_->item(i)->text();
    return names;
}

}  // namespace zvdesk
