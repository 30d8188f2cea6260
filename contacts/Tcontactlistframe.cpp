#include "contacts/Tcontactlistframe.h"

#include "contacts/ContactAnchors.h"
#include "contacts/ContactCardRows.h"
#include "contacts/ContactSummary.h"
#include "contacts/Tnotizviewform.h"
#include "db/TDM2.h"
#include "db/TDM2Statements.h"
#include "dbgrid/RecordStoreGridSource.h"
#include "platform/AppException.h"
#include "platform/ErrorLog.h"
#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"
#include "platform/WindowMessages.h"
#include "ui/dialogs/BusyCursor.h"
#include "ui/grid/GridCardView.h"
#include "ui/grid/GridColumnMenu.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridLayoutPersistence.h"
#include "ui/grid/GridSearchPanel.h"
#include "ui/grid/GridUpdateLock.h"
#include "ui/grid/GridView.h"
#include "ui/grid/ListFrameScaffold.h"
#include "ui/label/TVKCutLabel.h"
#include "ui/markup/MarkupPanel.h"
#include "ui/scheme/ColorScheme.h"

#include <QAction>
#include <QButtonGroup>
#include <QCoreApplication>
#include <QFile>
#include <QHBoxLayout>
#include <QLabel>
#include <QLinearGradient>
#include <QMenu>
#include <QPainter>
#include <QScopedValueRollback>
#include <QScrollArea>
#include <QSplitter>
#include <QStyle>
#include <QTimer>
#include <QToolButton>
#include <QVBoxLayout>

namespace orvanta {
namespace {

const QString kLabel = QStringLiteral("# Contactlistframe - ");
// The layout files hold each view under this name.
const QString kViewName = QStringLiteral("1");
const QString kLevelSection = QStringLiteral("Level_GV");
const QString kPrefix = QStringLiteral("cxGrid1DBTableView1");
constexpr int kDefaultPercent = 60;
// Ticks of T1 (50 ms) the summary waits after the last keyboard step.
constexpr int kSummaryTicks = 10;

QString columnName(const char* field)
{
    return kPrefix + QLatin1String(field);
}

using ViewLock = GridUpdateLock;

// The footer under the table: a vertical gradient, a one-pixel border and black text inset by
// three pixels, in the colours of the scheme.
class FooterLabel final : public QLabel {
public:
    using QLabel::QLabel;

