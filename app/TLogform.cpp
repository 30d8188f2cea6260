#include "app/TLogform.h"

#include "app/AppServices.h"
#include "platform/ContactSwitch.h"
#include "platform/MonitorLink.h"
#include "app/ProgramLauncher.h"
#include "calllog/LogMaintenance.h"
#include "platform/AppException.h"
#include "ui/dialogs/BusyCursor.h"
#include "platform/Clock.h"
#include "platform/ErrorLog.h"
#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"
#include "platform/WindowMessages.h"
#include "ui/calendar/PlannerCalendar.h"
#include "ui/frames/ContactListFrame.h"
#include "ui/frames/LogListFrame.h"
#include "ui/navbar/AdvNavBar.h"
#include "ui/scheme/ColorScheme.h"
#include "ui/statusbar/PanelStatusBar.h"

#include <QButtonGroup>
#include <QCheckBox>
#include <QCloseEvent>
#include <QLabel>
#include <QMenuBar>
#include <QRadioButton>
#include <QScreen>
#include <QSplitter>
#include <QTextEdit>
#include <QTimer>
#include <QToolBar>
#include <QVBoxLayout>

namespace orvanta {

namespace {

QLabel* sectionLabel(const QString& text, const QString& name, QWidget* parent)
{
    auto* label = new QLabel(text, parent);
    label->setObjectName(name);
    QFont f = label->font();
    f.setBold(true);
    label->setFont(f);
    return label;
}

} // namespace

TLogform::TLogform(TDM2* dm, const QStringList& parameters, const std::vector<MainWindowFeature>& features,
                   QWidget* parent)
    : QMainWindow(parent)
    , m_dm(dm)
    , m_actions(this)
{
    setObjectName(QStringLiteral("TLogform"));
    setWindowTitle(QStringLiteral("Orvanta"));
    setMinimumSize(730, 530);
    // The log's columns need room: take most of the screen, never less than the classic size.
    QSize size(922, 640);
    if (const QScreen* screen = QGuiApplication::primaryScreen()) {
        const QSize avail = screen->availableGeometry().size();
        size = size.expandedTo(avail * 0.85).boundedTo(avail.expandedTo(minimumSize()));
    }
    resize(size);

    m_maintenance = std::make_unique<LogMaintenance>(dm);
    m_monitor = std::make_unique<MonitorLink>(this);
    m_launcher = new ProgramLauncher(this);
    // The import program changes contacts: reload the list when it has finished.
    connect(m_launcher, &ProgramLauncher::finishedWaiting, this, [this] {
        if (m_contactFrame)
            m_contactFrame->Refresh_View(0);
    });

    buildLayout();
    buildActions();
    buildMenusAndBars();
    for (const MainWindowFeature& registerFeature : features)
        registerFeature(*this);

    m_t1 = new QTimer(this);
    m_t1->setObjectName(QStringLiteral("T1"));
    m_t1->setInterval(1000);
    connect(m_t1, &QTimer::timeout, this, [this] {
        m_t1->stop();
        close();
    });
    m_updateTimer = new QTimer(this);
    m_updateTimer->setInterval(250);
    connect(m_updateTimer, &QTimer::timeout, this, &TLogform::updateActions);
    m_monitorTimer = new QTimer(this);
    m_monitorTimer->setInterval(1000);
    connect(m_monitorTimer, &QTimer::timeout, this, &TLogform::refreshMonitorState);

    FormCreate(parameters);
}

TLogform::~TLogform()
{
    tearDown();
}

// ---------------------------------------------------------------------------------------------
// Layout

void TLogform::buildLayout()
{
    auto* central = new QWidget(this);
    central->setObjectName(QStringLiteral("centralWidget"));
    auto* layout = new QVBoxLayout(central);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);

    m_p3 = new QWidget(central);
    m_p3->setObjectName(QStringLiteral("P3"));
    m_p3->setFixedHeight(4);
    m_p3->setAutoFillBackground(true);

    m_splitter = new QSplitter(Qt::Horizontal, central);
    m_splitter->setObjectName(QStringLiteral("RzSplitter1"));
    m_splitter->setChildrenCollapsible(false);
    m_splitter->setHandleWidth(5);
    m_splitter->setAutoFillBackground(true);

    m_navBar = new AdvNavBar(m_splitter);
    m_navBar->setObjectName(QStringLiteral("AdvNavBar1"));
    m_navBar->setMinimumWidth(190);

