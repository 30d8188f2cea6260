#include "categories/TCatControl.h"

#include "categories/CategoryDialogs.h"
#include "categories/CategoryStore.h"
#include "categories/WindowBounds.h"
#include "db/TDM2.h"
#include "dbgrid/RecordStoreGridSource.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"
#include "ui/dialogs/BusyCursor.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridLayoutPersistence.h"
#include "ui/grid/GridUpdateLock.h"
#include "ui/grid/GridView.h"
#include "ui/grid/ListFrameScaffold.h"
#include "ui/label/TVKCutLabel.h"
#include "ui/scheme/ColorScheme.h"

#include <QAction>
#include <QApplication>
#include <QCloseEvent>
#include <QDrag>
#include <QDragMoveEvent>
#include <QDropEvent>
#include <QEventLoop>
#include <QFrame>
#include <QLabel>
#include <QLinearGradient>
#include <QMenu>
#include <QMenuBar>
#include <QMouseEvent>
#include <QMoveEvent>
#include <QPainter>
#include <QSplitter>
#include <QStatusBar>
#include <QStyle>
#include <QTimer>
#include <QToolBar>
#include <QVBoxLayout>

namespace orvanta {
namespace {

    const QString kLabel = QStringLiteral("# CatControl - ");
    const QString kViewName = QStringLiteral("1");
    const QString kBarSection = QStringLiteral("CatControl");
    enum LayoutKind { CategoryLayout = 1, DetailLayout = 2 };
    // Ticks of t1 (30 ms) the contact list waits after the last keyboard step.
    constexpr int kDelayTicks = 10;

    const QString kEditorOpen = QStringLiteral("\r\nDerzeit ist noch eine Kategorie in Bearbeitung.\r\nBitte beenden "
                                               "Sie zuerst die Arbeit mit der geöffneten Kategorie.");
    const QString kCancelled = QStringLiteral("\r\nDie Bearbeitung wird abgebrochen.");

    bool askWarning(const QString& text)
    {
        return dialogs().show(DialogKind::Warning, QString(), text, DialogButton::Yes | DialogButton::No,
                              DialogButton::Yes)
            == DialogButton::Yes;
    }

    // The contact grid's footer: the record count on a vertical gradient of the scheme's colours.
    class KatFooter final : public QWidget {
    public:
        explicit KatFooter(QWidget* parent)
            : QWidget(parent)
        {
            setObjectName(QStringLiteral("cxGrid2DBTableView1Footer"));
            setFont(QFont(QStringLiteral("Verdana"), 8));
            setFixedHeight(QFontMetrics(font()).height() + 10);
        }
        void setText(const QString& text)
        {
            m_text = text;
            update();
        }
        [[nodiscard]] const QString& text() const { return m_text; }
        void setColors(const ListFrameColors& c)
        {
            m_start = c.footerStart;
            m_end = c.footerEnd;
            m_border = c.footerBorder;
            update();
        }

    protected:
        void paintEvent(QPaintEvent*) override
        {
            QPainter p(this);
            const QRect r = rect().adjusted(3, 3, -4, -4);
            QLinearGradient g(r.topLeft(), r.bottomLeft());
            g.setColorAt(0, m_start);
            g.setColorAt(1, m_end);
            p.fillRect(r, g);
            p.setPen(m_border);
            p.drawRect(r);
            p.setPen(Qt::black);
            p.drawText(r.adjusted(3, 0, -3, 0), Qt::AlignLeft | Qt::AlignVCenter, m_text);
        }

