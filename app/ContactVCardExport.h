#pragma once
// "Als vCard exportieren..." in the contact list's context menu: the contacts the list shows
// (letter filter and search respected, in the list's order) written as one vCard 4.0 file.

#include <QString>

#include <functional>

class QWidget;

namespace orvanta {

class TDM2;
class Tcontactlistframe;

// Adds the entry to the frame's context menu, after "Löschen".
void addVCardExport(Tcontactlistframe& frame, TDM2* dm);

// Writes the shown contacts to path; returns how many, or -1 after an error message.
int exportShownContacts(Tcontactlistframe& frame, TDM2& dm, const QString& path);

// Test seam: the file choice instead of a save dialog (empty: cancelled).
void setVCardFileChooser(std::function<QString(QWidget* parent)> chooser);

} // namespace orvanta