    // Tab order: 0 "Kontakte", 1 "Protokoll per Kalender", 2 "Protokoll".
    m_panelContacts = new AdvNavBarPanel(QStringLiteral("Kontakte"));
    m_panelContacts->setObjectName(QStringLiteral("AdvNavBarPanel3"));
    m_panelCalendar = new AdvNavBarPanel(QStringLiteral("Protokoll per Kalender"));
    m_panelCalendar->setObjectName(QStringLiteral("AdvNavBarPanel2"));
    m_panelLog = new AdvNavBarPanel(QStringLiteral("Protokoll"));
    m_panelLog->setObjectName(QStringLiteral("AdvNavBarPanel1"));
    buildContactsPanel(m_panelContacts);
    buildCalendarPanel(m_panelCalendar);
    buildLogPanel(m_panelLog);
    m_navBar->addPanel(m_panelContacts);
    m_navBar->addPanel(m_panelCalendar);
    m_navBar->addPanel(m_panelLog);
    connect(m_navBar, &AdvNavBar::changed, this, [this](int) { AdvNavBar1Change(); });

    m_p1 = new QWidget(m_splitter);
    m_p1->setObjectName(QStringLiteral("P1"));
    auto* hostLayout = new QVBoxLayout(m_p1);
    hostLayout->setContentsMargins(0, 0, 0, 0);
    hostLayout->setSpacing(0);

    m_splitter->addWidget(m_navBar);
    m_splitter->addWidget(m_p1);
    m_splitter->setStretchFactor(0, 0);
    m_splitter->setStretchFactor(1, 1);
    m_splitter->setSizes({215, 922 - 215});

    m_p4 = new QWidget(central);
    m_p4->setObjectName(QStringLiteral("P4"));
    m_p4->setFixedHeight(4);
    m_p4->setAutoFillBackground(true);

    layout->addWidget(m_p3);
    layout->addWidget(m_splitter, 1);
    layout->addWidget(m_p4);
    setCentralWidget(central);

    // 0 version text, 1 keyboard state, 2 count text, 3 "Freeware", 4 empty.
    m_statusBar = new PanelStatusBar({220, 60, 200, 80, 0}, this);
    m_statusBar->setObjectName(QStringLiteral("dxStatusBar1"));
    setStatusBar(m_statusBar);
}

void TLogform::buildContactsPanel(AdvNavBarPanel* panel)
{
    auto* layout = new QVBoxLayout(panel);
    layout->setContentsMargins(10, 10, 10, 10);
    layout->addWidget(sectionLabel(QStringLiteral("Ansicht:"), QStringLiteral("lblKontakteAnsicht"), panel));
    auto* views = new QButtonGroup(panel);
    const QStringList viewCaptions{QStringLiteral("Liste"), QStringLiteral("Adresskarten")};
    for (int i = 1; i <= 2; ++i) {
        auto* rb = new QRadioButton(viewCaptions[i - 1], panel);
        rb->setObjectName(QStringLiteral("rzrb%1").arg(i));
        rb->setProperty("tag", i);
        views->addButton(rb);
        layout->addWidget(rb);
        m_rzrb[i] = rb;
        connect(rb, &QRadioButton::clicked, this, [this, i] { contactViewClicked(i); });
    }
    layout->addSpacing(12);
    layout->addWidget(sectionLabel(QStringLiteral("Gruppieren nach:"), QStringLiteral("lblKontakteGruppe"), panel));
    const QStringList groupCaptions{QStringLiteral("ohne Gruppierung"), QStringLiteral("Kategorie"),
                                    QStringLiteral("PLZ"), QStringLiteral("Ort")};
    for (int i = 1; i <= 4; ++i) {
        auto* cb = new QCheckBox(groupCaptions[i - 1], panel);
        cb->setObjectName(QStringLiteral("rzcb%1").arg(i));
        cb->setProperty("tag", i - 1);
        layout->addWidget(cb);
        m_rzcb[i] = cb;
        connect(cb, &QCheckBox::clicked, this, [this, cb] { contactGroupClicked(cb); });
    }
    layout->addStretch(1);
    m_rzrb[1]->setChecked(true);
    m_rzcb[1]->setChecked(true);
}

void TLogform::buildCalendarPanel(AdvNavBarPanel* panel)
{
    auto* layout = new QVBoxLayout(panel);
    layout->setContentsMargins(6, 6, 6, 6);
    m_calendar = new PlannerCalendar(panel);
    m_calendar->setObjectName(QStringLiteral("PC1"));
    layout->addWidget(m_calendar);
    connect(m_calendar, &PlannerCalendar::daySelected, this, &TLogform::PC1DaySelected);
    layout->addSpacing(8);
    layout->addWidget(sectionLabel(QStringLiteral("Hinweis:"), QStringLiteral("lblHinweis"), panel));
    m_rzre1 = new QTextEdit(panel);
    m_rzre1->setObjectName(QStringLiteral("rzre1"));
    m_rzre1->setReadOnly(true);
    m_rzre1->setFrameShape(QFrame::NoFrame);
    layout->addWidget(m_rzre1, 1);
}

