#include "ui/rtf/RtfText.h"

#include "platform/AppException.h"
#include "ui/rtf/RtfReader.h"
#include "ui/rtf/RtfWriter.h"

#include <QDir>
#include <QFile>
#include <QSaveFile>
#include <QTextCursor>
#include <QTextDocument>
#include <QTextEdit>

namespace orvanta {

bool RtfText::setContent(QTextEdit* edit, const QByteArray& data)
{
    if (!edit)
        return false;
    const bool complete = RtfReader::read(data, edit->document());
    edit->moveCursor(QTextCursor::Start);
    edit->document()->setModified(false);
    return complete;
}

QByteArray RtfText::content(const QTextEdit& edit)
{
    return RtfWriter::write(*edit.document());
}

QByteArray RtfText::readFile(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        throw AppException(QStringLiteral("Die Datei \"%1\" konnte nicht geöffnet werden: %2")
                               .arg(QDir::toNativeSeparators(path), file.errorString()));
    }
    if (file.size() > kMaxFileSize) {
        throw AppException(QStringLiteral("Die Datei \"%1\" ist zu groß, um sie anzuzeigen.")
                               .arg(QDir::toNativeSeparators(path)));
    }
    QByteArray data = file.read(kMaxFileSize + 1);
    if (file.error() != QFileDevice::NoError || data.size() > kMaxFileSize) {
        throw AppException(QStringLiteral("Die Datei \"%1\" konnte nicht gelesen werden: %2")
                               .arg(QDir::toNativeSeparators(path), file.errorString()));
    }
    return data;
}

bool RtfText::loadFile(const QString& path, QTextDocument* doc)
{
    return RtfReader::read(readFile(path), doc);
}

bool RtfText::loadFile(const QString& path, QTextEdit* edit)
{
    return setContent(edit, readFile(path));
}

void RtfText::saveFile(const QString& path, const QTextDocument& doc)
{
    // Written beside the target and renamed over it, so a failed save keeps the old file.
    QSaveFile file(path);
    const QByteArray data = RtfWriter::write(doc);
    if (!file.open(QIODevice::WriteOnly) || file.write(data) != data.size() || !file.commit()) {
        throw AppException(QStringLiteral("Die Datei \"%1\" konnte nicht gespeichert werden: %2")
                               .arg(QDir::toNativeSeparators(path), file.errorString()));
    }
}

} // namespace orvanta
