#include "calllog/Tlogframe.h"

#include "calllog/LogImages.h"
#include "calllog/LogStatements.h"
#include "dbgrid/RecordStoreGridSource.h"
#include "db/FbStatement.h"
#include "db/TDM2.h"
#include "db/TDM2Statements.h"
#include "db/TransactionWork.h"
#include "phone/PhoneNumbers.h"
#include "platform/AppException.h"
#include "ui/dialogs/BusyCursor.h"
#include "platform/Clock.h"
#include "platform/ErrorLog.h"
#include "platform/ProgramFolder.h"
#include "platform/WindowMessages.h"
#include "ui/grid/GridColumnMenu.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridLayoutPersistence.h"
#include "ui/grid/GridSearchPanel.h"
#include "ui/grid/GridUpdateLock.h"
#include "ui/grid/GridView.h"
#include "ui/grid/ListFrameScaffold.h"
#include "ui/label/TVKCutLabel.h"
#include "ui/scheme/ColorScheme.h"

#include <QAction>
#include <QApplication>
#include <QHBoxLayout>
#include <QLabel>
#include <QMenu>
#include <QPainter>
#include <QPushButton>
#include <QStyle>

#include <array>
#include <limits>

namespace orvanta {
namespace {

const QString kLabel = QStringLiteral("# Logframe - ");
const QString kView = QStringLiteral("2");
constexpr QByteArrayView kUnbekannt("Unbekannt");
constexpr QByteArrayView kEingang("Eingang");
constexpr QByteArrayView kAusgang("Ausgang");

// Column names of the view, also the layout file's keys.
const QString kPrefix = QStringLiteral("cxGrid1DBTableView1");

QString columnName(const char* field)
{
    return kPrefix + QLatin1String(field);
}

// The service names as the bytes the grid sorts by; built once, kept for the program's life.
QByteArrayView serviceNameBytes(qint64 code)
{
    static const std::array<QByteArray, 23> names = [] {
        std::array<QByteArray, 23> n;
        for (int i = 0; i < 23; ++i)
            n[static_cast<size_t>(i)] = ServiceName(i).toLatin1();
        return n;
    }();
    if (code < 0 || code > 22)
        return {};
    return names[static_cast<size_t>(code)];
}

using ViewLock = GridUpdateLock;

} // namespace

// Field indexes of the bound store, resolved once per opening so the display rules, which run
// for every row while sorting a million calls, never look a name up.
struct LogFieldIndexes {
    int lid = -1;
    int cid = -1;
    int abid = -1;
    int ctype = -1;
    int service = -1;
    int fromphone = -1;
    int frombez = -1;
    int onmsn = -1;
    int onbez = -1;
};

Tlogframe::Tlogframe(TDM2* dm, QWidget* parent)
    : LogListFrame(parent)
    , m_dm(dm)
{
    setObjectName(QStringLiteral("logframe"));
    buildLayout();
    buildColumns();
    buildActions();
    if (m_dm) {
        m_source = std::make_unique<RecordStoreGridSource>(m_dm->ibcds_log.store());
        // Whoever closes the log (the data module going down, another frame) must not leave the
        // grid reading a store that is gone.
        connect(&m_dm->ibcds_log, &DataSet::aboutToClose, this, [this] {
            if (!m_refreshing)
                detachSource();
        });
        connect(&m_dm->ibcds_log, &DataSet::rowsArrived, this, &Tlogframe::rowsArrived);
        connect(&m_dm->ibcds_log, &DataSet::rowsReplaced, this, &Tlogframe::rowsReplaced);
        connect(&m_dm->ibcds_log, &DataSet::loadFinished, this, &Tlogframe::loadFinished);
    }
    connect(m_view, &GridView::focusedRecordChanged, this, &Tlogframe::TableViewFocusedRecordChanged);
    connect(m_view, &GridView::rowDoubleClicked, this, [this](int) {
        lf_bemerkungUpdate();
        if (m_lfBemerkung->isEnabled())
            m_lfBemerkung->trigger();
    });
    connect(m_view, &GridView::keyPressed, this, [this](int key, Qt::KeyboardModifiers) {
        // Delete removes the focused call; Enter opens it, like a double click.
        QAction* action = key == Qt::Key_Delete                              ? m_lfDelitem
                          : (key == Qt::Key_Return || key == Qt::Key_Enter) ? m_lfBemerkung
                                                                              : nullptr;
        if (!action)
            return;
        lf_bemerkungUpdate();
        if (action->isEnabled())
            action->trigger();
    });
    connect(m_view, &GridView::rowContextMenuRequested, this, &Tlogframe::showPopup);
    connect(m_view, &GridView::columnDraggedOut, this, &Tlogframe::cxGrid1DBTableView1ColumnPosChanged);
    controller()->setTodayProvider([] { return Clock::today(); });
    controller()->setKeyField(QStringLiteral("LID"));
    lf_bemerkungUpdate();
}

Tlogframe::~Tlogframe()
{
    // The grid must not outlive the source it reads.
    if (m_view)
        m_view->setSource(nullptr);
}

GridController* Tlogframe::controller() const
{
    return m_view->controller();
}

QString Tlogframe::layoutFile(int viewMode)
{
    return programFile(viewMode == 1 ? QStringLiteral("VStoreLK") : QStringLiteral("VStoreL"));
}

// ---------------------------------------------------------------------------------------------
// Construction

void Tlogframe::buildLayout()
{
    m_layouts = std::make_unique<GridLayoutPersistence>(kView);
    m_layouts->setFile(0, layoutFile(0));
    m_layouts->setFile(1, layoutFile(1));
    m_scaffold = std::make_unique<ListFrameScaffold>(this);
    m_fp3 = m_scaffold->panel();
    m_cl1 = m_scaffold->caption();

    // The search panel: collapsed and disabled until the user opens it.
    m_searchPanel = new GridSearchPanel({QStringLiteral("Datum"), QStringLiteral("Zeit"), QStringLiteral("Anrufer"),
                                         QStringLiteral("An"), QStringLiteral("Status"), QStringLiteral("Bemerkung"),
                                         QStringLiteral("Region")},
                                        m_fp3);
    connect(m_searchPanel, &GridSearchPanel::searchRequested, this, &Tlogframe::ADVSearchStartClick);
    connect(m_searchPanel, &GridSearchPanel::clearRequested, this, &Tlogframe::L3Click);
    connect(m_searchPanel, &GridSearchPanel::closeRequested, this, &Tlogframe::AdvCloseSearchPanClick);
    m_scaffold->addPanel(m_searchPanel);

    m_view = m_scaffold->addTableView(QStringLiteral("cxGrid1DBTableView1"));
    m_view->setHeaderHeight(21);
    m_view->setAutoWidth(true);
    m_view->setImages(logimages::eaImages());
    m_view->setCellPainter([this](QPainter& p, const GridCellInfo& cell) { return paintAbidCell(p, cell); });
}

void Tlogframe::buildColumns()
{
    // The display rules read the field indexes of the bound store through this pointer.
    auto fields = std::make_shared<LogFieldIndexes>();
    m_fieldIndexes = fields;

    // The design widths suit a narrow 8-point font; a wider one gets them in proportion, so that
    // a date still fits its column.
    const double scale =
        std::max(1.0, m_view->fontMetrics().horizontalAdvance(QStringLiteral("00.00.0000")) / 56.0);
    const auto add = [scale](const char* field, const QString& caption, int tag, int width, bool visible) {
        GridColumn c;
        c.name = columnName(field);
        c.fieldName = QLatin1String(field);
        c.caption = caption;
        c.tag = tag;
        if (width > 0)
            c.width = static_cast<int>(width * scale + 0.5);
        c.visible = visible;
        return c;
    };
    const std::shared_ptr<const LogFieldIndexes> fx = fields;

    GridColumn lid = add("LID", {}, 0, 0, false);
    lid.sortable = lid.groupable = lid.movable = false;
    lid.showInColumnMenu = false;
    m_view->addColumn(lid);
    // Dates, times, the direction and the called line are never cut and never widen; the free
    // space goes to the caller, the status and the remark. A stored layout keeps its own widths,
    // within these minimums.
    const auto fixedToContent = [this](GridColumn& c, const QStringList& samples, bool image = false,
                                       bool sorted = false) {
        c.minWidth = m_view->contentWidth(samples, c.caption, image, sorted);
        c.width = c.minWidth;
        c.stretches = false;
    };
    GridColumn tsdate = add("TSDATE", QStringLiteral("Datum"), 1, 70, true);
    fixedToContent(tsdate, {QStringLiteral("00.00.0000")}, false, true); // sorted by default
    m_view->addColumn(tsdate);
    GridColumn tstime = add("TSTIME", QStringLiteral("Zeit"), 2, 51, true);
    fixedToContent(tstime, {QStringLiteral("00:00:00")}, false, true);
    m_view->addColumn(tstime);
    GridColumn ts = add("TS", {}, 0, 40, false);
    ts.showInColumnMenu = false;
    m_view->addColumn(ts);

    GridColumn ctype = add("CTYPE", QStringLiteral("Verbindung"), 8, 80, true);
    ctype.sortText = [fx](const GridSource& s, quint32 row) -> QByteArrayView {
        if (fx->ctype < 0 || s.isNull(row, fx->ctype))
            return kUnbekannt;
        qint64 v = -1;
        if (!static_cast<const RecordStoreGridSource&>(s).integerOf(row, fx->ctype, v))
            return kUnbekannt;
        return v == 0 ? kEingang : v == 1 ? kAusgang : kUnbekannt;
    };
    ctype.imageIndex = [fx](const GridSource& s, quint32 row) {
        qint64 v = -1;
        if (fx->ctype < 0 || !static_cast<const RecordStoreGridSource&>(s).integerOf(row, fx->ctype, v))
            return -1;
        return v == 0 ? 0 : v == 1 ? 1 : -1;
    };
    fixedToContent(ctype, {QStringLiteral("Eingang"), QStringLiteral("Ausgang"), QStringLiteral("Unbekannt")}, true);
    m_view->addColumn(ctype);

    GridColumn service = add("SERVICE", QStringLiteral("ISDN-Service"), 6, 62, false);
    service.sortText = [fx](const GridSource& s, quint32 row) -> QByteArrayView {
        qint64 code = 0;
        if (fx->service < 0 || !static_cast<const RecordStoreGridSource&>(s).integerOf(row, fx->service, code))
            return kUnbekannt;
        return serviceNameBytes(code);
    };
    m_view->addColumn(service);

    GridColumn fromphone = add("FROMPHONE", QStringLiteral("Anrufernummer"), 0, 0, false);
    fromphone.sortable = fromphone.groupable = fromphone.movable = false;
    m_view->addColumn(fromphone);

    // A name, else the number, else "Unbekannt": for the caller and the called party alike.
    const auto nameOrNumber = [](int nameField, int numberField, const GridSource& s, quint32 row) -> QByteArrayView {
        if (nameField >= 0) {
            const QByteArrayView name = s.textValue(row, nameField);
            if (!name.isEmpty())
                return name;
        }
        if (numberField >= 0 && !s.isNull(row, numberField)) {
            const QByteArrayView number = s.textValue(row, numberField);
            if (!number.isEmpty())
                return number;
        }
        return kUnbekannt;
    };
    GridColumn frombez = add("FROMBEZ", QStringLiteral("Anrufer"), 3, 160, true);
    frombez.minWidth = m_view->contentWidth({QStringLiteral("Unbekannt")}, frombez.caption);
    frombez.sortText = [fx, nameOrNumber](const GridSource& s, quint32 row) {
        return nameOrNumber(fx->frombez, fx->fromphone, s, row);
    };
    m_view->addColumn(frombez);
    m_view->addColumn(add("FROMSUBB", {}, 0, 0, false));
    m_view->addColumn(add("ONMSN", QStringLiteral("Zielnummer"), 0, 0, false));
    // The region takes a small share: a long place name is cut before the caller's name is.
    GridColumn region = add("REGION", QStringLiteral("Region"), 12, 60, true);
    region.minWidth = m_view->contentWidth({QStringLiteral("Düsseldorf")}, region.caption);
    m_view->addColumn(region);
    GridColumn onbez = add("ONBEZ", QStringLiteral("An"), 4, 58, true);
    fixedToContent(onbez, {QStringLiteral("Privat")});
    onbez.sortText = [fx, nameOrNumber](const GridSource& s, quint32 row) {
        return nameOrNumber(fx->onbez, fx->onmsn, s, row);
    };
    m_view->addColumn(onbez);
    GridColumn status = add("STATUS", QStringLiteral("Status"), 5, 90, true);
    status.minWidth = m_view->contentWidth({QStringLiteral("Nicht angenommen"), QStringLiteral("Anrufbeantworter")},
                                           status.caption);
    m_view->addColumn(status);
    GridColumn cid = add("CID", {}, 0, 0, false);
    cid.showInColumnMenu = false;
    m_view->addColumn(cid);
    GridColumn ctime = add("CTIME", QStringLiteral("Verbindungszeit"), 9, 0, true);
    ctime.groupable = false;
    m_view->addColumn(ctime);
    GridColumn ccharge = add("CCHARGE", QStringLiteral("Kosten"), 10, 80, true);
    ccharge.groupable = false;
    ccharge.numberFormat = QStringLiteral("0.00 €");
    ccharge.alignment = Qt::AlignRight | Qt::AlignVCenter;
    m_view->addColumn(ccharge);
    GridColumn bemerk = add("BEMERK", QStringLiteral("Bemerkung"), 7, 120, true);
    bemerk.minWidth = m_view->contentWidth({}, bemerk.caption);
    bemerk.groupable = false;
    m_view->addColumn(bemerk);
    GridColumn abid = add("ABID", {}, 11, 30, true);
    abid.groupable = false;
    abid.showInColumnMenu = false;
    m_abidColumn = m_view->addColumn(abid);
}

void Tlogframe::buildActions()
{
    const auto action = [this](const char* name, const QString& caption, QStyle::StandardPixmap icon) {
        auto* a = new QAction(style()->standardIcon(icon), caption, this);
        a->setObjectName(QLatin1String(name));
        addAction(a);
        return a;
    };
    m_lfBemerkung = action("lf_bemerkung", QStringLiteral("Bemerkung/Detailinformationen"),
                           QStyle::SP_FileDialogDetailedView);
    m_lfDelitem = action("lf_delitem", QStringLiteral("Protokolleintrag löschen"), QStyle::SP_TrashIcon);
    m_lfAttachToContact = action("lf_attachtocontact", QStringLiteral("Eintrag als Kontakt anlegen"),
                                 QStyle::SP_FileDialogNewFolder);
    m_lfOpenContactFromLog = action("lf_opencontactfromlog", QStringLiteral("Zugehörigen Kontakt öffnen"),
                                    QStyle::SP_DirOpenIcon);
    m_lfPlayVoiceboxItem = action("lf_playvoiceboxitem", QStringLiteral("Anrufbeantwortereintrag abhören..."),
                                  QStyle::SP_MediaPlay);
    connect(m_lfBemerkung, &QAction::triggered, this, [this] { postMessage(m_host, WMLOGOPENBEMERKUNG, 0, 0); });
    connect(m_lfDelitem, &QAction::triggered, this, [this] { postMessage(m_host, WMDELETELOGITEM, 0, 0); });
    m_lfSearch = action("lf_search", QStringLiteral("Suchen..."), QStyle::SP_FileDialogContentsView);
    m_lfSearch->setShortcut(QKeySequence::Find);
    m_lfSearch->setShortcutContext(Qt::WidgetWithChildrenShortcut);
    connect(m_lfSearch, &QAction::triggered, this, &Tlogframe::OpenSearchPanel);

    m_popup = new QMenu(this);
    m_popup->setObjectName(QStringLiteral("AdvPopupMenu1"));
    m_popup->addAction(m_lfBemerkung);
    m_popup->addSeparator();
    m_popup->addAction(m_lfPlayVoiceboxItem);
    m_popup->addSeparator();
    m_popup->addAction(m_lfAttachToContact);
    m_popup->addAction(m_lfOpenContactFromLog);
    m_popup->addSeparator();
    m_popup->addAction(m_lfDelitem);
    m_popup->addSeparator();
    m_popup->addAction(m_lfSearch);
    m_popup->addSeparator();
    m_columnMenu = new GridColumnMenu(m_view, m_popup, QStringLiteral("Ansicht1"), this);
    m_columnMenu->setClickHandler([this](QAction* entry) { Datum1Click(entry); });
    struct Entry {
        const char* name;
        const char* caption;
        int tag;
    };
    static constexpr Entry entries[] = {
        {"Datum1", "Datum", 1},          {"Zeit1", "Zeit", 2},
        {"Anrufer1", "Anrufer", 3},      {"Region1", "Region", 12},
        {"An1", "An", 4},                {"Status1", "Status", 5},
        {"ISDNService1", "ISDN-Service", 6}, {"Bemerkung1", "Bemerkung", 7},
        {"Richtung1", "Verbindung", 8},  {"Verbindungszeit1", "Verbindungszeit", 9},
        {"Kosten1", "Kosten", 10},       {"AnrufbeantworterNachricht1", "Anrufbeantworter-Nachricht", 11},
    };
    for (const Entry& e : entries)
        m_columnMenu->addEntry(QLatin1String(e.name), QString::fromUtf8(e.caption), e.tag);
}

// ---------------------------------------------------------------------------------------------
// Source binding

bool Tlogframe::connected() const
{
    return m_dm && m_dm->IBDatabase1.isConnected();
}

void Tlogframe::bindSource()
{
    if (!m_dm || !m_source || !m_dm->ibcds_log.isActive()) {
        detachSource();
        return;
    }
    const RecordStore& store = m_dm->ibcds_log.store();
    LogFieldIndexes& fx = *m_fieldIndexes;
    fx.lid = store.fieldIndex(u"LID");
    fx.cid = store.fieldIndex(u"CID");
    fx.abid = store.fieldIndex(u"ABID");
    fx.ctype = store.fieldIndex(u"CTYPE");
    fx.service = store.fieldIndex(u"SERVICE");
    fx.fromphone = store.fieldIndex(u"FROMPHONE");
    fx.frombez = store.fieldIndex(u"FROMBEZ");
    fx.onmsn = store.fieldIndex(u"ONMSN");
    fx.onbez = store.fieldIndex(u"ONBEZ");
    m_view->setSource(m_source.get());
}

void Tlogframe::detachSource()
{
    if (controller()->source())
        m_view->setSource(nullptr);
    *m_fieldIndexes = LogFieldIndexes();
}

// ---------------------------------------------------------------------------------------------
// Opening

bool Tlogframe::Firstep(QObject* host)
{
    ApplyColorScheme();
    m_filterName.clear();
    m_host = host;
    clearFocusedRecord();
    ResetSearchPanel();
    m_noLog = false;
    m_incomplete = false;
    m_refreshPending = false;

    if (m_viewMode == 0) {
        BusyCursor busy;
        ViewLock lock(m_view);
        try {
            if (!m_dm)
                throw AppException(QStringLiteral("Kein Datenmodul vorhanden."));
            DataSet& log = m_dm->ibcds_log;
            log.close();
            log.setCommandText(QString::fromLatin1(dmsql::kSelectLog));
            // The rows arrive while the window is already usable; the counters are read first,
            // so any change made while they arrive shows at the next refresh.
            m_countersValid = readChangeCounters(m_inserts, m_changes);
            log.openInBackground(QString::fromLatin1(logsql::kLogFetchOrder));
            bindSource();
            if (log.isActive())
                m_layouts->restore(*controller(), 0);
            EnsureSorting();
        } catch (const std::exception& e) {
            // The list's transaction stays open while the list shows (its data set commits on
            // closing), so only the failure path is shared with the other units of work.
            detachSource();
            BusyCursor::resetCursor();
            rollbackAndReport(m_dm ? &m_dm->logts : nullptr, kLabel + QStringLiteral("Firstep"), e);
        }
    } else if (m_viewMode == 1) {
        if (OpenDBonDay(m_logDay) && m_dm && m_dm->ibcds_log.isActive()) {
            try {
                ViewLock lock(m_view);
                m_layouts->restore(*controller(), 1);
            } catch (const std::exception& e) {
                reportError(kLabel + QStringLiteral("Firstep"), &e);
            }
        }
        EnsureSorting();
    }

    // After the restore, so that no stored layout can show them.
    m_lfPlayVoiceboxItem->setVisible(false);
    m_lfAttachToContact->setVisible(false);
    m_lfOpenContactFromLog->setVisible(false);
    {
        ViewLock lock(m_view);
        for (const char* field : {"ABID", "CCHARGE", "CTIME"})
            controller()->setColumnVisible(controller()->columnByName(columnName(field)), false);
    }
    for (const char* entry : {"AnrufbeantworterNachricht1", "Kosten1", "Verbindungszeit1"})
        m_columnMenu->withdrawEntry(QLatin1String(entry));
    UpdateLogCaption();
    PostLogStatus();
    SetTableViewPopup();
    lf_bemerkungUpdate();
    return true;
}

bool Tlogframe::OpenDBonDay(QDate day)
{
    bool ok = true;
    {
        ViewLock lock(m_view);
        BusyCursor busy;
        m_logDay = day;
        try {
            if (!m_dm)
                throw AppException(QStringLiteral("Kein Datenmodul vorhanden."));
            DataSet& log = m_dm->ibcds_log;
            log.close();
            m_incomplete = false;
            m_refreshPending = false;
            log.setCommandText(QString::fromLatin1(logsql::kSelectLogOfDay));
            log.setParam(QStringLiteral("TSD"), day.isValid() ? QVariant(day) : QVariant(QMetaType(QMetaType::QDate)));
            log.open();
            bindSource();
            if (log.isActive())
                log.first();
            UpdateLogCaption();
            EnsureSorting();
        } catch (const std::exception& e) {
            ok = false;
            detachSource();
            BusyCursor::resetCursor();
            rollbackAndReport(m_dm ? &m_dm->logts : nullptr, kLabel + QStringLiteral("OpenDBonDay"), e);
        }
    }
    PostLogStatus();
    lf_bemerkungUpdate();
    return ok;
}

// ---------------------------------------------------------------------------------------------
// Sorting and grouping

void Tlogframe::EnsureSorting()
{
    ViewLock lock(m_view);
    if (controller()->sortedColumns().empty())
        CheckSorting();
}

void Tlogframe::CheckSorting()
{
    try {
        ViewLock lock(m_view);
        GridController* g = controller();
        for (const int c : g->columnOrder()) {
            const QString& field = g->column(c).fieldName;
            if (field == QLatin1String("TSDATE") || field == QLatin1String("TSTIME"))
                g->setSortOrder(c, GridSortOrder::Descending);
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("CheckSorting"), &e);
    }
}

void Tlogframe::SetDateSort()
{
    try {
        CheckSorting();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetDateSort"), &e);
    }
}

bool Tlogframe::NoGroup()
{
    try {
        ViewLock lock(m_view);
        GridController* g = controller();
        g->setGroupByBoxVisible(false);
        g->clearGrouping();
        g->clearSorting();
        SetDateSort();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("NoGroup"), &e);
    }
    return true;
}