void TLogform::buildLogPanel(AdvNavBarPanel* panel)
{
    auto* layout = new QVBoxLayout(panel);
    layout->setContentsMargins(10, 10, 10, 10);
    layout->addWidget(sectionLabel(QStringLiteral("Filter:"), QStringLiteral("lblProtokollFilter"), panel));
    auto* filters = new QButtonGroup(panel);
    const QStringList filterCaptions{QStringLiteral("ohne"), QStringLiteral("Heute"), QStringLiteral("diese Woche"),
                                     QStringLiteral("dieser Monat")};
    for (int i = 3; i <= 6; ++i) {
        auto* rb = new QRadioButton(filterCaptions[i - 3], panel);
        rb->setObjectName(QStringLiteral("rzrb%1").arg(i));
        rb->setProperty("tag", i - 3);
        filters->addButton(rb);
        layout->addWidget(rb);
        m_rzrb[i] = rb;
        connect(rb, &QRadioButton::clicked, this, [this, i] { logFilterClicked(i - 3); });
    }
    layout->addSpacing(12);
    layout->addWidget(sectionLabel(QStringLiteral("Gruppieren nach:"), QStringLiteral("lblProtokollGruppe"), panel));
    // Tags 5..10; "Verbindung" (10) stands above "individuell" (9).
    const struct {
        int number;
        const char* caption;
    } boxes[] = {{5, "ohne Gruppierung"}, {6, "Datum"}, {7, "Anrufer"}, {8, "An"}, {10, "Verbindung"}, {9, "individuell"}};
    for (const auto& b : boxes) {
        auto* cb = new QCheckBox(QString::fromUtf8(b.caption), panel);
        cb->setObjectName(QStringLiteral("rzcb%1").arg(b.number));
        cb->setProperty("tag", b.number);
        layout->addWidget(cb);
        m_rzcb[b.number] = cb;
        connect(cb, &QCheckBox::clicked, this, [this, cb] { logGroupClicked(cb); });
    }
    layout->addStretch(1);
    m_rzrb[3]->setChecked(true);
    m_rzcb[5]->setChecked(true);
}

// ---------------------------------------------------------------------------------------------
// Creation, shown, closing

void TLogform::FormCreate(const QStringList& parameters)
{
    installGermanTexts();
    m_grouping = false;
    m_startLogId = 0;
    createErrorLog();
    createMonitorSettings();
    m_launcher->setStartFolder(programFolder());

    m_calendar->setDate(Clock::today());

    // Colour scheme: "OScheme", section "AppColor", key "Value"; default 2, anything else is 2.
    applyColorScheme(loadAppColorScheme());

    // The navigation panel last shown: 2 calendar, 3 contacts, anything else the log.
    try {
        const QString path = programFile(QStringLiteral("VStore"));
        int ap = 1;
        if (QFileInfo::exists(path)) {
            IniFile store;
            if (!store.load(path))
                throw AppException(QStringLiteral("Die Datei \"%1\" kann nicht gelesen werden.").arg(path));
            ap = store.readInteger(QStringLiteral("Level_GV"), QStringLiteral("AP"), 1);
        }
        m_navBar->setActivePanel(ap == 2 ? m_panelCalendar : ap == 3 ? m_panelContacts : m_panelLog);
    } catch (const std::exception& e) {
        m_navBar->setActivePanel(m_panelLog);
        reportError(QStringLiteral("# GetActivePanel"), &e);
    }

    if (!m_maintenance->markLogDays(DayMarking::MarksOnly, markContext()))
        m_navBar->setEnabled(false);

    m_busy = false;

    m_rzre1->clear();
    loadCalendarInfo(m_rzre1, programFile(QStringLiteral("kalenderinfo.rtf")));

    restoreBars();
    loadAreaCodes();
    readCommandLine(parameters);

    for (const char* name : {"_LogFo_PlayVBItem", "_LogFo_ContCall", "_LogFo_AttachToContact",
                             "_LogFo_lf_OpenContactFromLog", "_LogFo_LogSearch", "_LogFo_Search"})
        action(QString::fromLatin1(name))->setVisible(false);

    m_monitor->startListening(this);
    refreshMonitorState();
    m_updateTimer->start();
    m_monitorTimer->start();
}

void TLogform::readCommandLine(const QStringList& parameters)
{
    const ContactSwitch co = readContactSwitch(parameters);
    if (!co.present)
        return;
    if (!co.valid) {
        const AppException e(QStringLiteral("'%1' ist kein gültiger Integerwert").arg(parameters.first().mid(4)));
        reportError(QStringLiteral("Übergabeparameter ist nicht korrekt!"), &e);
        m_startLogId = 0;
        return;
    }
    m_startLogId = co.logId;
}

void TLogform::showEvent(QShowEvent* e)
{
    QMainWindow::showEvent(e);
    if (!m_shown) {
        m_shown = true;
        FormShow();
    }
}