    void setColors(const QColor& top, const QColor& bottom, const QColor& border)
    {
        m_top = top;
        m_bottom = bottom;
        m_border = border;
        update();
    }

protected:
    void paintEvent(QPaintEvent*) override
    {
        QPainter p(this);
        const QRect r = rect();
        QLinearGradient g(r.topLeft(), r.bottomLeft());
        g.setColorAt(0, m_top);
        g.setColorAt(1, m_bottom);
        p.fillRect(r, g);
        p.setPen(m_border);
        p.drawRect(r.adjusted(0, 0, -1, -1));
        p.setPen(Qt::black);
        p.setFont(font());
        p.drawText(r.adjusted(3, 0, -3, 0), Qt::AlignLeft | Qt::AlignVCenter, text());
    }

private:
    QColor m_top{Qt::white};
    QColor m_bottom{Qt::lightGray};
    QColor m_border{Qt::gray};
};

// The text of a source field, empty for null or a field the source does not have.
QString fieldText(const GridSource& s, quint32 record, const QString& field)
{
    const int f = s.fieldIndex(field);
    return f < 0 || s.isNull(record, f) ? QString() : s.text(record, f);
}

} // namespace

Tcontactlistframe::Tcontactlistframe(TDM2* dm, QWidget* parent)
    : ContactListFrame(parent)
    , m_dm(dm)
{
    setObjectName(QStringLiteral("contactlistframe"));
    buildLayout();
    buildColumns();
    buildActions();
    m_noteOpener = [this](int lid) { Tnotizviewform::showNote(m_dm, lid); };
    m_t1 = new QTimer(this);
    m_t1->setObjectName(QStringLiteral("T1"));
    m_t1->setInterval(50);
    connect(m_t1, &QTimer::timeout, this, &Tcontactlistframe::T1Timer);

    if (m_dm) {
        for (DataSet* ds : {&m_dm->ibcds_list, &m_dm->ibcds_card}) {
            // Whoever closes the data set (the data module going down) must not leave the grid
            // reading a store that is gone.
            connect(ds, &DataSet::aboutToClose, this, [this, ds] {
                if (!m_refreshing && ds == dataSetOf(m_viewKind))
                    detachSource();
            });
        }
    }
    connectView(m_view);
    connectView(m_cards);
    connect(m_view, &GridView::columnDraggedOut, m_columnMenu, &GridColumnMenu::columnDraggedOut);
    connect(m_summary, &MarkupPanel::anchorClicked, this, &Tcontactlistframe::HTMLStaticText1AnchorClick);
    showActiveView();
    cv_editcontUpdate();
    updateFooter();
}

Tcontactlistframe::~Tcontactlistframe()
{
    // The grids must not outlive the source they read.
    m_view->setSource(nullptr);
    m_cards->setSource(nullptr);
}

// Both views report to the same handlers; only the active one counts (the other has no source,
// but unbinding it still announces a change of focus).
void Tcontactlistframe::connectView(GridViewBase* view)
{
    const auto active = [this, view] { return view == activeGrid(); };
    connect(view, &GridViewBase::focusedRecordChanged, this, [this, active] {
        if (active() && !m_changingView)
            FocusedRecordChanged();
    });
    connect(view->controller(), &GridController::layoutChanged, this, [this, active] {
        if (active())
            updateFooter();
    });
    connect(view, &GridViewBase::rowDoubleClicked, this, [this, view](int row) {
        if (view->controller()->isGroupRow(row))
            return;
        cv_editcontUpdate();
        if (m_editCont->isEnabled())
            m_editCont->trigger();
    });
    connect(view, &GridViewBase::keyPressed, this, [this](int key, Qt::KeyboardModifiers) {
        switch (key) {
        case Qt::Key_PageUp:
        case Qt::Key_PageDown:
        case Qt::Key_End:
        case Qt::Key_Home:
        case Qt::Key_Up:
        case Qt::Key_Down:
            m_deferSummary = true;
            break;
        case Qt::Key_Delete:
            cv_editcontUpdate();
            if (m_deleteCont->isEnabled())
                m_deleteCont->trigger();
            break;
        default:
            break;
        }
    });
    connect(view, &GridViewBase::rowContextMenuRequested, this, &Tcontactlistframe::showPopup);
    view->controller()->setKeyField(QStringLiteral("LID"));
    view->controller()->setFocusFirstAfterSort(true);
}

GridViewBase* Tcontactlistframe::gridOf(int viewKind) const
{
    if (viewKind == CardView)
        return m_cards;
    return m_view;
}

GridViewBase* Tcontactlistframe::activeGrid() const
{
    return gridOf(m_viewKind);
}

GridController* Tcontactlistframe::controller() const
{
    return activeGrid()->controller();
}

QMenu* Tcontactlistframe::popupMenu() const
{
    return m_viewKind == CardView ? m_cardPopup : m_popup;
}

// Only the active view is on screen; the footer belongs to the table.
void Tcontactlistframe::showActiveView()
{
    const bool cards = m_viewKind == CardView;
    m_view->setVisible(!cards);
    m_cards->setVisible(cards);
    m_footer->setVisible(!cards);
}

QString Tcontactlistframe::viewStoreFile()
{
    return programFile(QStringLiteral("VStore"));
}

QString Tcontactlistframe::layoutFile(int viewKind)
{
    return programFile(viewKind == CardView ? QStringLiteral("VStoreC") : QStringLiteral("VStoreT"));
}

// ---------------------------------------------------------------------------------------------
// Construction

void Tcontactlistframe::buildLayout()
{
    m_layouts = std::make_unique<GridLayoutPersistence>(kViewName);
    m_layouts->setFile(TableView, layoutFile(TableView));
    m_layouts->setFile(CardView, layoutFile(CardView));
    m_scaffold = std::make_unique<ListFrameScaffold>(this);
    m_cl1 = m_scaffold->caption();
    m_cl1->setText(QStringLiteral("Kontakte (alle)"));
    // Before the grid host moves into the splitter: strips stand above the grid host.
    m_searchPanel = new GridSearchPanel(
        {QStringLiteral("Anrede"), QStringLiteral("Anschriftenzusatz"), QStringLiteral("Bundesland"),
         QStringLiteral("Firma"), QStringLiteral("Kategorie"), QStringLiteral("Kontakt"), QStringLiteral("Land"),
         QStringLiteral("Name"), QStringLiteral("Ort"), QStringLiteral("PLZ"), QStringLiteral("Straße"),
         QStringLiteral("Titel"), QStringLiteral("Vorname")},
        m_scaffold->panel());
    m_scaffold->addPanel(m_searchPanel);
    connect(m_searchPanel, &GridSearchPanel::searchRequested, this, &Tcontactlistframe::ADVSearchStartClick);
    connect(m_searchPanel, &GridSearchPanel::clearRequested, this, &Tcontactlistframe::L3Click);
    connect(m_searchPanel, &GridSearchPanel::closeRequested, this, &Tcontactlistframe::AdvCloseSearchPanClick);
    m_view = m_scaffold->addTableView(QStringLiteral("cxGrid1DBTableView1"));
    m_view->setHeaderHeight(21);
    m_view->setAutoWidth(true);
    m_view->setSortedColumnColor(QColor(0xEF, 0xEF, 0xEF));
    m_cards = m_scaffold->addCardView(QStringLiteral("cxGrid1DBCardView1"));
    m_cards->setCardWidth(kContactCardWidth);

    // The grid host goes into the splitter above the summary, the letter bar to their right.
    QWidget* gridHost = m_scaffold->gridHost();
    auto* box = qobject_cast<QVBoxLayout*>(m_scaffold->panel()->layout());
    box->removeWidget(gridHost);
    auto* body = new QWidget(m_scaffold->panel());
    auto* bodyLayout = new QHBoxLayout(body);
    bodyLayout->setContentsMargins(0, 0, 0, 0);
    bodyLayout->setSpacing(0);
    m_splitter = new QSplitter(Qt::Vertical, body);
    m_splitter->setObjectName(QStringLiteral("RzSplitter1"));
    m_splitter->setChildrenCollapsible(false);
    connect(m_splitter, &QSplitter::splitterMoved, this, [this] {
        const QList<int> sizes = m_splitter->sizes();
        const int total = sizes.value(0) + sizes.value(1);
        if (total > 0)
            m_percent = qRound(100.0 * sizes.value(0) / total);
    });

    auto* gridPart = new QWidget(m_splitter);
    auto* gridPartLayout = new QVBoxLayout(gridPart);
    gridPartLayout->setContentsMargins(0, 0, 0, 0);
    gridPartLayout->setSpacing(0);
    gridHost->setParent(gridPart);
    gridPartLayout->addWidget(gridHost, 1);
    // The footer: the count of the contacts the filter lets through.
    m_footer = new FooterLabel(gridPart);
    m_footer->setObjectName(QStringLiteral("cxGrid1DBTableView1Footer"));
    m_footer->setFont(QFont(QStringLiteral("Verdana"), 8));
    m_footer->setFixedHeight(QFontMetrics(m_footer->font()).height() + 8);
    gridPartLayout->addWidget(m_footer);
    m_splitter->addWidget(gridPart);

    m_scrollBox4 = new QScrollArea(m_splitter);
    m_scrollBox4->setObjectName(QStringLiteral("ScrollBox4"));
    m_scrollBox4->setMinimumHeight(70);
    m_scrollBox4->setWidgetResizable(true);
    m_summary = new MarkupPanel(m_scrollBox4);
    m_summary->setObjectName(QStringLiteral("HTMLStaticText1"));
    m_summary->setImages({style()->standardIcon(QStyle::SP_FileDialogInfoView).pixmap(24, 24)});
    m_summary->setText(kEmptySummary);
    m_scrollBox4->setWidget(m_summary);
    m_splitter->addWidget(m_scrollBox4);
    bodyLayout->addWidget(m_splitter, 1);

    m_toolbar = new QWidget(body);
    m_toolbar->setObjectName(QStringLiteral("RzToolbar1"));
    m_toolbar->setAutoFillBackground(true);
    buildLetterBar(m_toolbar);
    bodyLayout->addWidget(m_toolbar);
    box->addWidget(body, 1);
    setSplitterPercent(kDefaultPercent);
}

void Tcontactlistframe::buildLetterBar(QWidget* parent)
{
    auto* layout = new QVBoxLayout(parent);
    layout->setContentsMargins(1, 1, 1, 1);
    layout->setSpacing(0);
    m_letters = new QButtonGroup(this);
    m_letters->setExclusive(true);
    for (int t = 0; t <= 26; ++t) {
        auto* b = new QToolButton(parent);
        b->setObjectName(QStringLiteral("AdvToolButton%1").arg(t + 1));
        b->setText(t == 0 ? QStringLiteral("...") : QString(QChar(u'A' + t - 1)));
        b->setCheckable(true);
        b->setAutoRaise(true);
        b->setProperty("tag", t);
        b->setSizePolicy(QSizePolicy::Fixed, QSizePolicy::Expanding);
        b->setFixedWidth(24);
        b->setMinimumHeight(12);
        m_letters->addButton(b, t);
        layout->addWidget(b);
    }
    m_letters->button(0)->setChecked(true);
    // AdvToolButton1Click
    connect(m_letters, &QButtonGroup::idClicked, this, [this](int t) {
        SetLetterButton(t);
        SetNewFilter(t);
    });
}

void Tcontactlistframe::buildColumns()
{
    const auto add = [this](const char* field, const QString& caption, int tag, int width) {
        GridColumn c(columnName(field), QLatin1String(field), caption, tag, width > 0 ? width : 64);
        const QString f = QLatin1String(field);
        // Only category, post code and town make sense as groups.
        c.groupable = f == QLatin1String("KATBEZ") || f == QLatin1String("PLZ") || f == QLatin1String("ORT");
        return m_view->addColumn(c);
    };
    GridColumn lid(columnName("LID"), QStringLiteral("LID"));
    lid.visible = false;
    lid.sortable = lid.groupable = lid.movable = false;
    lid.showInColumnMenu = false;
    m_view->addColumn(lid);
    const int contbez = add("CONTBEZ", QStringLiteral("Kontakt"), 1, 191);
    add("ANREDE", QStringLiteral("Anrede"), 6, 0);
    add("TITEL", QStringLiteral("Titel"), 9, 0);
    add("NAME", QStringLiteral("Name"), 7, 0);
    add("VNAME", QStringLiteral("Vorname"), 8, 0);
    add("FIRMA", QStringLiteral("Firma"), 10, 0);
    add("KATBEZ", QStringLiteral("Kategorie"), 5, 132);
    add("STR", QStringLiteral("Straße"), 2, 164);
    add("PLZ", QStringLiteral("PLZ"), 3, 46);
    add("ORT", QStringLiteral("Ort"), 4, 153);
    add("ZUSATZ", QStringLiteral("Anschriftenzusatz"), 11, 0);
    add("LAND", QStringLiteral("Land"), 12, 0);
    add("BUNDESLAND", QStringLiteral("Bundesland"), 13, 0);
    m_view->controller()->setSortOrder(contbez, GridSortOrder::Ascending);
    buildCards();
}

void Tcontactlistframe::buildCards()
{
    // The computed rows read the hidden rows of the same card, found by their captions.
    const auto fieldOfCaption = [](const char* caption) {
        for (const ContactCardRow& r : contactCardRows())
            if (r.field && qstrcmp(r.caption, caption) == 0)
                return QString::fromLatin1(r.field);
        return QString();
    };
    const QString surname = fieldOfCaption("Nachname");
    const QString firstName = fieldOfCaption("Vorname");
    const QString postCode = fieldOfCaption("PLZ");
    const QString town = fieldOfCaption("Ort");
    GridController* g = m_cards->controller();
    for (const ContactCardRow& r : contactCardRows()) {
        GridColumn c(QLatin1String(r.name), r.field ? QLatin1String(r.field) : QString(), QString::fromUtf8(r.caption),
                     r.tag, kContactCardWidth);
        c.visible = r.visible;
        c.movable = r.movable;
        c.groupable = false;
        c.showInColumnMenu = r.tag != 0;
        if (!r.field) {
            c.sortable = false;
            if (qstrcmp(r.caption, "Name") == 0)
                c.displayText = [surname, firstName](const GridSource& s, quint32 record) {
                    return contactCardName(fieldText(s, record, surname), fieldText(s, record, firstName));
                };
            else
                c.displayText = [postCode, town](const GridSource& s, quint32 record) {
                    return contactCardPlace(fieldText(s, record, postCode), fieldText(s, record, town));
                };
        }
        if (r.tag == 0)
            c.sortable = false;
        const int column = m_cards->addColumn(c);
        if (r.captionRow) {
            m_cards->setCaptionColumn(column);
            g->setSortOrder(column, GridSortOrder::Ascending);
        }
    }
}

void Tcontactlistframe::buildActions()
{
    const auto action = [this](const char* name, const QString& caption, const QString& hint,
                               QStyle::StandardPixmap icon) {
        auto* a = new QAction(style()->standardIcon(icon), caption, this);
        a->setObjectName(QLatin1String(name));
        a->setToolTip(hint);
        a->setStatusTip(hint);
        addAction(a);
        return a;
    };
    m_newCont = action("cv_newcont", QStringLiteral("Neu.."), QStringLiteral("Neuen Kontakt anlegen"),
                       QStyle::SP_FileDialogNewFolder);
    m_editCont = action("cv_editcont", QStringLiteral("Bearbeiten..."), QStringLiteral("Markierten Kontakt bearbeiten"),
                        QStyle::SP_FileDialogDetailedView);
    m_deleteCont = action("cv_deletecont", QStringLiteral("Löschen"), QStringLiteral("Markierten Kontakt löschen"),
                          QStyle::SP_TrashIcon);
    connect(m_newCont, &QAction::triggered, this, [this] { postMessage(m_host, WMNEWCONTACT, 0, 0); });
    connect(m_editCont, &QAction::triggered, this, [this] { postMessage(m_host, WMOPENCONTACT, 0, 0); });
    connect(m_deleteCont, &QAction::triggered, this, [this] { postMessage(m_host, WMDELETECONTACT, 0, 0); });
    m_search = action("cv_search", QStringLiteral("Suchen..."), QStringLiteral("Kontakte durchsuchen"),
                      QStyle::SP_FileDialogContentsView);
    m_search->setShortcut(QKeySequence::Find);
    m_search->setShortcutContext(Qt::WidgetWithChildrenShortcut);
    connect(m_search, &QAction::triggered, this, &Tcontactlistframe::OpenSearchPanel);

    m_popup = new QMenu(this);
    m_popup->setObjectName(QStringLiteral("AdvPopupMenu2"));
    m_popup->addAction(m_newCont);
    m_popup->addAction(m_editCont);
    m_popup->addSeparator();
    m_popup->addAction(m_deleteCont);
    m_popup->addSeparator();
    m_popup->addAction(m_search);
    m_popup->addSeparator();
    m_columnMenu = new GridColumnMenu(m_view, m_popup, QStringLiteral("Ansicht1"), this);
    static constexpr const char* captions[13] = {"Kontakt", "Straße", "PLZ", "Ort", "Kategorie", "Anrede", "Name",
                                                 "Vorname", "Titel", "Firma", "Anschriftenzusatz", "Land",
                                                 "Bundesland"};
    for (int i = 0; i < 13; ++i)
        m_columnMenu->addEntry(QStringLiteral("tvum%1").arg(i + 1), QString::fromUtf8(captions[i]), i + 1);
    // tvum1Click: only while the table is active.
    m_columnMenu->setClickHandler([this](QAction* a) {
        if (m_viewKind == TableView)
            SetTableColVisibleState(a->isChecked(), a->property("tag").toInt());
    });

    m_cardPopup = new QMenu(this);
    m_cardPopup->setObjectName(QStringLiteral("AdvPopupMenu1"));
    m_cardPopup->addAction(m_newCont);
    m_cardPopup->addAction(m_editCont);
    m_cardPopup->addSeparator();
    m_cardPopup->addAction(m_deleteCont);
    m_cardPopup->addSeparator();
    m_cardPopup->addAction(m_search);
    m_cardPopup->addSeparator();
    m_rowMenu = new GridColumnMenu(m_cards, m_cardPopup, QStringLiteral("Ansicht2"), this);
    static constexpr const char* rowCaptions[10] = {"Anrede",   "Titel",  "Name/Vorname",      "Firma", "Kategorie",
                                                    "Straße",   "PLZ/Ort", "Anschriftenzusatz", "Land",  "Bundesland"};
    for (int i = 0; i < 10; ++i)
        m_rowMenu->addEntry(QStringLiteral("CVUM%1").arg(i + 1), QString::fromUtf8(rowCaptions[i]), i + 1);
    // CVUM1Click: only while the cards are active.
    m_rowMenu->setClickHandler([this](QAction* a) {
        if (m_viewKind == CardView)
            SetCardRowVisibleState(a->isChecked(), a->property("tag").toInt());
    });
}

// ---------------------------------------------------------------------------------------------
// Source binding

DataSet* Tcontactlistframe::dataSetOf(int viewKind) const
{
    if (!m_dm)
        return nullptr;
    if (viewKind == TableView)
        return &m_dm->ibcds_list;
    if (viewKind == CardView)
        return &m_dm->ibcds_card;
    return nullptr;
}

void Tcontactlistframe::bindSource()
{
    DataSet* ds = dataSetOf(m_viewKind);
    if (!ds || !ds->isActive()) {
        detachSource();
        return;
    }
    if (!m_source || &m_source->store() != &ds->store()) {
        m_view->setSource(nullptr);
        m_cards->setSource(nullptr);
        m_source = std::make_unique<RecordStoreGridSource>(ds->store());
    }
    activeGrid()->setSource(m_source.get());
}

void Tcontactlistframe::detachSource()
{
    for (GridViewBase* v : {static_cast<GridViewBase*>(m_view), static_cast<GridViewBase*>(m_cards)})
        if (v->controller()->source())
            v->setSource(nullptr);
    m_source.reset();
    updateFooter();
}

bool Tcontactlistframe::storeLayout(int viewKind) const
{
    if (viewKind == CardView)
        return m_cards->storeLayout(m_layouts->file(CardView), m_layouts->viewName());
    return m_layouts->store(*m_view->controller(), TableView);
}

void Tcontactlistframe::restoreLayout(int viewKind)
{
    if (viewKind == CardView) {
        m_cards->restoreLayout(m_layouts->file(CardView), m_layouts->viewName());
        // The cards offer no way to sort; a layout that lost every sort key (a damaged file)
        // must not leave them in the order the server happened to deliver.
        GridController* g = m_cards->controller();
        if (g->sortedColumns().empty() && m_cards->captionColumn() >= 0)
            g->setSortOrder(m_cards->captionColumn(), GridSortOrder::Ascending);
    } else {
        m_layouts->restore(*m_view->controller(), TableView);
    }
}

GridSearch Tcontactlistframe::searchForView(const GridSearch& search, const GridController& from,
                                            const GridController& to)
{
    GridSearch out = search;
    out.columns.clear();
    for (const int c : search.columns) {
        const int target = c >= 0 && c < from.columnCount() ? to.columnByField(from.column(c).fieldName) : -1;
        if (target >= 0)
            out.columns.push_back(target);
    }
    return out;
}

GridFilter Tcontactlistframe::filterForView(const GridFilter& filter, const GridController& from,
                                            const GridController& to)
{
    GridFilter out = filter;
    const std::function<void(GridFilterItem&)> remap = [&](GridFilterItem& item) {
        if (item.isList) {
            for (GridFilterItem& sub : item.items)
                remap(sub);
            return;
        }
        const int c = from.columnByName(item.column);
        if (c < 0)
            return;
        const int target = to.columnByField(from.column(c).fieldName);
        if (target >= 0)
            item.column = to.column(target).name;
    };
    remap(out.root);
    return out;
}

void Tcontactlistframe::openView(int viewKind, const char* statement, DataSet* rowsFrom,
                                 GridController::FieldRanks ranks)
{
    DataSet* ds = dataSetOf(viewKind);
    if (!ds)
        throw AppException(QStringLiteral("Kein Datenmodul vorhanden."));
    detachSource();
    ds->close();
    ds->setCommandText(QString::fromLatin1(statement));
    const bool sameRows = rowsFrom && ds->openWithRowsOf(*rowsFrom);
    if (!sameRows)
        ds->open();
    bindSource();
    // The same rows: the sort keys the old view computed hold for this one too.
    if (sameRows && controller()->isActive())
        controller()->adoptFieldRanks(std::move(ranks));
    if (ds->isActive())
        restoreLayout(viewKind);
}

bool Tcontactlistframe::isConnected() const
{
    return m_connected && m_dm && m_dm->IBDatabase1.isConnected();
}

// ---------------------------------------------------------------------------------------------
// Opening and closing

bool Tcontactlistframe::DBConnect(QObject* mainWindow)
{
    BusyCursor busy;
    try {
        ApplyColorScheme();
        m_deferSummary = false;
        m_host = mainWindow;
        InitSearchPanel();
        m_currentLetter.clear();
        m_filterColumn = QStringLiteral("Kontakt");
        m_selectedContBez.clear();
        if (m_dm)
            m_dm->SelectedLID = -1;
        m_cl1->setText(QStringLiteral("Kontakte (alle)"));
        GetAndSetView();
        showActiveView();
        {
            ViewLock lock(activeGrid());
            openView(m_viewKind, m_viewKind == CardView ? dmsql::kSelectContactCards : dmsql::kSelectContactList);
        }
        SyncFilterState();
        m_searchPanel->setNarrowsFilter(!m_currentLetter.isEmpty());
        setViewPopup();
        m_connected = true;
        setEnabled(true);
    } catch (const std::exception& e) {
        m_connected = false;
        DisableFrame();
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("DBConnect"), &e);
        cv_editcontUpdate();
        return false;
    }
    FocusedRecordChanged();
    updateFooter();
    return true;
}