    private:
        QString m_text;
        QColor m_start { Qt::white };
        QColor m_end { Qt::lightGray };
        QColor m_border { Qt::gray };
    };

} // namespace

GridDragData::GridDragData(GridView* source)
    : m_source(source)
{
    setData(QLatin1String(kFormat), QByteArray());
}

const QString& TCatControl::noticeText()
{
    static const QString text = QStringLiteral(
        "Um einen Kontakt einer anderen Kategorie zuzuordnen gehen Sie wie folgt vor:\r\n- ziehen Sie den "
        "betreffenden Kontakt per Drag/Drop auf die gewünschte Kategorie  \r\n  oder\r\n- markieren Sie den "
        "betreffenden Kontakt und verschieben Sie diesen über den\r\n  Menüpunkt \"Kontakt/Kontakt in andere "
        "Kategorie verschieben...\".\r\n ");
    return text;
}

TCatControl::TCatControl(TDM2* dm, Callbacks callbacks, QWidget* parent)
    : QMainWindow(parent, Qt::Window | Qt::WindowStaysOnTopHint)
    , m_dm(dm)
    , m_callbacks(std::move(callbacks))
{
    setObjectName(QStringLiteral("CatControl"));
    setWindowTitle(QStringLiteral("Kategorieverwaltung"));
    resize(940, 540);
    buildLayout();
    buildColumns();
    buildActions();
    buildMenusAndBars();

    m_t1 = new QTimer(this);
    m_t1->setObjectName(QStringLiteral("t1"));
    m_t1->setInterval(30);
    connect(m_t1, &QTimer::timeout, this, &TCatControl::t1Timer);
    m_updateTimer = new QTimer(this);
    m_updateTimer->setInterval(200);
    connect(m_updateTimer, &QTimer::timeout, this, &TCatControl::updateActions);
    // Snapping waits until the window rests, so it never fights the user's hand.
    m_snapTimer = new QTimer(this);
    m_snapTimer->setSingleShot(true);
    m_snapTimer->setInterval(250);
    connect(m_snapTimer, &QTimer::timeout, this, [this] {
        if (isVisible() && !isMaximized() && !isFullScreen())
            m_fs1->snap(*this);
    });
    m_fs1 = std::make_unique<WindowBounds>(programFile(QStringLiteral("CCStore")), QStringLiteral("CatControl"), 15);

    connect(m_katView, &GridView::focusedRecordChanged, this, &TCatControl::categoryFocusChanged);
    connect(m_katView, &GridView::keyPressed, this, [this](int key, Qt::KeyboardModifiers) {
        switch (key) {
        case Qt::Key_PageUp:
        case Qt::Key_PageDown:
        case Qt::Key_End:
        case Qt::Key_Home:
        case Qt::Key_Up:
        case Qt::Key_Down:
            m_keyboard = true;
            // A key that moves nothing must not delay the next mouse click.
            QTimer::singleShot(0, this, [this] { m_keyboard = false; });
            break;
        default:
            break;
        }
    });
    connect(m_katView, &GridView::rowDoubleClicked, this, [this](int row) {
        if (m_katView->controller()->isGroupRow(row))
            return;
        runIfEnabled(m_selectionMode ? m_katMove : m_katRename);
    });
    connect(m_detailView, &GridView::focusedRecordChanged, this, &TCatControl::updateActions);
    connect(m_detailView, &GridView::rowContextMenuRequested, this, [this](const QPoint& pos) {
        updateActions();
        m_popup->popup(pos);
    });
    connect(m_detailView->controller(), &GridController::layoutChanged, this, &TCatControl::updateFooter);

    if (m_dm) {
        // The data sets are the data module's: another manager (or the module going down) may
        // close and open them under this window.
        connect(&m_dm->kat_list, &DataSet::aboutToClose, this, [this] {
            if (!m_refreshing)
                m_katView->setSource(nullptr);
        });
        connect(&m_dm->kat_list, &DataSet::opened, this, [this] {
            if (!m_refreshing)
                bindCategories();
        });
        connect(&m_dm->katdetail, &DataSet::aboutToClose, this, [this] {
            if (!m_refreshing) {
                m_detailView->setSource(nullptr);
                updateFooter();
            }
        });
        connect(&m_dm->katdetail, &DataSet::opened, this, [this] {
            if (!m_refreshing)
                bindDetail();
        });
    }
    FormCreate();
    updateActions();
    updateFooter();
}

TCatControl::~TCatControl()
{
    // Freed with its owner while open: keep what the user arranged, as closing would.
    if (m_shown && !m_closed) {
        m_closed = true;
        try {
            FormClose();
        } catch (const std::exception& e) {
            logError(kLabel + QStringLiteral("FormClose"), &e);
        }
    }
    // The grids must not outlive the stores they read.
    m_katView->setSource(nullptr);
    m_detailView->setSource(nullptr);
}

// ---------------------------------------------------------------------------------------------
// Construction

void TCatControl::buildLayout()
{
    auto* central = new QWidget(this);
    central->setObjectName(QStringLiteral("P1"));
    auto* box = new QVBoxLayout(central);
    box->setContentsMargins(4, 4, 4, 4);
    m_splitter = new QSplitter(Qt::Horizontal, central);
    m_splitter->setObjectName(QStringLiteral("RzSplitter1"));
    m_splitter->setChildrenCollapsible(false);
    box->addWidget(m_splitter);

    auto* left = new QWidget(m_splitter);
    left->setObjectName(QStringLiteral("P_Kat"));
    m_katScaffold = std::make_unique<ListFrameScaffold>(left);
    m_katScaffold->caption()->setText(QStringLiteral("Kategorien:"));
    m_katView = m_katScaffold->addTableView(QStringLiteral("cxGrid1DBTableView1"));
    m_katView->setSortedColumnColor(QColor(0xEF, 0xEF, 0xEF));
    m_katView->viewport()->setAcceptDrops(true);
    m_katView->viewport()->installEventFilter(this);

    auto* right = new QWidget(m_splitter);
    right->setObjectName(QStringLiteral("P_KatDetail"));
    m_detailScaffold = std::make_unique<ListFrameScaffold>(right);
    m_detailScaffold->caption()->setText(QStringLiteral("Der ausgewählten Kategorie zugeordnete Kontakte:"));
    m_detailView = m_detailScaffold->addTableView(QStringLiteral("cxGrid2DBTableView1"));
    m_detailScaffold->gridHost()->setObjectName(QStringLiteral("cxGrid2"));
    m_detailView->setSortedColumnColor(QColor(0xEF, 0xEF, 0xEF));
    m_detailView->viewport()->installEventFilter(this);
    auto* panelBox = qobject_cast<QVBoxLayout*>(m_detailScaffold->panel()->layout());
    auto* footer = new KatFooter(m_detailScaffold->panel());
    m_footer = footer;
    panelBox->addWidget(footer);

    auto* notice = new QFrame(m_detailScaffold->panel());
    notice->setObjectName(QStringLiteral("P_Hinweis"));
    notice->setFrameShape(QFrame::StyledPanel);
    auto* nb = new QVBoxLayout(notice);
    nb->setContentsMargins(8, 4, 8, 4);
    auto* head = new QLabel(QStringLiteral("Hinweis:"), notice);
    head->setObjectName(QStringLiteral("L_Hinweis"));
    QFont hf = head->font();
    hf.setBold(true);
    head->setFont(hf);
    m_notice = new QLabel(noticeText().trimmed().replace(QLatin1String("\r\n"), QLatin1String("\n")), notice);
    m_notice->setObjectName(QStringLiteral("L_HinweisText"));
    m_notice->setTextFormat(Qt::PlainText);
    nb->addWidget(head);
    nb->addWidget(m_notice);
    panelBox->addWidget(notice);

    m_splitter->addWidget(left);
    m_splitter->addWidget(right);
    m_splitter->setStretchFactor(0, 0);
    m_splitter->setStretchFactor(1, 1);
    // Room for both category columns at their designed widths.
    m_splitter->setSizes({ 330, 600 });
    setCentralWidget(central);
    statusBar()->setObjectName(QStringLiteral("dxStatusBar1"));

    m_layouts = std::make_unique<GridLayoutPersistence>(kViewName);
    m_layouts->setFile(CategoryLayout, programFile(QStringLiteral("CCStoreT1")));
    m_layouts->setFile(DetailLayout, programFile(QStringLiteral("CCStoreT2")));
}

void TCatControl::buildColumns()
{
    const auto hidden = [](const char* name, const char* field) {
        GridColumn c(QString::fromLatin1(name), QString::fromLatin1(field));
        c.visible = false;
        c.sortable = c.groupable = c.movable = false;
        c.showInColumnMenu = false;
        return c;
    };
    m_katView->addColumn(hidden("KAT_LID", "LID"));
    const int katbez = m_katView->addColumn(
        GridColumn(QStringLiteral("KAT_KATBEZ"), QStringLiteral("KATBEZ"), QStringLiteral("Kategorie"), 1, 116));
    m_katView->addColumn(
        GridColumn(QStringLiteral("KAT_BEMERKUNG"), QStringLiteral("BEMERKUNG"), QStringLiteral("Bemerkung"), 2, 182));
    m_katView->controller()->setKeyField(QStringLiteral("LID"));
    m_katView->controller()->setSortOrder(katbez, GridSortOrder::Ascending);

    m_detailView->addColumn(hidden("KATD_LID", "LID"));
    m_detailView->addColumn(hidden("KATD_CID", "CID"));
    m_detailView->addColumn(hidden("KATD_KID", "KID"));
    const int contbez = m_detailView->addColumn(
        GridColumn(QStringLiteral("KATD_CONTBEZ"), QStringLiteral("CONTBEZ"), QStringLiteral("Kontakt"), 1, 170));
    m_detailView->addColumn(
        GridColumn(QStringLiteral("KATD_STR"), QStringLiteral("STR"), QStringLiteral("Straße"), 2, 140));
    m_detailView->addColumn(GridColumn(QStringLiteral("KATD_PLZ"), QStringLiteral("PLZ"), QString(), 3, 46));
    m_detailView->addColumn(
        GridColumn(QStringLiteral("KATD_ORT"), QStringLiteral("ORT"), QStringLiteral("Ort"), 4, 120));
    m_detailView->controller()->setKeyField(QStringLiteral("LID"));
    m_detailView->controller()->setSortOrder(contbez, GridSortOrder::Ascending);
}

void TCatControl::buildActions()
{
    const auto action = [this](const char* name, const QString& caption, const QString& hint,
                               QStyle::StandardPixmap icon, void (TCatControl::*handler)()) {
        auto* a = new QAction(style()->standardIcon(icon), caption, this);
        a->setObjectName(QLatin1String(name));
        a->setToolTip(hint);
        a->setStatusTip(hint);
        addAction(a);
        connect(a, &QAction::triggered, this, handler);
        return a;
    };
    m_katNew = action("Kat_New", QStringLiteral("Neu..."), QStringLiteral("Neue Kategorie anlegen"),
                      QStyle::SP_FileDialogNewFolder, &TCatControl::Kat_NewExecute);
    m_katRename = action("Kat_Rename", QStringLiteral("Bearbeiten..."), QStringLiteral("Kategorie umbenennen"),
                         QStyle::SP_FileDialogDetailedView, &TCatControl::Kat_RenameExecute);
    m_katDelete = action("Kat_Delete", QStringLiteral("Löschen"), QStringLiteral("Kategorie löschen"),
                         QStyle::SP_TrashIcon, &TCatControl::Kat_DeleteExecute);
    m_katMove = action("Kat_Move", QStringLiteral("Übernehmen"),
                       QStringLiteral("Markierte Kategorie in Erfassungsform übernehmen"), QStyle::SP_DialogApplyButton,
                       &TCatControl::Kat_MoveExecute);
    const QString move = QStringLiteral("Kontakt in andere Kategorie verschieben...");
    m_konMove = action("Kon_Move", move, move, QStyle::SP_ArrowRight, &TCatControl::Kon_MoveExecute);
    const QString cut = QStringLiteral("Kontakt aus der Kategorie entfernen");
    m_konCutRelated
        = action("Kon_CutRelated", cut, cut, QStyle::SP_DialogDiscardButton, &TCatControl::Kon_CutRelatedExecute);
    m_close = new QAction(style()->standardIcon(QStyle::SP_DialogCloseButton), QStringLiteral("Schließen"), this);
    m_close->setObjectName(QStringLiteral("dxBB1"));
    m_close->setToolTip(QStringLiteral("Schließen"));
    m_close->setStatusTip(QStringLiteral("Schließen"));
    connect(m_close, &QAction::triggered, this, &QWidget::close);
}

void TCatControl::buildMenusAndBars()
{
    QMenuBar* bar = menuBar();
    bar->setObjectName(QStringLiteral("dxKatBarManager1"));
    const auto addMenu = [bar](const char* name, const QString& title) {
        QMenu* m = bar->addMenu(title);
        m->setObjectName(QLatin1String(name));
        return m;
    };
    addMenu("dxKatBB_Verwaltung", QStringLiteral("Kategorieverwaltung"))->addAction(m_close);
    QMenu* kat = addMenu("dxKatBB_Kategorie", QStringLiteral("Kategorie"));
    kat->addAction(m_katNew);
    kat->addAction(m_katRename);
    kat->addAction(m_katDelete);
    kat->addSeparator();
    kat->addAction(m_katMove);
    QMenu* kon = addMenu("dxKatBB_Kontakt", QStringLiteral("Kontakt"));
    kon->addAction(m_konMove);
    kon->addAction(m_konCutRelated);

    const auto addBar = [this](const char* name, const QString& title, std::initializer_list<QAction*> actions) {
        QToolBar* tb = addToolBar(title);
        tb->setObjectName(QLatin1String(name));
        tb->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
        tb->setIconSize(QSize(16, 16));
        for (QAction* a : actions)
            tb->addAction(a);
    };
    addBar("dxKatBar1", QStringLiteral("Kategorie neu/bearbeiten"), { m_katNew, m_katRename, m_katDelete });
    addBar("dxKatBar2", QStringLiteral("Kategorie übernehmen"), { m_katMove });
    addBar("dxKatBar3", QStringLiteral("Kontakte - Zuordnung verändern"), { m_konMove, m_konCutRelated });

    m_popup = new QMenu(this);
    m_popup->setObjectName(QStringLiteral("PopupMenu1"));
    m_popup->addAction(m_konMove);
    m_popup->addAction(m_konCutRelated);
}

// ---------------------------------------------------------------------------------------------
// Opening and closing

void TCatControl::FormCreate()
{
    m_keyboard = false;
    m_selectionMode = false;
    const IniFile store(programFile(QStringLiteral("BarStore")));
    const QByteArray state = QByteArray::fromBase64(store.readString(kBarSection, QStringLiteral("State")).toLatin1());
    // A damaged arrangement leaves the designed one.
    if (!state.isEmpty() && !restoreState(state, 1))
        for (QToolBar* tb : findChildren<QToolBar*>())
            tb->setVisible(true);
}

void TCatControl::showEvent(QShowEvent* event)
{
    QMainWindow::showEvent(event);
    if (event->spontaneous())
        return;
    FormShow();
}

void TCatControl::FormShow()
{
    m_shown = true;
    m_closed = false;
    m_chosen.clear();
    m_detailLayoutRestored = false;
    m_countdown = kDelayTicks;
    m_focusedId = -1;
    m_loadedId = -2;
    m_dbError = false;
    applyColorScheme();
    (void)m_fs1->restore(*this);
    KatDBConnect();
    m_updateTimer->start();
    updateActions();
}

void TCatControl::closeEvent(QCloseEvent* event)
{
    if (!m_closed) {
        m_closed = true;
        FormClose();
    }
    QMainWindow::closeEvent(event);
    if (m_pickLoop)
        m_pickLoop->quit();
}

void TCatControl::moveEvent(QMoveEvent* event)
{
    QMainWindow::moveEvent(event);
    if (m_snapTimer && isVisible())
        m_snapTimer->start();
}

void TCatControl::FormClose()
{
    m_t1->stop();
    m_updateTimer->stop();
    if (m_dm) {
        if (m_dm->kat_list.isActive() && m_katView->controller()->source())
            if (!m_layouts->store(*m_katView->controller(), CategoryLayout))
                logError(kLabel + QStringLiteral("FormClose\r\nDie Ansicht konnte nicht gespeichert werden."));
        if (m_dm->katdetail.isActive() && m_detailView->controller()->source())
            if (!m_layouts->store(*m_detailView->controller(), DetailLayout))
                logError(kLabel + QStringLiteral("FormClose\r\nDie Ansicht konnte nicht gespeichert werden."));
        m_katView->setSource(nullptr);
        m_detailView->setSource(nullptr);
        m_dm->kat_list.close();
        m_dm->katdetail.close();
    }
    (void)m_fs1->save(*this);
    IniFile store(programFile(QStringLiteral("BarStore")));
    store.setPath(programFile(QStringLiteral("BarStore")));
    store.writeString(kBarSection, QStringLiteral("State"), QString::fromLatin1(saveState(1).toBase64()));
    (void)store.save();
}

void TCatControl::setSelectionMode(bool on)
{
    m_selectionMode = on;
    updateActions();
}

QString TCatControl::execPick()
{
    setSelectionMode(true);
    setWindowModality(Qt::ApplicationModal);
    show();
    raise();
    activateWindow();
    QEventLoop loop;
    m_pickLoop = &loop;
    if (isVisible())
        loop.exec();
    m_pickLoop = nullptr;
    return m_chosen;
}

void TCatControl::applyColorScheme()
{
    const int scheme = appColorScheme();
    const ListFrameColors& c = listFrameColors(scheme);
    // The sheet first: setting one re-polishes the children and would drop their palettes.
    setStyleSheet(QStringLiteral("QToolBar { background: %1; border: none; } QStatusBar { background: %1; }")
                      .arg(c.panel.name()));
    m_katScaffold->applyColorScheme(scheme);
    m_detailScaffold->applyColorScheme(scheme);
    for (QWidget* w : { centralWidget(), static_cast<QWidget*>(m_splitter) }) {
        QPalette p = w->palette();
        p.setColor(QPalette::Window, c.panel);
        w->setPalette(p);
        w->setAutoFillBackground(true);
    }
    static_cast<KatFooter*>(m_footer)->setColors(c);
}

// ---------------------------------------------------------------------------------------------
// Lists

void TCatControl::bindCategories()
{
    if (!m_dm || !m_dm->kat_list.isActive()) {
        m_katView->setSource(nullptr);
        return;
    }
    if (!m_katSource || &m_katSource->store() != &m_dm->kat_list.store())
        m_katSource = std::make_unique<RecordStoreGridSource>(m_dm->kat_list.store());
    if (m_katView->controller()->source() == m_katSource.get())
        m_katView->controller()->sourceChanged();
    else
        m_katView->setSource(m_katSource.get());
}

void TCatControl::bindDetail()
{
    if (!m_dm || !m_dm->katdetail.isActive()) {
        m_detailView->setSource(nullptr);
        updateFooter();
        return;
    }
    if (!m_detailSource || &m_detailSource->store() != &m_dm->katdetail.store())
        m_detailSource = std::make_unique<RecordStoreGridSource>(m_dm->katdetail.store());
    if (m_detailView->controller()->source() == m_detailSource.get())
        m_detailView->controller()->sourceChanged();
    else
        m_detailView->setSource(m_detailSource.get());
    updateFooter();
}

bool TCatControl::KatDBConnect()
{
    if (!m_dm || !m_dm->DBConnect())
        return false;
    try {
        BusyCursor busy;
        GridUpdateLock katLock(m_katView);
        GridUpdateLock detailLock(m_detailView);
        m_refreshing = true;
        m_katView->setSource(nullptr);
        m_dm->kat_list.close();
        m_dm->kat_list.open();
        m_refreshing = false;
        bindCategories();
        if (m_dm->kat_list.isActive())
            m_layouts->restore(*m_katView->controller(), CategoryLayout);
    } catch (const std::exception& e) {
        m_refreshing = false;
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("KatDBConnect"), &e);
        return false;
    }
    followFocus();
    return true;
}

