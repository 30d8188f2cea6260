#pragma once
// Entry points for the note editors, the notes view and the calendar hint box: rich or plain
// text into an editor or document, and RTF files in and out.

#include <QByteArray>
#include <QString>

class QTextDocument;
class QTextEdit;

namespace orvanta {

class RtfText final {
public:
    // Shows RTF or plain text in the editor, cursor at the start, the editor unmodified.
    // Returns false when the input was damaged; what could be read is shown all the same.
    static bool setContent(QTextEdit* edit, const QByteArray& data);
    // The editor's content as RTF.
    [[nodiscard]] static QByteArray content(const QTextEdit& edit);

    // Both throw AppException with a message for the user when the file cannot be read or
    // written. Loading returns false when the content was damaged.
    static bool loadFile(const QString& path, QTextDocument* doc);
    static bool loadFile(const QString& path, QTextEdit* edit);
    static void saveFile(const QString& path, const QTextDocument& doc);

    // Larger files are refused rather than read into memory.
    static constexpr qint64 kMaxFileSize = 64 * 1024 * 1024;

private:
    static QByteArray readFile(const QString& path);
};

} // namespace orvanta
