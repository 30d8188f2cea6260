#pragma once
// Editing contacts from the main window: the contact edit windows it opens (new, existing, from a
// caller), loading and saving their records, linking the log of a caller's number to the contact
// made of it, and telling open edit windows about category changes.

#include <QString>

namespace orvanta {

class TLogform;

void registerContactEditFeature(TLogform& mainWindow);

// The category manager moved the contact to another category: its open edit window shows it.
void ChangeRelatedKontKat(TLogform& mainWindow, int contactKey, const QString& katbez);
// The category manager renamed a category (or deleted it: empty new name): every open edit window
// with that category shows the new name.
void HasRenameKatBez(TLogform& mainWindow, const QString& oldName, const QString& newName);

} // namespace orvanta
