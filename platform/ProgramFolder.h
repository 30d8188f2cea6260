#pragma once
// The program folder: where the executable lives and where every settings file is looked up
// under a bare name. Tests point it at a temporary folder.

#include <QString>

namespace orvanta {

// The folder with a trailing '/'.
[[nodiscard]] QString programFolder();
// Overrides the folder (a trailing '/' is added when missing); an empty path restores the
// folder of the running executable.
void setProgramFolder(const QString& folder);
// programFolder() + bareName.
[[nodiscard]] QString programFile(const QString& bareName);

} // namespace orvanta