void TLogform::FormShow()
{
    m_statusBar->setPanelText(0, QStringLiteral("Modulversion: ") + QStringLiteral(ORVANTA_VERSION));
    m_statusBar->setPanelText(3, QStringLiteral("Freeware"));
    if (m_startLogId > 0)
        postAppMessage(this, WMCONTACTDATAFROMSCREEN, m_startLogId, 0);
    AdvNavBar1Change();
}

void TLogform::closeEvent(QCloseEvent* e)
{
    if (m_busy) {
        // A close asked for during a refresh happens as soon as the refresh is over.
        e->ignore();
        BusyCursor::setHourglass();
        m_t1->start();
        return;
    }
    BusyCursor::resetCursor();
    tearDown();
    e->accept();
}

void TLogform::tearDown()
{
    if (m_tornDown)
        return;
    m_tornDown = true;
    m_actions.freeze();
    m_updateTimer->stop();
    m_monitorTimer->stop();
    m_t1->stop();

    {
        const int tab = m_navBar->activeTabIndex();
        IniFile store(programFile(QStringLiteral("VStore")));
        store.setPath(programFile(QStringLiteral("VStore")));
        store.writeInteger(QStringLiteral("Level_GV"), QStringLiteral("AP"), tab == 0 ? 3 : tab == 1 ? 2 : 1);
        (void)store.save(); // a write failure is ignored
    }
    freeFrames();
    QCoreApplication::sendPostedEvents(nullptr, 0);
    m_windows.clear();
    saveBars();
    m_monitor->stopListening();
    freeMonitorSettings();
    freeErrorLog();
}

// ---------------------------------------------------------------------------------------------
// Colour scheme and bars

void TLogform::applyColorScheme(int scheme)
{
    const MainWindowColors c = mainWindowColors(scheme);
    m_navBar->setStyleIndex(c.navBarStyle);
    for (QWidget* w : {m_p3, m_p4, static_cast<QWidget*>(m_splitter)}) {
        QPalette pal = w->palette();
        pal.setColor(QPalette::Window, c.panels);
        w->setPalette(pal);
    }
    m_calendar->setColors(c.gradientStart, c.gradientEnd, c.gradientEnd);
    for (QWidget* w : {static_cast<QWidget*>(m_rzrb[1]), static_cast<QWidget*>(m_rzrb[2]),
                       static_cast<QWidget*>(m_rzcb[1]), static_cast<QWidget*>(m_rzcb[2]),
                       static_cast<QWidget*>(m_rzcb[3]), static_cast<QWidget*>(m_rzcb[4])}) {
        QPalette pal = w->palette();
        pal.setColor(QPalette::WindowText, c.accent);
        w->setPalette(pal);
    }
    const QString bar = QStringLiteral("QToolBar { background: %1; border: none; } QStatusBar { background: %1; }")
                            .arg(c.panels.name());
    setStyleSheet(bar);
}

void TLogform::restoreBars()
{
    // The layout store is the tool-bar state of the window, Base64 in an INI value; a corrupt
    // store leaves the designed layout.
    const IniFile store(programFile(QStringLiteral("BarStore")));
    const QByteArray state = QByteArray::fromBase64(
        store.readString(QStringLiteral("BarStore"), QStringLiteral("State")).toLatin1());
    if (!state.isEmpty() && !restoreState(state, 1)) {
        for (QToolBar* tb : m_toolBars)
            tb->setVisible(true);
    }
    wrapToolBars();
}

void TLogform::wrapToolBars()
{
    // The bars at the top fill a row as far as they fit and go on in the next, so that no button
    // disappears behind a bar's "»" while the window has room for two rows.
    const int available = width();
    int used = 0;
    for (QToolBar* tb : m_toolBars) {
        if (toolBarArea(tb) != Qt::TopToolBarArea || tb->isHidden())
            continue;
        const int needed = tb->sizeHint().width() + 4; // the gap between two bars
        const bool breakHere = used > 0 && used + needed > available;
        if (breakHere != toolBarBreak(tb)) {
            if (breakHere)
                insertToolBarBreak(tb);
            else
                removeToolBarBreak(tb);
        }
        used = breakHere ? needed : used + needed;
    }
}

void TLogform::resizeEvent(QResizeEvent* e)
{
    QMainWindow::resizeEvent(e);
    wrapToolBars();
}

void TLogform::saveBars()
{
    // The contact edit windows keep their note tool bars in the same file.
    IniFile store(programFile(QStringLiteral("BarStore")));
    store.setPath(programFile(QStringLiteral("BarStore")));
    store.writeString(QStringLiteral("BarStore"), QStringLiteral("State"),
                      QString::fromLatin1(saveState(1).toBase64()));
    (void)store.save();
}

} // namespace orvanta