void Tcontactlistframe::DBDisconnect()
{
    try {
        m_t1->stop();
        Tnotizviewform::closeInstance();
        postMessage(m_host, WMSEARCHUNCHECKED, 0, 0);
        DataSet* ds = dataSetOf(m_viewKind);
        if (ds && ds->isActive() && controller()->source()) {
            if (!storeLayout(m_viewKind))
                logError(kLabel + QStringLiteral("DBDisconnect\r\nDie Ansicht konnte nicht gespeichert werden."));
        }
        if (m_viewKind != NoView)
            SetGridView(m_viewKind);
        detachSource();
        if (m_dm) {
            m_dm->ibcds_list.close();
            m_dm->ibcds_card.close();
        }
    } catch (const std::exception& e) {
        detachSource();
        reportError(kLabel + QStringLiteral("DBDisconnect"), &e);
    }
    m_connected = false;
    QCoreApplication::processEvents();
}

bool Tcontactlistframe::GetGridView(int& kind, int& percent) const
{
    kind = TableView;
    percent = kDefaultPercent;
    const QString path = viewStoreFile();
    if (!QFile::exists(path))
        return false;
    IniFile ini(path);
    kind = ini.readInteger(kLevelSection, QStringLiteral("Value"), TableView);
    if (kind != TableView && kind != CardView)
        kind = TableView;
    percent = ini.readInteger(kLevelSection, QStringLiteral("Percent"), kDefaultPercent);
    if (percent < 1 || percent > 99)
        percent = kDefaultPercent;
    return true;
}

