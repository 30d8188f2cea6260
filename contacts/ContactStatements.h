#pragma once
// The statements the contact list, its summary and the contact deletion run; named here so the
// tests prepare exactly the text the program runs. The list and card queries themselves are the
// data module's (dmsql::kSelectContactList, dmsql::kSelectContactCards).

namespace orvanta::contactsql {

// Summary: one contact with address and category, its numbers, its e-mail addresses. Each is
// two lines, as the detail query has always been given them.
inline constexpr const char* kSelectDetail = "SELECT * FROM V_SELECT_DETAIL\r\nWHERE LID = :id";
inline constexpr const char* kSelectNumbers = "SELECT * FROM COM\r\nWHERE CID = :id";
inline constexpr const char* kSelectMails = "SELECT * FROM E_MAIL\r\nWHERE CID = :id";
// Notes window: the rich-text note of one contact.
inline constexpr const char* kSelectNote = "SELECT * FROM V_SELECT_NOTIZ\r\nWHERE LID = :ID";
// Deleting a contact with its numbers, addresses and category link.
inline constexpr const char* kDeleteContact = "EXECUTE PROCEDURE P_CONT_DELETE(:D_LID)";
// Saving a contact: the contact row with address and category, then each number and e-mail entry
// by its change state.
inline constexpr const char* kInsertContact =
    "EXECUTE PROCEDURE P_CONT_INSERT(:ANR, :VNA, :NA, :FA, :TIT, :CONTB, :WEB, :ABT, :KATB, :ST, :PL, :OT, "
    ":ZUSA, :L, :BUND, :TEXT)";
inline constexpr const char* kEditContact =
    "EXECUTE PROCEDURE P_CONT_EDIT(:E_LID, :ANR, :VNA, :NA, :FA, :TIT, :CONTB, :WEB, :ABT, :KATB, :ST, :PL, "
    ":OT, :ZUSA, :L, :BUND, :TEXT)";
inline constexpr const char* kSyncNumber =
    "EXECUTE PROCEDURE P_COM_SYNCHRONIZE(:L, :C, :KB, :LC, :V, :N, :VN, :LCVN, :BEM, :AURE, :NOF, :STAT)";
inline constexpr const char* kSyncMail =
    "EXECUTE PROCEDURE P_MAIL_SYNCHRONIZE(:LID, :CID, :MAILADDR, :BEMERK, :STATUS)";

} // namespace orvanta::contactsql
