// The main window's window messages and its registries of open windows and records.

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

// Window properties the main window sets on the edit and detail windows it creates.
constexpr const char* kTag = "tag";                  // slot in the window's registry
constexpr const char* kRecordSlot = "recordSlot";    // slot of the edit window's contact record
constexpr const char* kExisting = "existingContact"; // edits a stored contact
constexpr const char* kCallerNumber = "callerNumber";
constexpr const char* kSaveFailed = "saveFailed";
constexpr const char* kLogKey = "logKey";

void bringToFront(QWidget* w)
{
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
    default: break; // WMEXPORTGAUGE, WMSEARCHUNCHECKED, WMOPENCONTACTPERLOG, voice box: no effect
    }
    updateActions();
}

void TLogform::WMLOGINFOCHANGE_(qintptr wParam, qintptr lParam)
{
    BusyScope busy(m_busy);
    try {
        if (lParam != 1)
            m_maintenance->markLogDays(1, markContext());
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
            freeEditWindow(static_cast<int>(wParam));
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMCLOSECONTACTFORM"), &e);
    }
}

void TLogform::freeEditWindow(int editSlot)
{
    QWidget* w = m_editWindows.at(editSlot);
    if (!w)
        return;
    const QVariant recordSlot = w->property(kRecordSlot);
    if (recordSlot.isValid())
        m_contactRecords.free(recordSlot.toInt());
    m_editWindows.free(editSlot);
}

void TLogform::WMSAVECONDATA_(qintptr wParam, qintptr lParam)
{
    if (m_contactRecords.isEmpty()) {
        reportError(QStringLiteral("# Orvanta - WMSAVECONDATA\r\nDatentyp ist nicht initialisiert!\r\n"
                                   "Kontaktdaten können nicht gespeichert werden."));
        return;
    }
    const int slot = fitsInt(wParam) ? static_cast<int>(wParam) : -1;
    if (!m_contactRecords.at(slot)) {
        reportError(QStringLiteral("# Orvanta - WMSAVECONDATA\r\nDaten-Item ist nicht initialisiert!\r\n"
                                   "Kontaktdaten können nicht gespeichert werden."));
        return;
    }
    // The window that shows this record learns whether its save failed.
    QWidget* window = nullptr;
    for (int i = 0; i < m_editWindows.size(); ++i) {
        QWidget* w = m_editWindows.at(i);
        if (w && w->property(kRecordSlot).toInt() == slot)
            window = w;
    }
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
            m_logDetailWindows.free(static_cast<int>(wParam));
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - WMCLOSELOGDETAILFORM"), &e);
    }
}

// ---------------------------------------------------------------------------------------------
// Registries

bool TLogform::IfLogDetailArrayAllFree()
{
    try {
        return m_logDetailWindows.allFree();
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - IfLogDetailArrayAllFree"), &e);
        return false;
    }
}

bool TLogform::SearchWndAndShowLogDetail(int logKey)
{
    try {
        for (int i = 0; i < m_logDetailWindows.size(); ++i) {
            QWidget* w = m_logDetailWindows.at(i);
            if (w && w->property(kLogKey).toInt() == logKey) {
                bringToFront(w);
                return true;
            }
        }
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - SearchWndAndShowLogDetail"), &e);
    }
    return false;
}

int TLogform::CreateLogDetailFo(int logKey)
{
    try {
        if (SearchWndAndShowLogDetail(logKey)) {
            for (int i = 0; i < m_logDetailWindows.size(); ++i)
                if (QWidget* w = m_logDetailWindows.at(i); w && w->property(kLogKey).toInt() == logKey)
                    return i;
        }
        if (!m_factories.logDetailWindow)
            return -1;
        const int free = m_logDetailWindows.firstFree();
        const int slot = free >= 0 ? free : m_logDetailWindows.size();
        QWidget* w = m_factories.logDetailWindow(this, slot, logKey);
        if (!w)
            return -1;
        w->setProperty(kTag, slot);
        w->setProperty(kLogKey, logKey);
        m_logDetailWindows.take(w);
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
        for (int i = 0; i < m_contactRecords.size(); ++i)
            if (const TvkMiniKontakt* r = m_contactRecords.at(i); r && r->LID() == contactKey)
                return true;
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - IfContactDataArrayExists"), &e);
    }
    return false;
}

bool TLogform::SearchWNDAndShow(int contactKey)
{
    try {
        int recordSlot = -1;
        for (int i = 0; i < m_contactRecords.size() && recordSlot < 0; ++i)
            if (const TvkMiniKontakt* r = m_contactRecords.at(i); r && r->LID() == contactKey)
                recordSlot = i;
        if (recordSlot < 0)
            return false;
        for (int i = 0; i < m_editWindows.size(); ++i) {
            QWidget* w = m_editWindows.at(i);
            if (w && w->property(kRecordSlot).toInt() == recordSlot) {
                bringToFront(w);
                return true;
            }
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
        if (m_maintenance->CheckOfNumber(callerNumber) != 0)
            return -1;
    }
    if (!m_factories.contactEditWindow)
        return -1;

    auto record = std::make_unique<TvkMiniKontakt>();
    if (contactKey != 0) {
        if (!m_factories.loadContact || !m_factories.loadContact(*this, *record, contactKey))
            return -1;
    }
    const int recordSlot = m_contactRecords.take(std::move(record));
    const int free = m_editWindows.firstFree();
    const int editSlot = free >= 0 ? free : m_editWindows.size();
    QWidget* window = nullptr;
    try {
        window = m_factories.contactEditWindow(this, editSlot, recordSlot);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# Orvanta - CreateConDataEdit"), &e);
    }
    if (!window) {
        m_contactRecords.free(recordSlot);
        return -1;
    }
    window->setProperty(kTag, editSlot);
    window->setProperty(kRecordSlot, recordSlot);
    window->setProperty(kExisting, contactKey != 0);
    window->setProperty(kCallerNumber, callerNumber);
    window->setProperty(kSaveFailed, false);
    m_editWindows.take(window);
    window->show();
    return editSlot;
}

} // namespace orvanta