void Tlogframe::ColuGroup(const QString& caption)
{
    try {
        const int c = controller()->columnByCaption(caption);
        if (c < 0)
            return;
        controller()->groupBy(c, 0);
        controller()->setColumnVisible(c, false);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("ColuGroup"), &e);
    }
}

void Tlogframe::ToGroup(LogGrouping kind)
{
    try {
        BusyCursor busy;
        {
            ViewLock lock(m_view);
            NoGroup();
            switch (kind) {
            case LogGrouping::Date:
                ColuGroup(QStringLiteral("Datum"));
                break;
            case LogGrouping::Caller:
                ColuGroup(QStringLiteral("Anrufer"));
                break;
            case LogGrouping::Callee:
                ColuGroup(QStringLiteral("An"));
                break;
            case LogGrouping::Free:
                controller()->setGroupByBoxVisible(true);
                break;
            case LogGrouping::Direction:
                ColuGroup(QStringLiteral("Verbindung"));
                break;
            case LogGrouping::None:
            default:
                break;
            }
        }
        FocusLastRecord();
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("ToGroup"), &e);
    }
}

void Tlogframe::FocusLastRecord()
{
    BusyCursor busy;
    ViewLock lock(m_view);
    GridController* g = controller();
    if (!g->isGrouped() || !g->source() || g->source()->rowCount() == 0)
        return;
    g->expandAll(false);
    // The data set's last record in key order, the newest call (the rows arrive newest first,
    // and calls read later are appended): its groups open, its row focused.
    quint32 last = g->source()->rowCount() - 1;
    if (const int lid = m_fieldIndexes->lid; lid >= 0) {
        qint64 highest = std::numeric_limits<qint64>::min();
        for (quint32 r = 0; r < g->source()->rowCount(); ++r) {
            const qint64 key = g->source()->intValue(r, lid);
            if (key > highest) {
                highest = key;
                last = r;
            }
        }
    }
    g->focusRecord(last);
}

