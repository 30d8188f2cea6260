#include "export/writers/ExportWriter.h"

#include "export/writers/BiffWriter.h"
#include "export/writers/TextWriters.h"
#include "ui/grid/GridSnapshot.h"

#include <QFileInfo>
#include <QSaveFile>

namespace orvanta {

namespace {
constexpr qint64 progressEvery = 500;
} // namespace

std::unique_ptr<ExportWriter> makeExportWriter(ExportFormat format)
{
    switch (format) {
    case ExportFormat::Html:
        return std::make_unique<HtmlExportWriter>();
    case ExportFormat::Excel:
        return std::make_unique<BiffExportWriter>();
    case ExportFormat::Xml:
        return std::make_unique<XmlExportWriter>();
    case ExportFormat::Text:
        return std::make_unique<TextExportWriter>();
    }
    return {};
}

QString exportExtension(ExportFormat format)
{
    switch (format) {
    case ExportFormat::Html:
        return QStringLiteral("html");
    case ExportFormat::Excel:
        return QStringLiteral("xls");
    case ExportFormat::Xml:
        return QStringLiteral("xml");
    case ExportFormat::Text:
        return QStringLiteral("txt");
    }
    return {};
}

ExportResult exportGrid(GridSnapshot& grid, ExportFormat format, const QString& path, const ExportProgress& progress)
{
    ExportResult result;
    std::unique_ptr<ExportWriter> writer = makeExportWriter(format);
    QSaveFile file(path);
    // Never write through to the target: a failed export must not leave a partial file.
    file.setDirectWriteFallback(false);
    if (!writer || !file.open(QIODevice::WriteOnly)) {
        result.error = file.errorString();
        return result;
    }
    auto fail = [&](bool cancelled = false) {
        result.cancelled = cancelled;
        result.error = cancelled ? QString() : (writer->error().isEmpty() ? file.errorString() : writer->error());
        file.cancelWriting();
        return result;
    };
    grid.rewind();
    if (!writer->begin(file, grid))
        return fail();
    while (grid.next()) {
        const bool ok = grid.isGroupRow() ? writer->groupRow(file, grid.groupLevel(), grid.groupText())
                                          : writer->dataRow(file, grid);
        if (!ok)
            return fail();
        ++result.rowsWritten;
        if (progress && result.rowsWritten % progressEvery == 0 && !progress(result.rowsWritten))
            return fail(true);
    }
    if (!writer->finish(file))
        return fail();
    if (!file.commit()) {
        result.error = file.errorString();
        return result;
    }
    if (progress)
        progress(result.rowsWritten);
    result.ok = true;
    return result;
}

} // namespace orvanta
