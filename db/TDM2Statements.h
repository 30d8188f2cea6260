#pragma once
// The statements the data module gives its queries and lists (db/TDM2.cpp); named here so the
// schema tests prepare exactly the text the program runs.

namespace orvanta::dmsql {

// GetFromNr: the caller's number of one call.
inline constexpr const char* kSelectFromPhone = "SELECT FROMPHONE FROM LOG WHERE LID = :ID";
// ibcds_list / ibcds_card: the contact list and the card view.
inline constexpr const char* kSelectContactList = "select * from V_SELECT_LIST ORDER BY CONTBEZ ASC";
inline constexpr const char* kSelectContactCards = "SELECT * FROM V_SELECT_CARD ORDER BY CONTBEZ ASC";
// kat_list / katdetail: the categories and the contacts of one category.
inline constexpr const char* kSelectCategories = "SELECT * FROM KAT ORDER BY KATBEZ ASC";
inline constexpr const char* kSelectCategoryContacts =
    "SELECT * FROM V_SELECT_CONKAT WHERE KID = :ID ORDER BY CONTBEZ ASC";
// ibcds_log: the whole call log (the log list sets it again after a day view).
inline constexpr const char* kSelectLog = "SELECT * FROM LOG";
// ibcds_numbers: the numbers of one contact.
inline constexpr const char* kSelectContactNumbers = "SELECT * FROM COM\r\nWHERE CID = :param1";

} // namespace orvanta::dmsql
