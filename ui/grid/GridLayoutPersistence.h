#pragma once
// Where a list frame keeps its grid layouts: one file per view kind (the log's whole-log and day
// views, the contact list's table and cards), each holding the layout under one view name. The
// frame restores when it opens a view and stores when it closes it, always through the same
// pair of file and view name.

#include <QHash>
#include <QString>

namespace orvanta {

class GridController;

class GridLayoutPersistence final {
public:
    explicit GridLayoutPersistence(QString viewName)
        : m_viewName(std::move(viewName))
    {
    }

    void setFile(int kind, const QString& path) { m_files.insert(kind, path); }
    // Empty for a kind without a file.
    [[nodiscard]] QString file(int kind) const { return m_files.value(kind); }
    [[nodiscard]] const QString& viewName() const { return m_viewName; }

    // False, and the grid as the frame built it, when the kind has no file, the file is missing
    // or unreadable, or it holds no such view; damaged values inside keep the grid's own.
    bool restore(GridController& grid, int kind) const;
    // Rewrites the kind's file with this view; false when it could not be written.
    [[nodiscard]] bool store(const GridController& grid, int kind) const;

private:
    QString m_viewName;
    QHash<int, QString> m_files;
};

} // namespace orvanta
