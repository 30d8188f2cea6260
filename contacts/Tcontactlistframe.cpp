#include "contacts/Tcontactlistframe.h"

#include "contacts/ContactAnchors.h"
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
#include "ui/grid/GridColumnMenu.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridLayoutPersistence.h"
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
#include <QMenu>
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
    connect(m_view, &GridView::focusedRecordChanged, this, &Tcontactlistframe::FocusedRecordChanged);
    connect(controller(), &GridController::layoutChanged, this, &Tcontactlistframe::updateFooter);
    connect(m_view, &GridView::rowDoubleClicked, this, [this](int row) {
        if (controller()->isGroupRow(row))
            return;
        cv_editcontUpdate();
        if (m_editCont->isEnabled())
            m_editCont->trigger();
    });
    connect(m_view, &GridView::keyPressed, this, [this](int key, Qt::KeyboardModifiers) {
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
    connect(m_view, &GridView::rowContextMenuRequested, this, &Tcontactlistframe::showPopup);
    connect(m_view, &GridView::columnDraggedOut, m_columnMenu, &GridColumnMenu::columnDraggedOut);
    connect(m_summary, &MarkupPanel::anchorClicked, this, &Tcontactlistframe::HTMLStaticText1AnchorClick);
    controller()->setKeyField(QStringLiteral("LID"));
    controller()->setFocusFirstAfterSort(true);
    cv_editcontUpdate();
    updateFooter();
}

Tcontactlistframe::~Tcontactlistframe()
{
    // The grid must not outlive the source it reads.
    if (m_view)
        m_view->setSource(nullptr);
}

GridController* Tcontactlistframe::controller() const
{
    return m_view->controller();
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
    m_view = m_scaffold->addTableView(QStringLiteral("cxGrid1DBTableView1"));
    m_view->setHeaderHeight(21);
    m_view->setAutoWidth(true);
    m_view->setSortedColumnColor(QColor(0xEF, 0xEF, 0xEF));

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
    m_footer = new QLabel(gridPart);
    m_footer->setObjectName(QStringLiteral("cxGrid1DBTableView1Footer"));
    m_footer->setFont(QFont(QStringLiteral("Verdana"), 8));
    m_footer->setMargin(3);
    m_footer->setAutoFillBackground(true);
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
    controller()->setSortOrder(contbez, GridSortOrder::Ascending);
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

    m_popup = new QMenu(this);
    m_popup->setObjectName(QStringLiteral("AdvPopupMenu2"));
    m_popup->addAction(m_newCont);
    m_popup->addAction(m_editCont);
    m_popup->addSeparator();
    m_popup->addAction(m_deleteCont);
    m_popup->addSeparator();
    m_columnMenu = new GridColumnMenu(m_view, m_popup, QStringLiteral("Ansicht1"), this);
    static constexpr const char* captions[13] = {"Kontakt", "Straße", "PLZ", "Ort", "Kategorie", "Anrede", "Name",
                                                 "Vorname", "Titel", "Firma", "Anschriftenzusatz", "Land",
                                                 "Bundesland"};
    for (int i = 0; i < 13; ++i)
        m_columnMenu->addEntry(QStringLiteral("tvum%1").arg(i + 1), QString::fromUtf8(captions[i]), i + 1);
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
        m_source = std::make_unique<RecordStoreGridSource>(ds->store());
    }
    m_view->setSource(m_source.get());
}

void Tcontactlistframe::detachSource()
{
    if (controller()->source())
        m_view->setSource(nullptr);
    m_source.reset();
    updateFooter();
}