bool TCatControl::KatDetailDBConnect(int id)
{
    if (!m_dm || !m_dm->DBConnect())
        return false;
    try {
        BusyCursor busy;
        GridUpdateLock lock(m_detailView);
        DataSet& ds = m_dm->katdetail;
        m_refreshing = true;
        m_detailView->setSource(nullptr);
        ds.close();
        ds.setParam(QStringLiteral("ID"), id);
        ds.open();
        m_refreshing = false;
        bindDetail();
        if (!m_detailLayoutRestored) {
            m_detailLayoutRestored = true;
            m_layouts->restore(*m_detailView->controller(), DetailLayout);
        }
    } catch (const std::exception& e) {
        m_refreshing = false;
        BusyCursor::resetCursor();
        updateFooter();
        reportError(kLabel + QStringLiteral("KatDetailDBConnect"), &e);
        return false;
    }
    m_loadedId = id;
    ++m_detailLoads;
    updateFooter();
    updateActions();
    return true;
}

void TCatControl::categoryFocusChanged()
{
    m_countdown = kDelayTicks;
    const GridController* g = m_katView->controller();
    const int record = g->focusedRecord();
    m_focusedId = -1;
    if (const GridSource* s = g->source(); s && record >= 0) {
        const int lid = s->fieldIndex(u"LID");
        if (lid >= 0)
            m_focusedId = static_cast<int>(s->intValue(static_cast<quint32>(record), lid));
    }
    if (!m_keyboard) {
        m_t1->stop();
        KatDetailDBConnect(m_focusedId);
    } else {
        if (!m_t1->isActive())
            m_t1->start();
        m_keyboard = false;
    }
}

