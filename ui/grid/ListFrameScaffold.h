#pragma once
// The chrome every list frame shares (call log, contact list): the bordered panel FP3 that
// fills the frame, the caption strip RzSeparator2 with the label CL1, strips of the frame's own
// below it (the search panel), and the grid host cxGrid1 holding the frame's views (tables and
// card views). It colours
// all of them by the list-frame colour table, so a frame configures what it shows and nothing
// of how it looks.

#include <QList>

class QFrame;
class QVBoxLayout;
class QWidget;

namespace orvanta {

class GridCardView;
class GridView;
class TVKCutLabel;

class ListFrameScaffold final {
public:
    // Builds into frame, which must have no layout yet; every widget is the frame's child.
    explicit ListFrameScaffold(QWidget* frame);
    ListFrameScaffold(const ListFrameScaffold&) = delete;
    ListFrameScaffold& operator=(const ListFrameScaffold&) = delete;

    // A strip under the caption (and under the strips added before it).
    void addPanel(QFrame* panel);
    // A table view in the grid host, which takes the rest of the frame's height.
    GridView* addTableView(const QString& objectName);
    // A card view in the grid host; the cards' titles take the scheme's colours.
    GridCardView* addCardView(const QString& objectName);

    [[nodiscard]] QFrame* panel() const { return m_fp3; }
    [[nodiscard]] QFrame* captionBar() const { return m_captionBar; }
    [[nodiscard]] TVKCutLabel* caption() const { return m_caption; }
    [[nodiscard]] QWidget* gridHost() const { return m_gridHost; }

    void applyColorScheme(int scheme);

private:
    void ensureGridHost();

    QFrame* m_fp3;
    QVBoxLayout* m_box;
    QFrame* m_captionBar;
    TVKCutLabel* m_caption;
    QWidget* m_gridHost = nullptr;
    QList<QFrame*> m_panels;
    QList<GridView*> m_views;
    QList<GridCardView*> m_cardViews;
};

} // namespace orvanta
