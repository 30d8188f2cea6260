#pragma once
// Writes what a grid shows to a file in one of the four export formats. The rows are streamed
// from a GridSnapshot, so memory stays flat whatever the row count. The file is written under a
// temporary name beside the target and renamed only when everything was written: a full disk,
// a vanished folder or a cancel leaves no half-written file under the target name.

#include <QIODevice>
#include <QString>
#include <functional>
#include <memory>

namespace orvanta {

class GridSnapshot;

enum class ExportFormat : quint8 { Html, Excel, Xml, Text };

struct ExportResult {
    bool ok = false;
    bool cancelled = false;
    qint64 rowsWritten = 0;   // data and group rows
    QString error;
};

// Called every few hundred rows with the rows written so far; returning false cancels.
using ExportProgress = std::function<bool(qint64 rowsWritten)>;

// One format's encoding of the rows; the driver below does files, progress and cancelling.
class ExportWriter {
public:
    virtual ~ExportWriter() = default;
    // False on a write error; the device has the reason.
    virtual bool begin(QIODevice& out, const GridSnapshot& grid) = 0;
    virtual bool groupRow(QIODevice& out, int level, const QString& text) = 0;
    virtual bool dataRow(QIODevice& out, const GridSnapshot& grid) = 0;
    virtual bool finish(QIODevice& out) = 0;
    // A reason of the writer's own (a limit of the format), empty when the device failed.
    [[nodiscard]] virtual QString error() const { return {}; }
};

[[nodiscard]] std::unique_ptr<ExportWriter> makeExportWriter(ExportFormat format);
// "htm", "xls", "xml", "txt"
[[nodiscard]] QString exportExtension(ExportFormat format);

// Writes every row of the snapshot (from its start) to path.
ExportResult exportGrid(GridSnapshot& grid, ExportFormat format, const QString& path,
                        const ExportProgress& progress = {});

} // namespace orvanta
