#pragma once
// The summary of one contact under the contact list: its designation and category, the contact
// and address columns side by side, its numbers and its e-mail addresses, as the mark-up the
// summary panel renders (ui/markup). Values go in as the database holds them; the panel shows
// tags it knows and text otherwise, and its anchors only report their href.

#include <QString>
#include <QStringList>

namespace orvanta {

class MarkupPanel;
class TDM2;

// What the panel shows when no contact is focused (and when it is created).
inline const QString kEmptySummary = QStringLiteral("<BR>  <IMG src=\"idx:0\" align=\"middle\">");

// The summary's lines for the contact lid: the empty summary for lid <= 0 (without touching the
// database) or a contact that does not exist. Reads through the data module's detail query in
// the detail transaction and leaves the query closed, the transaction committed; a database failure is reported
// ("# _getHTMLcontactdata - SetHTMLStaticText") and yields the empty summary.
[[nodiscard]] QStringList contactSummaryLines(TDM2& dm, int lid);

// Puts the summary of lid into the panel (nothing when there is no panel).
void SetHTMLStaticText(MarkupPanel* panel, TDM2& dm, int lid);

} // namespace orvanta
