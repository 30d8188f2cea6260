// The main window's window messages and what it opens into its registries of windows and records.

#include "app/TLogform.h"

#include "app/AppServices.h"
#include "calllog/LogMaintenance.h"
#include "phone/TvkMiniKontakt.h"
#include "platform/AppException.h"
#include "ui/dialogs/BusyCursor.h"
#include "platform/ErrorLog.h"
#include "platform/WindowMessages.h"
#include "ui/frames/ContactListFrame.h"
#include "ui/frames/LogListFrame.h"
#include "ui/statusbar/PanelStatusBar.h"

#include <QAction>
#include <limits>

namespace orvanta {

namespace {

// Window properties the main window sets on the edit windows it creates (the registries set the
// slots).
constexpr const char* kExisting = "existingContact"; // edits a stored contact
constexpr const char* kCallerNumber = "callerNumber";
constexpr const char* kSaveFailed = "saveFailed";

// Out of the task bar (when minimised) and on top.
void bringToFront(QWidget* w)
{
    if (w->isMinimized())
        w->setWindowState((w->windowState() & ~Qt::WindowMinimized) | Qt::WindowActive);
    w->show();
    w->raise();
    w->activateWindow();
}

bool fitsInt(qint64 v)
{
    return v >= std::numeric_limits<int>::min() && v <= std::numeric_limits<int>::max();
}

// Sets a flag for the time of a handler, clearing it however the handler ends.
class BusyScope final {
public:
    explicit BusyScope(bool& flag)
        : m_flag(flag)
    {
        m_flag = true;
    }
    ~BusyScope() { m_flag = false; }
    BusyScope(const BusyScope&) = delete;
    BusyScope& operator=(const BusyScope&) = delete;

private:
    bool& m_flag;
};

} // namespace

bool TLogform::event(QEvent* e)
{
    int message = 0;
    qint64 wParam = 0;
    qint64 lParam = 0;
    if (readAppMessage(e, message, wParam, lParam)) {
        dispatchMessage(message, wParam, lParam);
        return true;
    }
    return QMainWindow::event(e);
}

void TLogform::dispatchMessage(int message, qintptr wParam, qintptr lParam)
{
    if (m_tornDown)
        return;
    switch (message) {
    case WMCLOSECONTACTFORM: WMCLOSECONTACTFORM_(wParam); break;
    case WMSAVECONDATA: WMSAVECONDATA_(wParam, lParam); break;
    case WMLOGINFOCHANGE: WMLOGINFOCHANGE_(wParam, lParam); break;
    case WMSTATUSPANEL: WMSTATUSPANEL_(wParam, lParam); break;
    case WMNEWCONTACT: runIfEnabled(QStringLiteral("_LogFo_ContNew")); break;
    case WMOPENCONTACT: runIfEnabled(QStringLiteral("_LogFo_ContEdit")); break;
    case WMDELETECONTACT: runIfEnabled(QStringLiteral("_LogFo_ContDel")); break;
    case WMCONTACTDATAFROMSCREEN: WMCONTACTDATAFROMSCREEN_(wParam); break;
    case WMCHANGELOGFILTERANDGROUPBUTTONS:
        try {
            syncLogButtons();
        } catch (const std::exception& e) {
            reportError(QStringLiteral("# Orvanta - WMCHANGELOGFILTERANDGROUPBUTTONS"), &e);
        }
        break;
    case WMLOGOPENBEMERKUNG: runIfEnabled(QStringLiteral("_LogFo_OpenLogBemerkung")); break;
    case WMCLOSELOGDETAILFORM: WMCLOSELOGDETAILFORM_(wParam); break;
    case WMDELETELOGITEM: runIfEnabled(QStringLiteral("_LogFo_DelLog")); break;
    case WMBRINGTOFRONT: bringToFront(this); break;
    case WMSEARCHUNCHECKED:
        // A list closed its search panel: the entries that show it are unchecked.
        for (const char* name : {"_LogFo_Search", "_LogFo_LogSearch"})
            action(QString::fromLatin1(name))->setChecked(false);
        break;
    default: break; // WMEXPORTGAUGE, WMOPENCONTACTPERLOG, voice box: no effect
    }
    updateActions();
}

void TLogform::WMLOGINFOCHANGE_(qintptr wParam, qintptr lParam)
{
    BusyScope busy(m_busy);
    try {
        if (lParam != 1)
            m_maintenance->markLogDays(DayMarking::MarksAndShowDay, markContext());
        if (m_logFrame)
            m_logFrame->Refresh_View(fitsInt(wParam) ? static_cast<int>(wParam) : 0);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMLOGINFOCHANGE"), &e);
    }
}

void TLogform::WMSTATUSPANEL_(qintptr wParam, qintptr lParam)
{
    BusyScope busy(m_busy);
    try {
        const qint64 count = std::max<qint64>(0, wParam);
        if (lParam == 0)
            m_statusBar->setPanelText(2, QStringLiteral("Protokolleinträge: ") + QString::number(count));
        else if (lParam == kStatusLogLoading)
            m_statusBar->setPanelText(2, QStringLiteral("Protokolleinträge: ") + QString::number(count)
                                             + QStringLiteral(" (wird geladen …)"));
        else if (lParam == kStatusLogIncomplete)
            m_statusBar->setPanelText(2, QStringLiteral("Protokolleinträge: ") + QString::number(count)
                                             + QStringLiteral(" (unvollständig)"));
        else if (lParam == 1)
            m_statusBar->setPanelText(2, QStringLiteral("Kontakte: ") + QString::number(count));
        else
            m_statusBar->setPanelText(2, QString());
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMSTATUSPANEL"), &e);
    }
}

void TLogform::WMCONTACTDATAFROMSCREEN_(qintptr wParam)
{
    // Only a real log key (above 0, within 32 bits) opens anything.
    if (wParam <= 0 || !fitsInt(wParam))
        return;
    try {
        CreateConDataEdit(0, static_cast<int>(wParam));
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMCONTACTDATAFROMSCREEN"), &e);
    }
}

void TLogform::WMCLOSECONTACTFORM_(qintptr wParam)
{
    try {
        if (fitsInt(wParam))
            m_windows.freeEditWindow(static_cast<int>(wParam));
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMCLOSECONTACTFORM"), &e);
    }
}

void TLogform::WMSAVECONDATA_(qintptr wParam, qintptr lParam)
{
    if (m_windows.contactRecords().isEmpty()) {
        reportError(QStringLiteral("# Orvanta - WMSAVECONDATA\r\nDatentyp ist nicht initialisiert!\r\n"
                                   "Kontaktdaten können nicht gespeichert werden."));
        return;
    }
    const int slot = fitsInt(wParam) ? static_cast<int>(wParam) : -1;
    if (!m_windows.contactRecords().at(slot)) {
        reportError(QStringLiteral("# Orvanta - WMSAVECONDATA\r\nDaten-Item ist nicht initialisiert!\r\n"
                                   "Kontaktdaten können nicht gespeichert werden."));
        return;
    }
    // The window that shows this record learns whether its save failed.
    QWidget* window = m_windows.editWindowOfRecord(slot);
    bool saved = false;
    try {
        saved = m_factories.saveContact && m_factories.saveContact(*this, slot, static_cast<int>(lParam));
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMSAVECONDATA"), &e);
    }
    if (window)
        window->setProperty(kSaveFailed, !saved);
}

void TLogform::WMCLOSELOGDETAILFORM_(qintptr wParam)
{
    try {
        if (fitsInt(wParam))
            m_windows.freeLogDetail(static_cast<int>(wParam));
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMCLOSELOGDETAILFORM"), &e);
    }
}

// ---------------------------------------------------------------------------------------------
// Registries

bool TLogform::IfLogDetailArrayAllFree()
{
    try {
        return m_windows.allLogDetailsFree();
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - IfLogDetailArrayAllFree"), &e);
        return false;
    }
}

bool TLogform::SearchWndAndShowLogDetail(int logKey)
{
    try {
        if (QWidget* w = m_windows.logDetailWindows().at(m_windows.logDetailSlotOf(logKey))) {
            bringToFront(w);
            return true;
        }
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - SearchWndAndShowLogDetail"), &e);
    }
    return false;
}

int TLogform::CreateLogDetailFo(int logKey)
{
    try {
        if (SearchWndAndShowLogDetail(logKey))
            return m_windows.logDetailSlotOf(logKey);
        if (!m_factories.logDetailWindow)
            return -1;
        QWidget* w = m_factories.logDetailWindow(this, m_windows.nextLogDetailSlot(), logKey);
        if (!w)
            return -1;
        const int slot = m_windows.addLogDetail(w, logKey);
        w->show();
        return slot;
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - CreateLogDetailFo"), &e);
        return -1;
    }
}

bool TLogform::IfContactDataArrayExists(int contactKey)
{
    try {
        return m_windows.recordSlotOf(contactKey) >= 0;
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - IfContactDataArrayExists"), &e);
    }
    return false;
}

bool TLogform::SearchWNDAndShow(int contactKey)
{
    try {
        const int recordSlot = m_windows.recordSlotOf(contactKey);
        if (recordSlot < 0)
            return false;
        if (QWidget* w = m_windows.editWindowOfRecord(recordSlot)) {
            bringToFront(w);
            return true;
        }
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - SearchWNDAndShow"), &e);
    }
    return false;
}

int TLogform::CreateConDataEdit(int contactKey, int logKey)
{
    BusyCursor busy;
    if (contactKey != 0 && IfContactDataArrayExists(contactKey)) {
        SearchWNDAndShow(contactKey);
        return -1;
    }
    // The caller's number comes first: a call whose number is already stored at a contact
    // opens no window at all, so nothing is created before the check.
    QString callerNumber;
    if (contactKey == 0 && logKey > 0) {
        if (!m_maintenance->GetFromphoneByLog(logKey, callerNumber))
            return -1;
        const QString n = callerNumber.trimmed();
        if (n.isEmpty() || n == QLatin1String("Nummer unterdrückt") || n == QLatin1String("Unbekannt")) {
            reportError(QStringLiteral("# Orvanta - CreateConDataEdit\r\nTelefonnummer des Anrufers konnte nicht "
                                       "korrekt aus der Datenbank ermittelt werden."));
            return -1;
        }
        if (m_maintenance->CheckOfNumber(callerNumber) != NumberCheck::NotStored)
            return -1;
    }
    if (!m_factories.contactEditWindow)
        return -1;

    auto record = std::make_unique<TvkMiniKontakt>();
    if (contactKey != 0) {
        if (!m_factories.loadContact || !m_factories.loadContact(*this, *record, contactKey))
            return -1;
    }
    const int recordSlot = m_windows.addRecord(std::move(record));
    QWidget* window = nullptr;
    try {
        window = m_factories.contactEditWindow(this, m_windows.nextEditSlot(), recordSlot);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - CreateConDataEdit"), &e);
    }
    if (!window) {
        m_windows.freeRecord(recordSlot);
        return -1;
    }
    window->setProperty(kExisting, contactKey != 0);
    window->setProperty(kCallerNumber, callerNumber);
    window->setProperty(kSaveFailed, false);
    const int editSlot = m_windows.addEditWindow(window, recordSlot);
    window->show();
    return editSlot;
}

} // namespace orvanta