bool Tlogframe::CanExpandGroups() const
{
    return controller()->isActive() && controller()->isGrouped();
}

void Tlogframe::ExpandAllGroups(bool expand)
{
    if (!controller()->isActive())
        return;
    ViewLock lock(m_view);
    controller()->expandAll(expand);
}

// ---------------------------------------------------------------------------------------------
// Filter

void Tlogframe::ClearFilterItems()
{
    controller()->clearFilterItems();
}

void Tlogframe::SetNewFilter(int kind)
{
    BusyCursor busy;
    try {
        GridController* g = controller();
        if (kind >= 1 && kind <= 3) {
            static const GridFilterOperator ops[3] = {GridFilterOperator::Today, GridFilterOperator::ThisWeek,
                                                      GridFilterOperator::ThisMonth};
            static const char* texts[3] = {"Heute", "diese Woche", "dieser Monat"};
            const GridFilterOperator op = ops[kind - 1];
            const QString name = gridFilterOperatorName(op);
            if (m_filterName != name) {
                m_filterName = name;
                ViewLock lock(m_view);
                g->setFilterActive(false);
                ClearFilterItems();
                g->addFilterItem(GridFilterItem::list(
                    GridFilterBoolOperator::And,
                    {GridFilterItem::condition(columnName("TSDATE"), op, {}, QString::fromUtf8(texts[kind - 1]))}));
                g->setTag(kind);
                g->setFilterActive(true);
                // The period chosen last counts: a search that replaced the filter now narrows it.
                if (g->isSearching() && !g->search().narrow) {
                    GridSearch search = g->search();
                    search.narrow = true;
                    g->setSearch(search);
                    m_searchPanel->setNarrowsFilter(true);
                }
            }
        } else if (kind != 0 || !m_filterName.isEmpty() || g->tag() != 0) {
            ViewLock lock(m_view);
            g->setFilterActive(false);
            ClearFilterItems();
            g->setTag(0);
            if (!g->filter().isEmpty())
                g->setFilterActive(true);
            m_filterName.clear();
        }
    } catch (const std::exception& e) {
        try {
            ClearFilterItems();
        } catch (...) {
        }
        m_filterName.clear();
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("SetNewFilter\r\nOperation kann nicht ausgeführt werden!"), &e);
    }
    BusyCursor::resetCursor();
    PostLogStatus();
    UpdateLogCaption();
}