void TCatControl::t1Timer()
{
    if (m_countdown >= 1) {
        --m_countdown;
        return;
    }
    m_t1->stop();
    KatDetailDBConnect(m_focusedId);
}

void TCatControl::followFocus()
{
    m_keyboard = false;
    const GridController* g = m_katView->controller();
    const int record = g->focusedRecord();
    int id = -1;
    if (const GridSource* s = g->source(); s && record >= 0)
        id = static_cast<int>(s->intValue(static_cast<quint32>(record), s->fieldIndex(u"LID")));
    // The focus signal has loaded the list already unless the focused row kept its place.
    if (id != m_loadedId || !m_dm || !m_dm->katdetail.isActive())
        categoryFocusChanged();
    else
        m_focusedId = id;
}

void TCatControl::rereadCategories(int id)
{
    if (!m_dm || !m_dm->kat_list.isActive())
        return;
    try {
        BusyCursor busy;
        GridUpdateLock lock(m_katView);
        m_refreshing = true;
        m_dm->kat_list.refresh();
        m_refreshing = false;
        bindCategories();
        if (id > 0) {
            const int record = m_katView->controller()->locate(id);
            if (record >= 0)
                m_katView->controller()->focusRecord(static_cast<quint32>(record));
        }
    } catch (const std::exception& e) {
        m_refreshing = false;
        m_katView->setSource(nullptr);
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("KatDBConnect"), &e);
    }
    if (isVisible())
        m_katView->setFocus();
    followFocus();
}

