#pragma once
// The project's pages by group, in registry order; covers and indexes are marked. A click
// on a page asks to show it.
#include <QTreeWidget>

#include <functional>

namespace zvdb {
class Database;
}

namespace zvdesk {

class PageBrowser : public QTreeWidget {
public:
    explicit PageBrowser(QWidget* parent = nullptr);

    // Fills the tree from the drawing's page registry; null empties it.
    void load(zvdb::Database* database);
    void setPageListener(std::function<void(const QString&)> listener);
    // Marks the page shown; false when the tree has no such page.
    bool select(const QString& page);
    QStringList pages() const;
    QString firstPage() const;
    // The text shown for a page, with its cover or index mark.
    QString label(const QString& page) const;

private:
    std::function<void(const QString&)> listener_;
    bool loading_ = false;
};

}  // namespace zvdesk