void Tlogframe::WhatsOn(int& filterKind, LogGrouping& grouping)
{
    try {
        m_filterName.clear();
        UpdateLogCaption();
        filterKind = 0;
        grouping = LogGrouping::None;
        const GridController* g = controller();
        if (g->filter().active && !g->filter().isEmpty()) {
            const QString text = g->filterText();
            const GridFilterOperator ops[3] = {GridFilterOperator::Today, GridFilterOperator::ThisWeek,
                                               GridFilterOperator::ThisMonth};
            for (int i = 0; i < 3; ++i) {
                const QString name = gridFilterOperatorName(ops[i]);
                if (text.contains(name)) {
                    filterKind = i + 1;
                    m_filterName = name;
                }
            }
            UpdateLogCaption();
        }
        if (g->isGroupByBoxVisible()) {
            grouping = LogGrouping::Free;
            return;
        }
        for (const int c : g->columnOrder()) {
            if (g->groupIndex(c) < 0)
                continue;
            const QString& caption = g->column(c).caption;
            if (caption == QLatin1String("Datum"))
                grouping = LogGrouping::Date;
            else if (caption == QLatin1String("Anrufer"))
                grouping = LogGrouping::Caller;
            else if (caption == QLatin1String("An"))
                grouping = LogGrouping::Callee;
            else if (caption == QLatin1String("Verbindung"))
                grouping = LogGrouping::Direction;
            break;
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("WhatsOn"), &e);
    }
}