void TCatControl::rereadDetail(int id)
{
    if (!m_dm || !m_dm->katdetail.isActive())
        return;
    try {
        BusyCursor busy;
        GridUpdateLock lock(m_detailView);
        m_refreshing = true;
        m_dm->katdetail.refresh();
        m_refreshing = false;
        bindDetail();
        if (id > 0) {
            const int record = m_detailView->controller()->locate(id);
            if (record >= 0)
                m_detailView->controller()->focusRecord(static_cast<quint32>(record));
        }
    } catch (const std::exception& e) {
        m_refreshing = false;
        m_detailView->setSource(nullptr);
        BusyCursor::resetCursor();
        reportError(kLabel + QStringLiteral("KatDetailDBConnect"), &e);
    }
    updateFooter();
    updateActions();
}

int TCatControl::categoryRow(int id) const
{
    if (!m_dm || !m_dm->kat_list.isActive() || id < 0)
        return -1;
    const RecordStore& s = m_dm->kat_list.store();
    const int lid = s.fieldIndex(u"LID");
    for (int row = 0; lid >= 0 && row < s.rowCount(); ++row)
        if (s.integer(row, lid) == id)
            return row;
    return -1;
}

QString TCatControl::categoryText(int row, const char* field) const
{
    const RecordStore& s = m_dm->kat_list.store();
    const int f = s.fieldIndex(QString::fromLatin1(field));
    return f < 0 || s.isNull(row, f) ? QString() : s.text(row, f);
}

