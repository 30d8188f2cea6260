#pragma once
// The statements the call log runs (log list, detail window, log maintenance); named here so the
// schema tests prepare exactly the text the program runs. The whole log, "SELECT * FROM LOG", is
// the data module's (dmsql::kSelectLog).

namespace orvanta::logsql {

// Log list, whole log: the newest calls first (a descending index serves them), so the first
// rows that arrive are the ones on screen; after a change only the calls above the highest key
// held, while the counters the triggers keep show no other change.
inline constexpr const char* kLogFetchOrder = "TSDATE DESC, TSTIME DESC";
inline constexpr const char* kSelectLogAbove = "SELECT * FROM LOG WHERE LID > :LID";
inline constexpr const char* kSelectLogCounters =
    "SELECT GEN_ID(GEN_LOG_INSERTS, 0), GEN_ID(GEN_LOG_CHANGES, 0) FROM RDB$DATABASE";
// Log list, day view.
inline constexpr const char* kSelectLogOfDay = "SELECT * FROM LOG WHERE TSDATE = :TSD";
// Detail window: one call, and its remark.
inline constexpr const char* kSelectLogRecord = "SELECT * FROM LOG WHERE LID = :ID";
inline constexpr const char* kUpdateRemark = "UPDATE LOG SET BEMERK = :BEM WHERE LID = :ID";
// Log maintenance: the days that have calls, deleting a call or a day.
inline constexpr const char* kSelectLogDays = "SELECT DISTINCT TSDATE FROM LOG";
inline constexpr const char* kDeleteLogRecord = "DELETE FROM LOG WHERE LID = :ID";
inline constexpr const char* kDeleteLogDay = "DELETE FROM LOG WHERE TSDATE = :DT";
// Log maintenance: the contact a number is stored at (outputs 1 label, 2 name, 3 key), how many
// calls came from a number, and linking those calls to a contact.
inline constexpr const char* kSelectLogContact = "EXECUTE PROCEDURE P_SELECT_LOG_CONTACT(:PHONENR)";
inline constexpr const char* kCountOfNumber = "EXECUTE PROCEDURE P_GET_COUNT_OF_NUMBER(:PN)";
inline constexpr const char* kRelinkLog =
    "UPDATE LOG SET FROMBEZ = :FB,FROMANSCHLUSS = :FA,CID = :C WHERE (FROMPHONE = :FP)or(FROMSUBB = :FS)";

} // namespace orvanta::logsql