// ---------------------------------------------------------------------------------------------
// Caption, status, refresh, layout

void Tlogframe::setCaptionText(const QString& text)
{
    m_cl1->setText(text);
}

QString Tlogframe::captionText() const
{
    return m_cl1->text();
}

void Tlogframe::UpdateLogCaption()
{
    QString text;
    if (m_viewMode == 1) {
        text = m_noLog ? QStringLiteral("Kein Protokoll vorhanden.")
                       : QStringLiteral("Anrufprotokoll vom ") + m_logDay.toString(QStringLiteral("dd.MM.yyyy"));
    } else if (m_viewMode == 0) {
        if (m_filterName.isEmpty())
            text = QStringLiteral("Anrufprotokoll (alle)");
        else if (m_filterName == gridFilterOperatorName(GridFilterOperator::Today))
            text = QStringLiteral("Anrufprotokoll (gefiltert nach \"Heute\")");
        else if (m_filterName == gridFilterOperatorName(GridFilterOperator::ThisWeek))
            text = QStringLiteral("Anrufprotokoll (gefiltert nach \"diese Woche\")");
        else if (m_filterName == gridFilterOperatorName(GridFilterOperator::ThisMonth))
            text = QStringLiteral("Anrufprotokoll (gefiltert nach \"dieser Monat\")");
        else
            text = QStringLiteral("Anrufprotokoll (Filter unbekannt)");
    }
    if (!m_searchedText.isEmpty() && !(m_viewMode == 1 && m_noLog)) {
        const QString searched = QStringLiteral("Suche: \"") + m_searchedText + QLatin1Char('"');
        if (m_viewMode == 1)
            text += QStringLiteral(" (") + searched + QLatin1Char(')');
        else if (m_viewMode == 0 && !m_filterName.isEmpty() && controller()->search().narrow)
            text.insert(text.size() - 1, QStringLiteral(", ") + searched);
        else if (m_viewMode == 0)
            text = QStringLiteral("Anrufprotokoll (") + searched + QLatin1Char(')');
    }
    m_cl1->setText(text);
}