int TCatControl::focusedDetailValue(const char* field) const
{
    const GridController* g = m_detailView->controller();
    const GridSource* s = g->source();
    const int record = g->focusedRecord();
    if (!s || record < 0)
        return -1;
    const int f = s->fieldIndex(QString::fromLatin1(field));
    if (f < 0 || s->isNull(static_cast<quint32>(record), f))
        return -1;
    return static_cast<int>(s->intValue(static_cast<quint32>(record), f));
}

void TCatControl::updateFooter()
{
    const GridController* g = m_detailView->controller();
    const int n = g->isActive() ? g->recordCount() : 0;
    static_cast<KatFooter*>(m_footer)->setText(QStringLiteral("Kontakte: %1").arg(n));
}

QString TCatControl::footerText() const
{
    return static_cast<KatFooter*>(m_footer)->text();
}

// ---------------------------------------------------------------------------------------------
// Actions

void TCatControl::updateActions()
{
    const GridController* g = m_detailView->controller();
    const bool contact = m_dm && m_dm->katdetail.isActive() && m_dm->katdetail.rowCount() > 0 && g->isActive()
        && g->focusedRecord() >= 0;
    m_konMove->setEnabled(contact);
    m_konCutRelated->setEnabled(contact);
    m_katMove->setEnabled(m_selectionMode);
}

void TCatControl::runIfEnabled(QAction* action)
{
    updateActions();
    if (action->isEnabled())
        action->trigger();
}

bool TCatControl::editorOpen(const char* operation) const
{
    if (!m_editForm)
        return false;
    reportError(kLabel + QLatin1String(operation) + kEditorOpen);
    return true;
}

int TCatControl::editLoop(int id, QString name, QString remark, QString* savedName)
{
    for (;;) {
        Tkateditform form(this);
        form.setName(name);
        form.setRemark(remark);
        m_editForm = &form;
        form.exec();
        m_editForm = nullptr;
        if (!form.confirmed())
            return -1;
        name = form.name();
        remark = form.remark();
        int saved = 0;
        switch (InsertKat(*m_dm, id, name, remark, &saved)) {
        case KatSaveResult::Saved:
            rereadCategories(saved);
            if (savedName) {
                const int row = categoryRow(saved);
                *savedName = row >= 0 ? categoryText(row, "KATBEZ") : name.trimmed();
            }
            return saved;
        case KatSaveResult::DatabaseError:
            m_dbError = true;
            // A category another program deleted in the meantime leaves the list.
            rereadCategories(id);
            return -1;
        case KatSaveResult::NameTaken:
            break; // again, with what the user entered
        }
    }
}

void TCatControl::Kat_NewExecute()
{
    if (editorOpen("Kat_NewExecute") || !m_dm)
        return;
    editLoop(0, QString(), QString(), nullptr);
}

