#pragma once
// The binary Excel 97-2003 workbook (BIFF8 records in a compound document), written in a
// streaming way: the cells go to a temporary sheet stream and their strings to a temporary
// shared-string table as they come, and the file is assembled at the end by copying. Memory
// stays flat; every string gets its own table entry (no look-up of duplicates).

#include "export/writers/ExportWriter.h"

#include <QByteArray>
#include <QDate>
#include <QStringList>
#include <QTemporaryFile>
#include <vector>

namespace orvanta {

class BiffWorkbook {
public:
    static constexpr int maxRows = 65536;      // rows per sheet
    static constexpr int maxColumns = 256;
    static constexpr int maxTextLength = 32767; // characters per cell

    // expectedStrings sizes the string index (an estimate is fine).
    explicit BiffWorkbook(qint64 expectedStrings = 0);

    // False when the temporary files cannot be created.
    bool open();
    // Starts the next sheet; its name is made unique ("Export", "Export (2)").
    bool beginSheet(const QString& name);
    bool addText(int row, int column, const QString& text);
    bool addNumber(int row, int column, double value);
    bool addDate(int row, int column, QDate date);
    bool endSheet(int rows, int columns);
    // Writes the compound document; the sheets must be ended.
    bool writeTo(QIODevice& out);
    [[nodiscard]] QString error() const { return m_error; }

private:
    struct Sheet {
        QByteArray name;       // UTF-16LE
        qint64 offset = 0;     // in the sheet stream
        qint64 dimensionsAt = 0;
    };
    struct Bucket {
        qint64 position = 0;   // in the string stream
        quint16 inRecord = 0;
    };

    bool putSheetRecord(quint16 type, const QByteArray& body);
    bool flushStrings(bool last);
    bool addString(const QString& text);
    bool cell(quint16 type, int row, int column, quint16 xf, const QByteArray& tail);
    bool fail(const QString& why);
    [[nodiscard]] QByteArray globals(qint64 sheetsStart, qint64 sstStart) const;

    QTemporaryFile m_sheets;
    QTemporaryFile m_strings;
    std::vector<Sheet> m_sheetList;
    std::vector<Bucket> m_buckets;
    QByteArray m_record;       // shared-string record being filled
    bool m_firstStringRecord = true;
    quint32 m_stringCount = 0;
    quint32 m_bucketSize = 8;
    QString m_error;
};

// The grid export in that format: a header row on every sheet, a new sheet every 65 536 rows.
class BiffExportWriter final : public ExportWriter {
public:
    bool begin(QIODevice& out, const GridSnapshot& grid) override;
    bool groupRow(QIODevice& out, int level, const QString& text) override;
    bool dataRow(QIODevice& out, const GridSnapshot& grid) override;
    bool finish(QIODevice& out) override;
    [[nodiscard]] QString error() const override
    {
        return !m_error.isEmpty() || !m_book ? m_error : m_book->error();
    }

private:
    bool nextRow();
    bool header();

    std::unique_ptr<BiffWorkbook> m_book;
    QStringList m_captions;
    int m_columns = 0;
    int m_row = 0;
    int m_sheet = 0;
    QString m_error;
};

} // namespace orvanta