void Tlogframe::PostLogStatus()
{
    const int rows = controller()->rowCount();
    const int state = isLoading() ? kStatusLogLoading : m_incomplete ? kStatusLogIncomplete : 0;
    postMessage(m_host, WMSTATUSPANEL, rows < 1 ? 0 : rows, state);
}

bool Tlogframe::isLoading() const
{
    return m_dm && m_dm->ibcds_log.isLoading();
}

void Tlogframe::rowsArrived()
{
    if (!controller()->source())
        return;
    // Grouped, every batch groups the whole log again: only when it has grown by half, and
    // once more at the end.
    const quint32 applied = controller()->appliedRowCount();
    const quint32 rows = m_source->rowCount();
    if (controller()->isGrouped() && isLoading() && applied > 0 && rows < applied + applied / 2)
        return;
    controller()->sourceAppended();
    PostLogStatus();
}

void Tlogframe::rowsReplaced()
{
    if (!controller()->source())
        return;
    {
        ViewLock lock(m_view);
        controller()->sourceChanged();
        focusKey(m_refreshLid);
    }
    m_refreshLid = 0;
    PostLogStatus();
}

void Tlogframe::loadFinished(bool complete)
{
    if (!m_dm || !controller()->source())
        return;
    controller()->sourceAppended();
    m_incomplete = !complete;
    if (!complete) {
        // The rows that arrived stay; the status says the log is incomplete.
        m_countersValid = false;
        try {
            std::rethrow_exception(m_dm->ibcds_log.loadError());
        } catch (const std::exception& e) {
            rollbackAndReport(&m_dm->logts, kLabel + QStringLiteral("Firstep"), e);
        } catch (...) {
            reportError(kLabel + QStringLiteral("Firstep"));
        }
    }
    PostLogStatus();
    lf_bemerkungUpdate();
    if (m_refreshPending) {
        m_refreshPending = false;
        Refresh_View(std::exchange(m_refreshLid, 0));
    }
}

