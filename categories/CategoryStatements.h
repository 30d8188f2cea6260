#pragma once
// The statements the category manager runs on the data module's IBSQL1.

namespace orvanta::katsql {

inline constexpr const char* kInsertKat = "EXECUTE PROCEDURE P_KAT_INSERT (:KID,:KA,:BEM)";
inline constexpr const char* kDeleteKat = "EXECUTE PROCEDURE P_KAT_DELETE (:KID)";
inline constexpr const char* kDeleteRelated = "DELETE FROM CONKAT WHERE LID = :ID";
inline constexpr const char* kChangeConKat = "EXECUTE PROCEDURE P_CHANGE_CONKAT (:CK_ID,:KID)";

} // namespace orvanta::katsql
