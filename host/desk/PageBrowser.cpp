#include "PageBrowser.h"

#include "DeskTexts.h"
#include "ProjectPages.h"

#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "product/PageRegistry.h"

#include <QHeaderView>

namespace zvdesk {

namespace {
constexpr int kPageRole = Qt::UserRole + 1;
}

PageBrowser::PageBrowser(QWidget* parent) : QTreeWidget(parent) {
    setObjectName("pageBrowser");
    setColumnCount(1);
    header()->hide();
    setUniformRowHeights(true);
    connect(this, &QTreeWidget::currentItemChanged, this, [this](QTreeWidgetItem* item) {
        if (loading_ || !item || !listener_) return;
        const QString page = item->data(0, kPageRole).toString();
        if (!page.isEmpty()) listener_(page);
    });
}

void PageBrowser::setPageListener(std::function<void(const QString&)> listener) {
    listener_ = std::move(listener);
}

void PageBrowser::load(zvdb::Database* database) {
    loading_ = true;
    clear();
    if (database) {
        const zvproduct::PageRegistry registry(*database);
        for (const zvproduct::PageGroup& group : registry.groups()) {
            auto* groupItem = new QTreeWidgetItem(this);
            const QString name = QString::fromStdString(group.name);
            const QString title = QString::fromStdString(group.title);
            groupItem->setText(0, title.isEmpty() || title == name ? name : name + " - " + title);
            QFont bold = groupItem->font(0);
            bold.setBold(true);
            groupItem->setFont(0, bold);
            groupItem->setFlags(Qt::ItemIsEnabled);
            for (const std::string& page : group.pages) {
                auto* pageItem = new QTreeWidgetItem(groupItem);
                const QString pageName = QString::fromStdString(page);
                bool cover = false;
                const bool marked = isCoverOrIndex(*database, page, &cover);
                pageItem->setText(
                    0, marked ? pageName + "  [" + words(cover ? Text::Cover : Text::Index) + "]"
                              : pageName);
                pageItem->setData(0, kPageRole, pageName);
                if (marked) {
                    QFont italic = pageItem->font(0);
                    italic.setItalic(true);
                    pageItem->setFont(0, italic);
                }
                if (!database->layer(page)) pageItem->setDisabled(true);
            }
        }
        expandAll();
    }
    loading_ = false;
}

bool PageBrowser::select(const QString& page) {
    for (QTreeWidgetItemIterator it(this); *it; ++it) {
        if ((*it)->data(0, kPageRole).toString() != page) continue;
        loading_ = true;
        setCurrentItem(*it);
        scrollToItem(*it);
        loading_ = false;
        return true;
    }
    return false;
}

QStringList PageBrowser::pages() const {
    QStringList names;
    for (QTreeWidgetItemIterator it(const_cast<PageBrowser*>(this)); *it; ++it) {
        const QString page = (*it)->data(0, kPageRole).toString();
        if (!page.isEmpty()) names << page;
    }
    return names;
}

QString PageBrowser::firstPage() const {
    for (QTreeWidgetItemIterator it(const_cast<PageBrowser*>(this)); *it; ++it)
        if (!(*it)->isDisabled() && !(*it)->data(0, kPageRole).toString().isEmpty())
            return (*it)->data(0, kPageRole).toString();
    return {};
}

QString PageBrowser::label(const QString& page) const {
    for (QTreeWidgetItemIterator it(const_cast<PageBrowser*>(this)); *it; ++it)
        if ((*it)->data(0, kPageRole).toString() == page) return (*it)->text(0);
    return {};
}

}  // namespace zvdesk
