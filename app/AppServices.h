#pragma once
// The main window's short-hands for the shared services: dialogs and the start-up pieces.
// Failures are reported through reportError / logError of platform/ErrorLog.h.

#include <QString>

#include <exception>

class QEvent;
class QObject;
class QTextEdit;

namespace orvanta {

// Window messages between the program's windows: post queues, send runs at once.
void postAppMessage(QObject* target, int message, qint64 wParam, qint64 lParam);
void sendAppMessage(QObject* target, int message, qint64 wParam, qint64 lParam);
// Reads a window message out of an event; false for any other event.
[[nodiscard]] bool readAppMessage(const QEvent* event, int& message, qint64& wParam, qint64& lParam);

void informationBox(const QString& text);
void warningBox(const QString& text);
// Yes/No questions; true for Yes.
[[nodiscard]] bool askConfirmation(const QString& text);
[[nodiscard]] bool askWarning(const QString& text);

// Start-up pieces owned by the process: the error log and the monitor settings.
void createErrorLog();
void freeErrorLog();
void createMonitorSettings();
void freeMonitorSettings();
class TRufwarteIni;
// The monitor settings read at start-up; nullptr outside the main window's lifetime.
[[nodiscard]] TRufwarteIni* monitorSettings();
// German texts for the dialogs and context menus of the presentation library.
void installGermanTexts();
// Loads the area-code tables of the program folder.
void loadAreaCodes();
// Clears the box and loads the RTF file into it when the file exists; a malformed file is
// reported and leaves the box empty.
void loadCalendarInfo(QTextEdit* box, const QString& path);

} // namespace orvanta