void TCatControl::Kat_RenameExecute()
{
    if (editorOpen("Kat_RenameExecute") || !m_dm || m_focusedId < 0)
        return;
    const int row = categoryRow(m_focusedId);
    if (row < 0) {
        reportError(kLabel
                    + QStringLiteral("Kat_RenameExecute\r\nDie zu bearbeitende Kategorie konnte nicht "
                                     "ermittelt werden.")
                    + kCancelled);
        return;
    }
    const int id = m_focusedId;
    const QString oldName = categoryText(row, "KATBEZ");
    QString newName;
    if (editLoop(id, oldName, categoryText(row, "BEMERKUNG"), &newName) > 0 && newName != oldName
        && m_callbacks.HasRenameKatBez)
        m_callbacks.HasRenameKatBez(oldName, newName);
}

void TCatControl::Kat_DeleteExecute()
{
    if (editorOpen("Kat_DeleteExecute") || !m_dm)
        return;
    const QString label = kLabel + QStringLiteral("Kat_DeleteExecute\r\n");
    const int row = categoryRow(m_focusedId);
    if (row < 0) {
        reportError(label + QStringLiteral("Die zu löschende Kategorie konnte nicht ermittelt werden.") + kCancelled);
        return;
    }
    const int id = m_focusedId;
    const QString name = categoryText(row, "KATBEZ");
    // While the keys rest the list may still show the category before: an empty list there must
    // not make a category with contacts look empty.
    if (m_loadedId != id) {
        m_t1->stop();
        KatDetailDBConnect(id);
    }
    DataSet& detail = m_dm->katdetail;
    if (!detail.isActive()) {
        reportError(label + QStringLiteral("Der Kategorie zugeordnete Kontakte konnten nicht ermittelt werden.")
                    + kCancelled);
        return;
    }
    bool yes = false;
    const int count = detail.rowCount();
    if (count == 0) {
        yes = askWarning(QStringLiteral("Kategorie \"") + name + QStringLiteral("\" löschen?"));
    } else {
        const RecordStore& s = detail.store();
        const int kid = s.fieldIndex(u"KID");
        if (kid < 0 || s.integer(0, kid) != id) {
            reportError(label
                        + QStringLiteral("Die Anzahl der zu löschenden Kategorie zugeordnete Kontakte "
                                         "konnten nicht ermittelt werden.")
                        + kCancelled);
            return;
        }
        yes = askWarning(QStringLiteral("Der zu löschenden Kategorie \"") + name + QStringLiteral("\" sind derzeit ")
                         + QString::number(count)
                         + QStringLiteral("\r\nKontakte zugeordnet!\r\n\r\nDie betreffenden Kontakte werden nach dem "
                                          "Löschvorgang\r\nkeiner Kategorie mehr angehören.\r\n\r\nKategorie \"")
                         + name + QStringLiteral("\" löschen?"));
    }
    if (!yes)
        return;
    if (!DeleteKat(*m_dm, id))
        return;
    rereadCategories(0);
    if (count > 0 && m_callbacks.HasRenameKatBez)
        m_callbacks.HasRenameKatBez(name, QString());
}

void TCatControl::Kat_MoveExecute()
{
    if (!m_selectionMode)
        return;
    const int row = categoryRow(m_focusedId);
    m_chosen = row >= 0 ? categoryText(row, "KATBEZ") : QString();
    close();
}

void TCatControl::Kon_MoveExecute()
{
    if (!m_dm)
        return;
    try {
        const int lid = focusedDetailValue("LID");
        const int cid = focusedDetailValue("CID");
        if (lid <= 0 || cid <= 0)
            return;
        TSelKatForm form(this);
        if (m_dm->kat_list.isActive()) {
            const RecordStore& s = m_dm->kat_list.store();
            const int f = s.fieldIndex(u"LID");
            for (int row = 0; row < s.rowCount(); ++row)
                form.Add_kd(static_cast<int>(s.integer(row, f)), categoryText(row, "KATBEZ"));
        }
        form.exec();
        if (!form.confirmed() || form.chosenId() < 1)
            return;
        if (!ChangeConKat(*m_dm, lid, form.chosenId()))
            return;
        rereadDetail(lid); // the link keeps its key: the moved contact stays marked
        if (m_callbacks.ChangeRelatedKontKat)
            m_callbacks.ChangeRelatedKontKat(cid, form.chosenName());
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("Kon_MoveExecute"), &e);
    }
}

