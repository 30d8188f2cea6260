#pragma once
// The main window's operations on the call log: marking the calendar days that have entries,
// deleting one record or a whole day, finding a call's caller number, and linking the log
// records of a number to a contact. All run on the data module's shared statements; the day
// marking and the deletions hold one process-wide lock so they never overlap.

#include <QDate>
#include <QString>

#include <mutex>

class QObject;

namespace orvanta {

class LogListFrame;
class PlannerCalendar;
class TDM2;

// What the day marking works on: the calendar, the hosted log list (may be null), and whether
// the calendar view ("Protokoll per Kalender") is the one shown.
struct LogMarkContext {
    PlannerCalendar* calendar = nullptr;
    LogListFrame* frame = nullptr;
    bool calendarViewShown = false;
};

// What the day marking does besides marking: nothing, or bring the log list to a day with calls.
enum class DayMarking { MarksOnly, MarksAndShowDay };

// The outcome of checking a caller's number before a contact is made from it.
enum class NumberCheck {
    NotStored,    // no contact has the number: go on making one
    Stored,       // a contact has it; the user was asked whether to link the calls
    Failed,       // the check or the relinking failed (reported)
};

class LogMaintenance final {
public:
    // dm may be null: every operation then reports the missing connection.
    explicit LogMaintenance(TDM2* dm);

    [[nodiscard]] static std::recursive_mutex& processLock();

    // Fills the calendar's day marks ("Protokoll vom dd.mm.yyyy").
    bool gettinglogdates(PlannerCalendar& calendar);
    // MarksAndShowDay: then moves calendar and log list to a day with entries.
    bool markLogDays(DayMarking mode, const LogMarkContext& context);

    // mainWindow receives WMUPDATEVOICEBOXGRID after a deletion.
    bool DeleteLogItem(int lid, QObject* mainWindow);
    bool DeleteLogDay(QDate day, QObject* mainWindow);

    bool GetFromphoneByLog(int lid, QString& number);
    NumberCheck CheckOfNumber(const QString& number);
    bool LogCheckOfNumber(const QString& number);
    bool LogbuchAnpassen(const QString& number, const QString& numberLabel, int contactKey, const QString& contactName);

private:
    bool deleteWhere(const QString& sql, const QString& param, const QVariant& value, const QString& label,
                     QObject* mainWindow);

    TDM2* m_dm;
};

} // namespace orvanta