void Tcontactlistframe::SetGridView(int kind)
{
    IniFile ini(viewStoreFile());
    ini.writeInteger(kLevelSection, QStringLiteral("Value"), kind);
    ini.writeInteger(kLevelSection, QStringLiteral("Percent"), splitterPercent());
    if (!ini.save())
        logError(QStringLiteral("# SetGridView\r\nDie Ansicht konnte nicht gespeichert werden."));
}

void Tcontactlistframe::GetAndSetView()
{
    int kind = TableView;
    int percent = kDefaultPercent;
    try {
        ViewLock lock(activeGrid());
        GetGridView(kind, percent);
    } catch (const std::exception& e) {
        logError(QStringLiteral("# GetAndSetView"), &e);
    }
    m_viewKind = kind;
    setSplitterPercent(percent);
}

int Tcontactlistframe::splitterPercent() const
{
    return m_percent;
}

void Tcontactlistframe::setSplitterPercent(int percent)
{
    m_percent = percent;
    applySplitterPercent();
}

void Tcontactlistframe::applySplitterPercent()
{
    // Sizes in any unit: the splitter keeps the proportion when it is laid out.
    m_splitter->setSizes({m_percent * 100, (100 - m_percent) * 100});
}

void Tcontactlistframe::showEvent(QShowEvent* event)
{
    ContactListFrame::showEvent(event);
    // A splitter that was never shown has no height to divide yet.
    applySplitterPercent();
}