void TCatControl::Kon_CutRelatedExecute()
{
    if (!m_dm)
        return;
    const QString label = kLabel + QStringLiteral("Kon_CutRelated\r\n");
    const int row = categoryRow(m_focusedId);
    if (row < 0) {
        reportError(label + QStringLiteral("Die zu löschende Kategorie konnte nicht ermittelt werden.") + kCancelled);
        return;
    }
    DataSet& detail = m_dm->katdetail;
    if (!detail.isActive()) {
        reportError(label + QStringLiteral("Der Kategorie zugeordnete Kontakte konnten nicht ermittelt werden.")
                    + kCancelled);
        return;
    }
    const int lid = focusedDetailValue("LID");
    const int cid = focusedDetailValue("CID");
    const int kid = focusedDetailValue("KID");
    if (detail.rowCount() == 0 || kid != m_focusedId || lid <= 0) {
        reportError(label + QStringLiteral("Der zu bearbeitende Kontakte konnten nicht ermittelt werden.")
                    + kCancelled);
        return;
    }
    const GridController* g = m_detailView->controller();
    const QString contact = g->cellText(static_cast<quint32>(g->focusedRecord()), g->columnByName(u"KATD_CONTBEZ"));
    const QString category = categoryText(row, "KATBEZ");
    if (!askWarning(QStringLiteral("Bitte beachten Sie, dass der Kontakt nach der Durchführung\r\nkeiner Kategorie "
                                   "mehr zugeordnet ist!\r\n\r\nUm einen Kontakt einer anderen Kategorie zuzuordnen, "
                                   "verwenden\r\nSie bitte den Menüpunkt \"Kontakt/Kontakt in andere Kategorie\r\n"
                                   "verschieben...\".\r\n\r\nKontakt \"")
                    + contact + QStringLiteral("\" aus der Kategorie \"") + category + QStringLiteral("\" entfernen?")))
        return;
    if (!DeleteRelated(*m_dm, lid))
        return;
    // Only this contact left the category: only its edit window may show it.
    if (m_callbacks.ChangeRelatedKontKat)
        m_callbacks.ChangeRelatedKontKat(cid, QString());
    rereadDetail(0);
}

// ---------------------------------------------------------------------------------------------
// Drag and drop

QMimeData* TCatControl::createDragData()
{
    m_dragLid = 0;
    m_dragCid = 0;
    return new GridDragData(m_detailView);
}

GridView* TCatControl::GetDragSourceGridView(const QMimeData* data) const
{
    try {
        if (const auto* d = qobject_cast<const GridDragData*>(data))
            return d->source();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("GetDragSourceGridView"), &e);
    }
    return nullptr;
}

bool TCatControl::Grid1DBTableView1DragOver(const QMimeData* data, const QPoint& pos)
{
    if (GetDragSourceGridView(data) != m_detailView)
        return false;
    if (m_dragLid <= 0 && m_dragCid <= 0) {
        m_dragLid = focusedDetailValue("LID");
        m_dragCid = focusedDetailValue("CID");
    }
    // The focus follows the mouse, so the drop goes where the user sees the mark.
    const int row = m_katView->rowAt(pos);
    if (row >= 0 && row != m_katView->controller()->focusedRow())
        m_katView->controller()->setFocusedRow(row);
    return true;
}

void TCatControl::Grid1DBTableView1DragDrop(const QMimeData* data, const QPoint& pos)
{
    try {
        if (!m_dm || !Grid1DBTableView1DragOver(data, pos))
            return;
        const int row = m_katView->rowAt(pos);
        const GridController* g = m_katView->controller();
        const int record = row >= 0 ? g->recordAt(row) : -1;
        if (record < 0 || m_dragLid <= 0)
            return;
        const GridSource* s = g->source();
        const int target = static_cast<int>(s->intValue(static_cast<quint32>(record), s->fieldIndex(u"LID")));
        const QString name = s->text(static_cast<quint32>(record), s->fieldIndex(u"KATBEZ"));
        const int lid = m_dragLid;
        const int cid = m_dragCid;
        m_dragLid = m_dragCid = 0;
        if (!ChangeConKat(*m_dm, lid, target))
            return;
        rereadDetail(lid); // the link keeps its key: the moved contact stays marked
        if (m_callbacks.ChangeRelatedKontKat)
            m_callbacks.ChangeRelatedKontKat(cid, name);
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("Grid1DBTableView1DragDrop"), &e);
    }
}

void TCatControl::startDrag()
{
    auto* drag = new QDrag(m_detailView);
    drag->setMimeData(createDragData());
    drag->exec(Qt::MoveAction);
}

bool TCatControl::eventFilter(QObject* watched, QEvent* event)
{
    if (!m_katView || !m_detailView) // still being built
        return QMainWindow::eventFilter(watched, event);
    if (watched == m_detailView->viewport()) {
        switch (event->type()) {
        case QEvent::MouseButtonPress: {
            const auto* me = static_cast<QMouseEvent*>(event);
            m_pressed = me->button() == Qt::LeftButton && m_detailView->rowAt(me->position().toPoint()) >= 0;
            m_pressPos = me->position().toPoint();
            break;
        }
        case QEvent::MouseMove: {
            const auto* me = static_cast<QMouseEvent*>(event);
            if (m_pressed && (me->buttons() & Qt::LeftButton)
                && (me->position().toPoint() - m_pressPos).manhattanLength() >= QApplication::startDragDistance()) {
                m_pressed = false;
                startDrag();
                return true;
            }
            break;
        }
        case QEvent::MouseButtonRelease:
            m_pressed = false;
            break;
        default:
            break;
        }
    } else if (watched == m_katView->viewport()) {
        switch (event->type()) {
        case QEvent::DragEnter:
        case QEvent::DragMove: {
            auto* de = static_cast<QDragMoveEvent*>(event);
            if (Grid1DBTableView1DragOver(de->mimeData(), de->position().toPoint()))
                de->acceptProposedAction();
            else
                de->ignore();
            return true;
        }
        case QEvent::Drop: {
            auto* de = static_cast<QDropEvent*>(event);
            Grid1DBTableView1DragDrop(de->mimeData(), de->position().toPoint());
            de->acceptProposedAction();
            return true;
        }
        default:
            break;
        }
    }
    return QMainWindow::eventFilter(watched, event);
}

} // namespace orvanta
