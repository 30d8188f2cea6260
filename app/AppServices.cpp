#include "app/AppServices.h"

#include "phone/AreaCodes.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "platform/ProgramFolder.h"
#include "ui/rtf/RtfReader.h"
#include "ui/texts/UiTexts.h"

#include <QCoreApplication>
#include <QFile>
#include <QTextEdit>
#include <QTranslator>

#include <memory>

namespace orvanta {

namespace {

std::unique_ptr<TvkErrorLog>& errorLogInstance()
{
    static std::unique_ptr<TvkErrorLog> log;
    return log;
}

// German texts for the dialogs and context menus Qt builds itself.
class GermanQtTexts final : public QTranslator {
public:
    using QTranslator::QTranslator;
    [[nodiscard]] bool isEmpty() const override { return false; }
    QString translate(const char* context, const char* sourceText, const char* disambiguation, int n) const override
    {
        Q_UNUSED(context);
        Q_UNUSED(disambiguation);
        Q_UNUSED(n);
        static const QHash<QByteArray, QString> table = {
            {"&Undo", QStringLiteral("&Rückgängig")},
            {"&Redo", QStringLiteral("&Wiederherstellen")},
            {"Cu&t", QStringLiteral("&Ausschneiden")},
            {"&Copy", QStringLiteral("&Kopieren")},
            {"Copy &Link Location", QStringLiteral("&Link-Adresse kopieren")},
            {"&Paste", QStringLiteral("&Einfügen")},
            {"Delete", QStringLiteral("Löschen")},
            {"Select All", QStringLiteral("Alles markieren")},
            {"&Yes", QStringLiteral("&Ja")},
            {"&No", QStringLiteral("&Nein")},
            {"Cancel", QStringLiteral("Abbrechen")},
            {"&OK", QStringLiteral("&OK")},
            {"Close", QStringLiteral("Schließen")},
        };
        const auto it = table.constFind(QByteArray(sourceText));
        return it == table.cend() ? QString() : *it;
    }
};

} // namespace

void createErrorLog()
{
    errorLogInstance() = std::make_unique<TvkErrorLog>(programFolder(), 20, QStringLiteral("OXError.log"));
    setErrorLog(errorLogInstance().get());
}

void freeErrorLog()
{
    setErrorLog(nullptr);
    errorLogInstance().reset();
}

void informationBox(const QString& text)
{
    dialogs().information(text);
}

void warningBox(const QString& text)
{
    dialogs().warning(text);
}

bool askConfirmation(const QString& text)
{
    return dialogs().question(text) == DialogButton::Yes;
}

bool askWarning(const QString& text)
{
    return dialogs().show(DialogKind::Warning, QString(), text, DialogButton::Yes | DialogButton::No, DialogButton::Yes)
        == DialogButton::Yes;
}

void installGermanTexts()
{
    setUiText(UiText::GridNoData, QStringLiteral("<Keine Daten vorhanden>"));
    setUiText(UiText::GridGroupByBox, QStringLiteral("Um nach einer Spalte zu gruppieren, ziehen Sie den Spaltenkopf hierher."));
    setUiText(UiText::NoSelection, QStringLiteral("<keine Auswahl>"));
    setUiText(UiText::EditUndo, QStringLiteral("Rückgängig"));
    setUiText(UiText::EditRedo, QStringLiteral("Wiederherstellen"));
    setUiText(UiText::EditCut, QStringLiteral("Ausschneiden"));
    setUiText(UiText::EditCopy, QStringLiteral("Kopieren"));
    setUiText(UiText::EditPaste, QStringLiteral("Einfügen"));
    setUiText(UiText::EditDelete, QStringLiteral("Löschen"));
    setUiText(UiText::EditSelectAll, QStringLiteral("Alles markieren"));
    setUiText(UiText::CalendarToday, QStringLiteral("Heute"));
    setUiText(UiText::ToolBarAddRemoveButtons, QStringLiteral("Schaltflächen hinzufügen oder entfernen"));
    setUiText(UiText::ToolBarMoreButtons, QStringLiteral("Weitere Schaltflächen"));
    setUiText(UiText::ToolBarReset, QStringLiteral("Symbolleiste zurücksetzen"));
    setUiText(UiText::ToolBarResetQuestion,
              QStringLiteral("Sind Sie sicher, dass Sie die Änderungen an der Symbolleiste '%s' zurücksetzen möchten?"));
    setUiText(UiText::ColorAuto, QStringLiteral("(automatisch)"));
    setUiText(UiText::ColorCustom, QStringLiteral("(individuell)"));
    const char* const colors[] = {"Schwarz", "Braun", "Grün", "Oliv", "Dunkelblau", "Violett", "Blaugrün", "Grau",
                                  "Silber",  "Rot",   "Hellgrün", "Gelb", "Blau", "Rosa", "Türkis", "Weiß"};
    for (int i = 0; i < 16; ++i)
        setUiColorName(i, QString::fromUtf8(colors[i]));

    static GermanQtTexts* translator = nullptr;
    if (!translator && QCoreApplication::instance()) {
        translator = new GermanQtTexts(QCoreApplication::instance());
        QCoreApplication::installTranslator(translator);
    }
}

void loadAreaCodes()
{
    LoadGermanAereaCodes();
    LoadAustriaAereaCodes();
    LoadSwissAereaCodes();
}

void loadCalendarInfo(QTextEdit* box, const QString& path)
{
    box->clear();
    QFile file(path);
    if (!file.exists())
        return;
    if (!file.open(QIODevice::ReadOnly)) {
        logError(QStringLiteral("# Orvanta - kalenderinfo.rtf\r\nDie Datei konnte nicht gelesen werden."));
        return;
    }
    // A damaged file shows what could be read; nothing else depends on it.
    if (!RtfReader::read(file.read(1 << 20), box->document()))
        logError(QStringLiteral("# Orvanta - kalenderinfo.rtf\r\nDie Datei ist beschädigt und wird nur teilweise angezeigt."));
}

} // namespace orvanta