bool Tcontactlistframe::ChangeView(int kind)
{
    if ((kind != TableView && kind != CardView) || kind == m_viewKind)
        return true;
    m_deferSummary = false;
    m_t1->stop();
    BusyCursor busy;
    const int focusedLid = m_dm ? m_dm->SelectedLID : -1;
    // The views announce their focus on the way; the summary is built once, at the end.
    const QScopedValueRollback<bool> changing(m_changingView, true);
    try {
        GridViewBase* oldView = activeGrid();
        GridViewBase* newView = gridOf(kind);
        ViewLock oldLock(oldView);
        ViewLock newLock(newView);
        GridController* from = oldView->controller();
        GridController* to = newView->controller();
        // The letter filter follows the user into the other view.
        const GridFilter filter = filterForView(from->filter(), *from, *to);
        // So does the search.
        const GridSearch search = searchForView(from->search(), *from, *to);
        from->clearSearch();
        const int tag = from->tag();
        DataSet* old = dataSetOf(m_viewKind);
        if (old && old->isActive() && from->source() && !storeLayout(m_viewKind))
            logError(kLabel + QStringLiteral("ChangeView\r\nDie Ansicht konnte nicht gespeichert werden."));
        GridController::FieldRanks ranks = from->takeFieldRanks();
        detachSource();
        m_viewKind = kind;
        showActiveView();
        // V_SELECT_CARD is V_SELECT_LIST under another name: the new view takes over the rows the
        // old one read instead of reading the whole address book again (seconds for a large
        // one). Refresh_View reads afresh.
        openView(kind, kind == CardView ? dmsql::kSelectContactCards : dmsql::kSelectContactList,
                 old && old->isActive() ? old : nullptr, std::move(ranks));
        if (old)
            old->close();
        to->setFilter(filter);
        to->setFilterActive(filter.active);
        to->setTag(tag);
        to->setSearch(search);
        // So does the focused contact, when the other view shows it.
        if (focusedLid > 0 && to->isActive()) {
            const int record = to->locate(focusedLid);
            if (record >= 0)
                to->focusRecord(static_cast<quint32>(record));
        }
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("ChangeView"), &e);
        FocusedRecordChanged();
        return false;
    }
    SyncFilterState();
    setViewPopup();
    FocusedRecordChanged();
    updateFooter();
    GridViewBase* grid = activeGrid();
    if (grid->isEnabled() && grid->isVisible())
        grid->setFocus();
    return true;
}