bool Tlogframe::readChangeCounters(qint64& inserts, qint64& changes)
{
    if (!connected())
        return false;
    try {
        FbTransaction& ts = m_dm->logts;
        if (!ts.isActive())
            ts.start();
        FbStatement counters(m_dm->IBDatabase1, &ts, QString::fromLatin1(logsql::kSelectLogCounters));
        counters.execute();
        if (!counters.next())
            return false;
        inserts = counters.asInt64(0);
        changes = counters.asInt64(1);
        return true;
    } catch (const std::exception&) {
        // A database without the counters: every refresh reads the whole log.
        return false;
    }
}

bool Tlogframe::readNewCalls()
{
    qint64 inserts = 0;
    qint64 changes = 0;
    if (!m_countersValid || !readChangeCounters(inserts, changes) || changes != m_changes)
        return false;
    const RecordStore& store = m_dm->ibcds_log.store();
    const int lid = store.fieldIndex(u"LID");
    if (lid < 0)
        return false;
    qint64 highest = 0;
    for (int r = 0; r < store.rowCount(); ++r)
        highest = std::max(highest, store.integer(r, lid));
    const int added = m_dm->ibcds_log.appendQuery(QString::fromLatin1(logsql::kSelectLogAbove),
                                                  {{QStringLiteral("LID"), QVariant(highest)}});
    // Inserts counted that are not among the new keys (not committed yet, or below the highest
    // key held): the log cannot be patched, so it is read again.
    if (inserts - m_inserts != added)
        return false;
    m_inserts = inserts;
    return true;
}

void Tlogframe::reloadLog()
{
    m_countersValid = readChangeCounters(m_inserts, m_changes);
    m_incomplete = false;
    m_dm->ibcds_log.reloadInBackground(QString::fromLatin1(logsql::kLogFetchOrder));
}

void Tlogframe::focusKey(int lid)
{
    if (lid <= 0)
        return;
    const int record = controller()->locate(lid);
    if (record >= 0)
        controller()->focusRecord(static_cast<quint32>(record));
}

void Tlogframe::Refresh_View(int lid)
{
    try {
        if (m_dm && m_dm->ibcds_log.isActive() && m_viewMode == 0 && controller()->source()) {
            if (isLoading()) {
                // The rows still arriving come from a snapshot: what changed since is read
                // once they are all there.
                m_refreshPending = true;
                m_refreshLid = lid;
            } else {
                ViewLock lock(m_view);
                if (readNewCalls()) {
                    focusKey(lid);
                } else {
                    // The rows held stay on screen until the new reading is complete.
                    m_refreshLid = lid;
                    reloadLog();
                }
                m_view->setFocus();
            }
        } else if (m_dm && m_dm->ibcds_log.isActive()) {
            BusyCursor busy;
            ViewLock lock(m_view);
            m_refreshing = true;
            try {
                m_dm->ibcds_log.refresh();
            } catch (...) {
                m_refreshing = false;
                detachSource();
                throw;
            }
            m_refreshing = false;
            controller()->sourceChanged();
            focusKey(lid);
            m_view->setFocus();
        }
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        logError(kLabel + QStringLiteral("Refresh_View"), &e);
    }
    PostLogStatus();
    lf_bemerkungUpdate();
}

bool Tlogframe::StoreLogView()
{
    try {
        if (m_dm && m_dm->ibcds_log.isActive()) {
            if (!m_layouts->store(*controller(), m_viewMode))
                logError(kLabel + QStringLiteral("StoreLogView\r\nDie Ansicht konnte nicht gespeichert werden."));
        }
        if (m_dm)
            m_dm->ibcds_log.close();
    } catch (const std::exception& e) {
        logError(kLabel + QStringLiteral("StoreLogView"), &e);
    }
    detachSource();
    QCoreApplication::processEvents();
    return true;
}

int Tlogframe::CurrentLogLID() const
{
    return m_dm ? m_dm->CurLogLID : -1;
}

// ---------------------------------------------------------------------------------------------
// Search panel and colours

void Tlogframe::ResetSearchPanel()
{
    m_searchPanel->reset();
    m_searchedText.clear();
    controller()->clearSearch();
}

bool Tlogframe::isSearchShown() const
{
    return m_searchPanel->isOpen();
}

void Tlogframe::OpenSearchPanel()
{
    if (!controller()->isActive())
        return;
    m_searchPanel->open();
}

void Tlogframe::ADVSearchStartClick()
{
    BusyCursor busy;
    try {
        GridSearch search;
        search.text = m_searchPanel->searchText();
        for (const QString& caption : m_searchPanel->chosenColumns()) {
            const int c = controller()->columnByCaption(caption);
            if (c >= 0)
                search.columns.push_back(c);
        }
        search.exact = m_searchPanel->exact();
        search.caseSensitive = m_searchPanel->caseSensitive();
        search.narrow = m_searchPanel->narrowsFilter();
        ViewLock lock(m_view);
        controller()->setSearch(search);
        m_searchedText = search.isActive() ? search.text : QString();
    } catch (const std::exception& e) {
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("ADVSearchStartClick"), &e);
    }
    BusyCursor::resetCursor();
    UpdateLogCaption();
    PostLogStatus();
    lf_bemerkungUpdate();
}

