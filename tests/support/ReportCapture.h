#pragma once
// Reports as a reader of the printed page sees them: the preview is replaced by a PDF file per
// report, read back with poppler's pdftotext and pdfinfo.

#include "ui/report/ReportRenderer.h"
#include "ui/report/ReportRun.h"

#include "tests/TestPaths.h"

#include <QDir>
#include <QFile>
#include <QProcess>
#include <QStringList>
#include <QTemporaryDir>

namespace orvanta::test {

// The text of a PDF in its printed layout; pages are separated by form feeds.
inline QString pdfText(const QString& path)
{
    QProcess p;
    p.start(QStringLiteral("pdftotext"), {QStringLiteral("-layout"), path, QStringLiteral("-")});
    p.waitForFinished(60000);
    return QString::fromUtf8(p.readAllStandardOutput());
}

// The non-empty lines of a page text, blanks run together: what a reader of the page sees,
// whatever the column spacing.
inline QStringList pdfLines(const QString& text)
{
    QStringList out;
    for (const QString& l : text.split(u'\n'))
        if (!l.trimmed().isEmpty())
            out.append(l.simplified());
    return out;
}

// The report file the program ships, for a test's program folder.
inline QByteArray shippedReportFile()
{
    QFile file(QStringLiteral(ORVANTA_SOURCE_DIR "/data/Orvex.rav"));
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

inline int pdfPages(const QString& path)
{
    QProcess p;
    p.start(QStringLiteral("pdfinfo"), {path});
    p.waitForFinished(60000);
    for (const QString& line : QString::fromUtf8(p.readAllStandardOutput()).split(u'\n'))
        if (line.startsWith(QLatin1String("Pages:")))
            return line.mid(6).trimmed().toInt();
    return -1;
}

// While it lives, every report run writes a PDF instead of opening the preview.
class ReportCapture final {
public:
    ReportCapture()
    {
        setReportPreviewHook([this](ReportLayout& layout, const QString& title) {
            const QString path = m_dir.filePath(QStringLiteral("report%1.pdf").arg(m_pdfs.size()));
            ReportRenderer::writePdf(path, layout);
            m_pdfs.append(path);
            titles.append(title);
            reports.append(layout.definition().name);
            pages.append(layout.pageCount());
        });
    }
    ~ReportCapture() { setReportPreviewHook({}); }
    ReportCapture(const ReportCapture&) = delete;
    ReportCapture& operator=(const ReportCapture&) = delete;

    [[nodiscard]] int count() const { return int(m_pdfs.size()); }
    [[nodiscard]] QString text(int i = -1) const { return pdfText(m_pdfs.at(i < 0 ? m_pdfs.size() - 1 : i)); }

    QStringList titles;
    QStringList reports;
    QList<int> pages;

private:
    QTemporaryDir m_dir;
    QStringList m_pdfs;
};

} // namespace orvanta::test