void Tcontactlistframe::DisableFrame()
{
    m_view->setEnabled(false);
    m_cards->setEnabled(false);
    m_summary->setEnabled(false);
    for (QMenu* menu : {m_popup, m_cardPopup, m_columnMenu->menu(), m_rowMenu->menu()})
        for (QAction* a : menu->actions())
            a->setEnabled(false);
    for (QAbstractButton* b : m_letters->buttons())
        b->setEnabled(false);
    m_searchPanel->reset();
    m_search->setEnabled(false);
}

// ---------------------------------------------------------------------------------------------
// Letter filter

QStringList Tcontactlistframe::letterPatterns(int t)
{
    if (t < 1 || t > 26)
        return {};
    const QChar upper(u'A' + t - 1);
    const QChar lower = upper.toLower();
    const QString u = QString(upper) + QLatin1Char('%');
    const QString l = QString(lower) + QLatin1Char('%');
    switch (upper.unicode()) {
    case u'A':
        return {u, QStringLiteral("Ä%"), l, QStringLiteral("ä%")};
    case u'O':
        return {u, l, QStringLiteral("Ö%"), QStringLiteral("ö%")};
    case u'S':
        return {u, l, QStringLiteral("ß%")};
    case u'U':
        return {u, l, QStringLiteral("Ü%"), QStringLiteral("ü%")};
    default:
        return {u, l};
    }
}

void Tcontactlistframe::SetLetterButton(int t)
{
    if (QAbstractButton* b = m_letters->button(t))
        b->setChecked(true);
}

int Tcontactlistframe::pressedLetter() const
{
    return m_letters->checkedId();
}

void Tcontactlistframe::SetNewFilter(int t)
{
    BusyCursor busy;
    try {
        GridController* g = controller();
        if (t >= 1 && t <= 26) {
            m_filterColumn = QStringLiteral("Kontakt");
            const QString letter(QChar(u'A' + t - 1));
            if (letter != m_currentLetter) {
                ViewLock lock(activeGrid());
                g->clearFilterItems();
                g->setFilterActive(false);
                std::vector<GridFilterItem> conditions;
                const int contbez = g->columnByField(u"CONTBEZ");
                const QString column = contbez >= 0 ? g->column(contbez).name : columnName("CONTBEZ");
                for (const QString& p : letterPatterns(t))
                    conditions.push_back(GridFilterItem::condition(column, GridFilterOperator::Like, p, p));
                g->addFilterItem(GridFilterItem::list(GridFilterBoolOperator::Or, std::move(conditions)));
                g->setTag(t);
                m_currentLetter = letter;
                g->setFilterActive(true);
                // The letter chosen last counts: a search that replaced the filter now narrows it.
                if (g->isSearching() && !g->search().narrow) {
                    GridSearch search = g->search();
                    search.narrow = true;
                    g->setSearch(search);
                    m_searchPanel->setNarrowsFilter(true);
                }
            }
        } else if (t == 0 && (!m_currentLetter.isEmpty() || g->tag() != 0)) {
            ViewLock lock(activeGrid());
            g->setFilterActive(false);
            g->setTag(0);
            g->clearFilterItems();
            if (!g->filter().isEmpty())
                g->setFilterActive(true);
            m_currentLetter.clear();
        }
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("SetNewFilter\r\nOperation kann nicht ausgeführt werden!"), &e);
    }
    BusyCursor::resetCursor();
    SetFilterCaption();
    updateFooter();
}

void Tcontactlistframe::SetFilterCaption()
{
    const QString searched =
        m_searchedText.isEmpty() ? QString() : QStringLiteral("Suche: \"") + m_searchedText + QLatin1Char('"');
    const bool filtered = !m_currentLetter.isEmpty() && (searched.isEmpty() || controller()->search().narrow);
    QString text = QStringLiteral("Kontakte (");
    if (filtered)
        text += m_filterColumn + QStringLiteral(" gefiltert nach \"") + m_currentLetter + QLatin1Char('"');
    if (!searched.isEmpty())
        text += (filtered ? QStringLiteral(", ") : QString()) + searched;
    if (!filtered && searched.isEmpty())
        text += QStringLiteral("alle");
    m_cl1->setText(text + QLatin1Char(')'));
}

// ---------------------------------------------------------------------------------------------
// Search

void Tcontactlistframe::InitSearchPanel()
{
    m_searchPanel->reset();
    m_searchedText.clear();
    m_view->controller()->clearSearch();
    m_cards->controller()->clearSearch();
    m_search->setEnabled(true);
}

bool Tcontactlistframe::isSearchShown() const
{
    return m_searchPanel->isOpen();
}

void Tcontactlistframe::OpenSearchPanel()
{
    if (!isConnected() || !controller()->isActive())
        return;
    m_searchPanel->open();
}

void Tcontactlistframe::ADVSearchStartClick()
{
    BusyCursor busy;
    try {
        GridController* g = controller();
        const GridController* table = m_view->controller();
        GridSearch search;
        search.text = m_searchPanel->searchText();
        // The captions are the table's; both views find their columns by the field.
        for (const QString& caption : m_searchPanel->chosenColumns()) {
            const int t = table->columnByCaption(caption);
            const int c = t >= 0 ? g->columnByField(table->column(t).fieldName) : -1;
            if (c >= 0)
                search.columns.push_back(c);
        }
        search.exact = m_searchPanel->exact();
        search.caseSensitive = m_searchPanel->caseSensitive();
        search.narrow = m_searchPanel->narrowsFilter();
        ViewLock lock(activeGrid());
        g->setSearch(search);
        m_searchedText = search.isActive() ? search.text : QString();
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("ADVSearchStartClick"), &e);
    }
    BusyCursor::resetCursor();
    SetFilterCaption();
    updateFooter();
}