void Tlogframe::L3Click()
{
    removeSearch();
}

void Tlogframe::AdvCloseSearchPanClick()
{
    removeSearch();
    m_searchPanel->reset();
    postMessage(m_host, WMSEARCHUNCHECKED, 0, 0);
    if (m_view->isVisible())
        m_view->setFocus();
}

void Tlogframe::removeSearch()
{
    if (controller()->search() != GridSearch()) {
        ViewLock lock(m_view);
        controller()->clearSearch();
    }
    const bool changed = !m_searchedText.isEmpty();
    m_searchedText.clear();
    if (changed) {
        UpdateLogCaption();
        PostLogStatus();
        lf_bemerkungUpdate();
    }
}

bool Tlogframe::isActionEnabled(const QString& actionName) const
{
    if (actionName == QLatin1String("_LogFo_LogSearch"))
        return controller()->isActive();
    return false;
}

void Tlogframe::executeAction(const QString& actionName)
{
    if (actionName != QLatin1String("_LogFo_LogSearch"))
        return;
    // The main window's entry shows the panel and hides it again.
    if (m_searchPanel->isOpen())
        AdvCloseSearchPanClick();
    else
        OpenSearchPanel();
}

void Tlogframe::ApplyColorScheme()
{
    m_scaffold->applyColorScheme(appColorScheme());
}

// ---------------------------------------------------------------------------------------------
// Column menu

void Tlogframe::Datum1Click(QAction* entry)
{
    // The check mark has already toggled.
    SetTableColVisibleState(entry->isChecked(), entry->property("tag").toInt());
}

void Tlogframe::SetTableColVisibleState(bool visible, int tag)
{
    try {
        m_columnMenu->setColumnVisible(visible, tag);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetTableColVisibleState"), &e);
    }
}

void Tlogframe::SetTableViewPopup()
{
    try {
        m_columnMenu->checkVisibleColumns();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("Firststep - SetTableViewPopup"), &e);
    }
}

void Tlogframe::cxGrid1DBTableView1ColumnPosChanged(int column)
{
    m_columnMenu->columnDraggedOut(column);
}

void Tlogframe::showPopup(const QPoint& globalPos)
{
    lf_bemerkungUpdate();
    m_popup->popup(globalPos);
}

// ---------------------------------------------------------------------------------------------
// Focused record and actions

void Tlogframe::clearFocusedRecord()
{
    if (!m_dm)
        return;
    m_dm->CurLogLID = -1;
    m_dm->CurLogCID = -1;
    m_dm->CurLogABID = -1;
    m_dm->CurLogCType = -1;
    m_dm->CurLogFromPhone.clear();
}

void Tlogframe::TableViewFocusedRecordChanged()
{
    try {
        const int record = controller()->focusedRecord();
        if (!m_dm || record < 0 || !controller()->source()) {
            clearFocusedRecord();
        } else {
            const auto row = static_cast<quint32>(record);
            const LogFieldIndexes& fx = *m_fieldIndexes;
            const auto number = [&](int field) {
                qint64 v = -1;
                if (!m_source->integerOf(row, field, v) || v < INT_MIN || v > INT_MAX)
                    return -1;
                return static_cast<int>(v);
            };
            m_dm->CurLogLID = number(fx.lid);
            m_dm->CurLogCID = number(fx.cid);
            m_dm->CurLogABID = number(fx.abid);
            m_dm->CurLogCType = number(fx.ctype);
            m_dm->CurLogFromPhone = fx.fromphone >= 0 ? m_source->text(row, fx.fromphone) : QString();
        }
    } catch (const std::exception& e) {
        clearFocusedRecord();
        logError(kLabel + QStringLiteral("TableViewFocusedRecordChanged"), &e);
    }
    lf_bemerkungUpdate();
}

void Tlogframe::lf_bemerkungUpdate()
{
    const bool enabled = connected() && m_dm->CurLogLID != -1;
    if (m_lfBemerkung->isEnabled() != enabled)
        m_lfBemerkung->setEnabled(enabled);
    if (m_lfDelitem->isEnabled() != enabled)
        m_lfDelitem->setEnabled(enabled);
}

bool Tlogframe::paintAbidCell(QPainter& painter, const GridCellInfo& cell) const
{
    if (cell.column != m_abidColumn)
        return false;
    try {
        painter.fillRect(cell.rect, cell.background);
        qint64 abid = 0;
        const LogFieldIndexes& fx = *m_fieldIndexes;
        if (cell.record >= 0 && controller()->source()
            && m_source->integerOf(static_cast<quint32>(cell.record), fx.abid, abid) && abid > 0) {
            const QPixmap& pm = m_view->images().at(logimages::AnsweringMachine);
            painter.drawPixmap(cell.rect.left() + (cell.rect.width() - 16) / 2,
                               cell.rect.top() + (cell.rect.height() - 16) / 2, pm);
        }
    } catch (const std::exception& e) {
        logError(QStringLiteral("# LogFrame - ABIDCustomDrawCell"), &e);
    }
    return true;
}

} // namespace orvanta