void Tcontactlistframe::openView(int viewKind, const char* statement)
{
    DataSet* ds = dataSetOf(viewKind);
    if (!ds)
        throw AppException(QStringLiteral("Kein Datenmodul vorhanden."));
    detachSource();
    ds->close();
    ds->setCommandText(QString::fromLatin1(statement));
    ds->open();
    bindSource();
    if (ds->isActive())
        m_layouts->restore(*controller(), viewKind);
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
        m_currentLetter.clear();
        m_filterColumn = QStringLiteral("Kontakt");
        m_selectedContBez.clear();
        if (m_dm)
            m_dm->SelectedLID = -1;
        m_cl1->setText(QStringLiteral("Kontakte (alle)"));
        GetAndSetView();
        {
            ViewLock lock(m_view);
            openView(m_viewKind, m_viewKind == CardView ? dmsql::kSelectContactCards : dmsql::kSelectContactList);
        }
        SyncFilterState();
        SetTableViewPopup();
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
            if (!m_layouts->store(*controller(), m_viewKind))
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
        ViewLock lock(m_view);
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
    try {
        ViewLock lock(m_view);
        GridController* g = controller();
        // The letter filter follows the user into the other view.
        const GridFilter filter = g->filter();
        const int tag = g->tag();
        DataSet* old = dataSetOf(m_viewKind);
        if (old && old->isActive() && g->source())
            (void)m_layouts->store(*g, m_viewKind);
        detachSource();
        if (old)
            old->close();
        m_viewKind = kind;
        openView(kind, kind == CardView ? dmsql::kSelectContactCards : dmsql::kSelectContactList);
        g->setFilter(filter);
        g->setFilterActive(filter.active);
        g->setTag(tag);
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("ChangeView"), &e);
        return false;
    }
    SyncFilterState();
    SetTableViewPopup();
    FocusedRecordChanged();
    if (m_view->isEnabled() && m_view->isVisible())
        m_view->setFocus();
    return true;
}

void Tcontactlistframe::DisableFrame()
{
    m_view->setEnabled(false);
    m_summary->setEnabled(false);
    for (QAction* a : m_popup->actions())
        a->setEnabled(false);
    for (QAbstractButton* b : m_letters->buttons())
        b->setEnabled(false);
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
                ViewLock lock(m_view);
                g->clearFilterItems();
                g->setFilterActive(false);
                std::vector<GridFilterItem> conditions;
                for (const QString& p : letterPatterns(t))
                    conditions.push_back(
                        GridFilterItem::condition(columnName("CONTBEZ"), GridFilterOperator::Like, p, p));
                g->addFilterItem(GridFilterItem::list(GridFilterBoolOperator::Or, std::move(conditions)));
                g->setTag(t);
                m_currentLetter = letter;
                g->setFilterActive(true);
            }
        } else if (t == 0 && (!m_currentLetter.isEmpty() || g->tag() != 0)) {
            ViewLock lock(m_view);
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
    if (m_currentLetter.isEmpty())
        m_cl1->setText(QStringLiteral("Kontakte (alle)"));
    else
        m_cl1->setText(QStringLiteral("Kontakte (") + m_filterColumn + QStringLiteral(" gefiltert nach \"") +
                       m_currentLetter + QStringLiteral("\")"));
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
        const int c = controller()->columnByField(u"CONTBEZ");
        if (c >= 0)
            controller()->setSortOrder(c, GridSortOrder::Ascending);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetCONTBEZSort"), &e);
    }
}

void Tcontactlistframe::NoGroup()
{
    try {
        ViewLock lock(m_view);
        GridController* g = controller();
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
        const int c = controller()->columnByField(QString::fromLatin1(field));
        if (c < 0)
            return;
        controller()->groupBy(c, 0);
        controller()->setColumnVisible(c, false);
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
    controller()->expandAll(expand);
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
            ViewLock lock(m_view);
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
            if (m_view->isVisible())
                m_view->setFocus();
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
    return false;
}

void Tcontactlistframe::executeAction(const QString& actionName)
{
    cv_editcontUpdate();
    for (QAction* a : {m_newCont, m_editCont, m_deleteCont})
        if (a->objectName() == actionName && a->isEnabled())
            a->trigger();
}

void Tcontactlistframe::SetTableViewPopup()
{
    m_columnMenu->checkVisibleColumns();
}

void Tcontactlistframe::SetTableColVisibleState(bool visible, int tag)
{
    try {
        m_columnMenu->setColumnVisible(visible, tag);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetTableColVisibleState"), &e);
    }
}

void Tcontactlistframe::showPopup(const QPoint& globalPos)
{
    cv_editcontUpdate();
    m_popup->popup(globalPos);
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
    QPalette fp = m_footer->palette();
    fp.setColor(QPalette::Window, c.panel);
    fp.setColor(QPalette::WindowText, Qt::black);
    m_footer->setPalette(fp);
}

} // namespace orvanta