void Tcontactlistframe::L3Click()
{
    removeSearch();
}

void Tcontactlistframe::AdvCloseSearchPanClick()
{
    removeSearch();
    m_searchPanel->reset();
    postMessage(m_host, WMSEARCHUNCHECKED, 0, 0);
    GridViewBase* grid = activeGrid();
    if (grid->isEnabled() && grid->isVisible())
        grid->setFocus();
}

void Tcontactlistframe::removeSearch()
{
    if (controller()->search() != GridSearch()) {
        ViewLock lock(activeGrid());
        controller()->clearSearch();
    }
    if (m_searchedText.isEmpty())
        return;
    m_searchedText.clear();
    SetFilterCaption();
    updateFooter();
}

QString Tcontactlistframe::captionText() const
{
    return m_cl1->text();
}

void Tcontactlistframe::SyncFilterState()
{
    m_filterColumn.clear();
    m_currentLetter.clear();
    SetLetterButton(0);
    SetFilterCaption();
    const GridController* g = controller();
    if (!g->filter().active || g->filter().isEmpty())
        return;
    const QString text = g->filterText();
    static const std::pair<const char*, const char*> columns[] = {{"CONTBEZ LIKE", "Kontakt"},
                                                                   {"KATBEZ LIKE", "Kategorie"},
                                                                   {"ORT LIKE", "Ort"},
                                                                   {"PLZ LIKE", "PLZ"},
                                                                   {"STR LIKE", "Straße"}};
    for (const auto& [needle, caption] : columns)
        if (text.contains(QLatin1String(needle)))
            m_filterColumn = QString::fromUtf8(caption);
    const int tag = g->tag();
    if (tag >= 1 && tag <= 26) {
        m_currentLetter = QString(QChar(u'@' + tag));
        SetLetterButton(tag);
    }
    SetFilterCaption();
}

// ---------------------------------------------------------------------------------------------
// Grouping

void Tcontactlistframe::SetCONTBEZSort()
{
    try {
        GridController* g = m_view->controller();
        const int c = g->columnByField(u"CONTBEZ");
        if (c >= 0)
            g->setSortOrder(c, GridSortOrder::Ascending);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetCONTBEZSort"), &e);
    }
}

void Tcontactlistframe::NoGroup()
{
    try {
        ViewLock lock(m_view);
        GridController* g = m_view->controller();
        for (const int c : std::vector<int>(g->groupedColumns())) {
            g->ungroup(c);
            g->setColumnVisible(c, true);
        }
        g->clearSorting();
        SetCONTBEZSort();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("NoGroup"), &e);
    }
}

void Tcontactlistframe::ColuGroup(const char* field)
{
    try {
        GridController* g = m_view->controller();
        const int c = g->columnByField(QString::fromLatin1(field));
        if (c < 0)
            return;
        g->groupBy(c, 0);
        g->setColumnVisible(c, false);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("ColuGroup"), &e);
    }
}

void Tcontactlistframe::ToGroup(int kind)
{
    if (m_viewKind != TableView)
        return;
    try {
        BusyCursor busy;
        ViewLock lock(m_view);
        NoGroup();
        switch (kind) {
        case ByCategory:
            ColuGroup("KATBEZ");
            break;
        case ByPostCode:
            ColuGroup("PLZ");
            break;
        case ByTown:
            ColuGroup("ORT");
            break;
        default:
            break;
        }
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("ToGroup"), &e);
    }
    updateFooter();
}

void Tcontactlistframe::GetViewState(int& viewKind, int& grouping) const
{
    viewKind = m_viewKind;
    grouping = NoGrouping;
    if (m_viewKind != TableView)
        return;
    const GridController* g = controller();
    const std::vector<int>& grouped = g->groupedColumns();
    if (grouped.empty())
        return;
    const QString& caption = g->column(grouped.front()).caption;
    if (caption == QLatin1String("Kategorie"))
        grouping = ByCategory;
    else if (caption == QLatin1String("PLZ"))
        grouping = ByPostCode;
    else if (caption == QLatin1String("Ort"))
        grouping = ByTown;
}

bool Tcontactlistframe::CanExpandGroups() const
{
    return m_viewKind == TableView && controller()->isActive() && controller()->isGrouped();
}

void Tcontactlistframe::ExpandGroups(bool expand)
{
    if (m_viewKind != TableView || !controller()->isActive())
        return;
    ViewLock lock(m_view);
    m_view->controller()->expandAll(expand);
}

// ---------------------------------------------------------------------------------------------
// Focused contact and summary

int Tcontactlistframe::GetSelectedLID() const
{
    return m_dm ? m_dm->SelectedLID : -1;
}

void Tcontactlistframe::FocusedRecordChanged()
{
    if (!m_dm)
        return;
    try {
        m_dm->SummaryDelay = kSummaryTicks;
        const GridController* g = controller();
        const int row = g->focusedRow();
        m_dm->SelectedLID = -1;
        m_selectedContBez.clear();
        const GridSource* s = g->source();
        if (s && row >= 0 && !g->isGroupRow(row)) {
            const int record = g->recordAt(row);
            const int lid = s->fieldIndex(u"LID");
            const int bez = s->fieldIndex(u"CONTBEZ");
            if (record >= 0 && lid >= 0) {
                m_dm->SelectedLID = static_cast<int>(s->intValue(static_cast<quint32>(record), lid));
                if (bez >= 0)
                    m_selectedContBez = s->text(static_cast<quint32>(record), bez);
            }
        }
        if (m_deferSummary) {
            if (!m_t1->isActive())
                m_t1->start();
            m_deferSummary = false;
        } else {
            m_t1->stop();
            rebuildSummary();
        }
    } catch (const std::exception& e) {
        m_t1->stop();
        m_dm->SelectedLID = -1;
        m_selectedContBez.clear();
        // The cards' handler fails silently.
        if (m_viewKind != CardView)
            logError(kLabel + QStringLiteral("TableViewFocusedRecordChanged"), &e);
    }
    cv_editcontUpdate();
}

void Tcontactlistframe::T1Timer()
{
    if (!m_dm) {
        m_t1->stop();
        return;
    }
    if (m_dm->SummaryDelay >= 1) {
        --m_dm->SummaryDelay;
        return;
    }
    m_t1->stop();
    rebuildSummary();
}

void Tcontactlistframe::rebuildSummary()
{
    if (!m_dm)
        return;
    ++m_summaryRebuilds;
    SetHTMLStaticText(m_summary, *m_dm, m_dm->SelectedLID);
}

void Tcontactlistframe::HTMLStaticText1AnchorClick(const QString& href)
{
    const QString label = kLabel + QStringLiteral("GetAnchor\r\n");
    const SummaryAnchor a = parseSummaryAnchor(href);
    switch (a.kind) {
    case SummaryAnchor::Kind::Note:
        if (a.refused || !m_noteOpener) {
            reportError(label + QStringLiteral("Notiz kann nicht angezeigt werden."));
            return;
        }
        m_noteOpener(a.noteLid);
        return;
    case SummaryAnchor::Kind::Mail:
    case SummaryAnchor::Kind::Web: {
        const bool mail = a.kind == SummaryAnchor::Kind::Mail;
        if (a.refused) {
            logError(label + QStringLiteral("Adresse abgelehnt: ") + a.target);
            return;
        }
        if (!openUrl(a.url))
            reportError(label + (mail ? QStringLiteral("Standard-Emailclient konnte nicht geöffnet werden.")
                                      : QStringLiteral("Standard-Browser konnte nicht geöffnet werden.")));
        return;
    }
    case SummaryAnchor::Kind::None:
        logError(label + QStringLiteral("Adresse abgelehnt: ") + a.target);
        return;
    }
}

void Tcontactlistframe::Refresh_View(int lid)
{
    DataSet* ds = dataSetOf(m_viewKind);
    try {
        if (ds && ds->isActive()) {
            BusyCursor busy;
            ViewLock lock(activeGrid());
            m_refreshing = true;
            try {
                ds->refresh();
            } catch (...) {
                m_refreshing = false;
                detachSource();
                throw;
            }
            m_refreshing = false;
            controller()->sourceChanged();
            if (lid > 0) {
                const int record = controller()->locate(lid);
                if (record >= 0)
                    controller()->focusRecord(static_cast<quint32>(record));
            }
            if (activeGrid()->isVisible())
                activeGrid()->setFocus();
        }
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        logError(kLabel + QStringLiteral("Refresh_View"), &e);
    }
    FocusedRecordChanged();
    updateFooter();
}

void Tcontactlistframe::updateFooter()
{
    const int n = controller()->isActive() ? controller()->recordCount() : 0;
    m_footer->setText(QStringLiteral(" Kontakte: %1").arg(n));
}

QString Tcontactlistframe::footerText() const
{
    return m_footer->text();
}

// ---------------------------------------------------------------------------------------------
// Actions and menus

void Tcontactlistframe::cv_editcontUpdate()
{
    for (QAction* a : {m_newCont, m_editCont, m_deleteCont})
        a->setEnabled(isActionEnabled(a->objectName()));
}

bool Tcontactlistframe::isActionEnabled(const QString& actionName) const
{
    const bool connected = m_connected && m_dm && m_dm->IBDatabase1.isConnected();
    if (actionName == m_newCont->objectName())
        return connected;
    if (actionName == m_editCont->objectName() || actionName == m_deleteCont->objectName())
        return connected && m_dm->SelectedLID != -1;
    if (actionName == QLatin1String("_LogFo_Search"))
        return connected && controller()->isActive();
    return false;
}

void Tcontactlistframe::executeAction(const QString& actionName)
{
    if (actionName == QLatin1String("_LogFo_Search")) {
        // The main window's entry shows the panel and hides it again.
        if (m_searchPanel->isOpen())
            AdvCloseSearchPanClick();
        else
            OpenSearchPanel();
        return;
    }
    cv_editcontUpdate();
    for (QAction* a : {m_newCont, m_editCont, m_deleteCont})
        if (a->objectName() == actionName && a->isEnabled())
            a->trigger();
}

void Tcontactlistframe::SetTableViewPopup()
{
    m_columnMenu->checkVisibleColumns();
}

void Tcontactlistframe::SetCardViewPopup()
{
    m_rowMenu->checkVisibleColumns();
}

void Tcontactlistframe::setViewPopup()
{
    const bool cards = m_viewKind == CardView;
    try {
        if (cards)
            SetCardViewPopup();
        else
            SetTableViewPopup();
    } catch (const std::exception& e) {
        reportError(kLabel + (cards ? QStringLiteral("DBConnect - SetCardViewPopup")
                                    : QStringLiteral("DBConnect - SetTableViewPopup")),
                    &e);
    }
}

void Tcontactlistframe::SetTableColVisibleState(bool visible, int tag)
{
    try {
        m_columnMenu->setColumnVisible(visible, tag);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetTableColVisibleState"), &e);
    }
}

void Tcontactlistframe::SetCardRowVisibleState(bool visible, int tag)
{
    try {
        m_rowMenu->setColumnVisible(visible, tag);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetCardRowVisibleState"), &e);
    }
}

void Tcontactlistframe::showPopup(const QPoint& globalPos)
{
    cv_editcontUpdate();
    popupMenu()->popup(globalPos);
}

void Tcontactlistframe::ApplyColorScheme()
{
    const int scheme = appColorScheme();
    m_scaffold->applyColorScheme(scheme);
    const ListFrameColors& c = listFrameColors(scheme);
    for (QWidget* w : {static_cast<QWidget*>(m_toolbar), static_cast<QWidget*>(m_splitter)}) {
        QPalette p = w->palette();
        p.setColor(QPalette::Window, c.panel);
        w->setPalette(p);
        w->setAutoFillBackground(true);
    }
    static_cast<FooterLabel*>(m_footer)->setColors(c.footerStart, c.footerEnd, c.footerBorder);
}

} // namespace orvanta
