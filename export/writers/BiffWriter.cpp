#include "export/writers/BiffWriter.h"

#include "ui/grid/GridSnapshot.h"

#include <QDir>
#include <QtCore/qendian.h>
#include <algorithm>
#include <cstring>

namespace orvanta {

namespace {

constexpr int recordLimit = 8224;   // bytes of data per record; more goes into CONTINUE records
constexpr quint16 xfGeneral = 15;
constexpr quint16 xfDate = 16;
constexpr quint16 dateFormat = 164; // first number of the workbook's own formats
constexpr int sectorSize = 512;
constexpr quint32 endOfChain = 0xFFFFFFFE;
constexpr quint32 freeSector = 0xFFFFFFFF;
constexpr quint32 fatSector = 0xFFFFFFFD;
constexpr quint32 difatSector = 0xFFFFFFFC;
constexpr quint32 noStream = 0xFFFFFFFF;
// Streams below this size would belong in the mini stream; the workbook is padded up instead.
constexpr qint64 miniStreamCutoff = 4096;

void put16(QByteArray& b, quint32 v)
{
    const quint16 le = qToLittleEndian(static_cast<quint16>(v));
    b.append(reinterpret_cast<const char*>(&le), 2);
}

void put32(QByteArray& b, quint32 v)
{
    const quint32 le = qToLittleEndian(v);
    b.append(reinterpret_cast<const char*>(&le), 4);
}

void putDouble(QByteArray& b, double v)
{
    quint64 bits = 0;
    std::memcpy(&bits, &v, 8);
    bits = qToLittleEndian(bits);
    b.append(reinterpret_cast<const char*>(&bits), 8);
}

void putUtf16(QByteArray& b, const char16_t* chars, qsizetype n)
{
    for (qsizetype i = 0; i < n; ++i)
        put16(b, chars[i]);
}

QByteArray record(quint16 type, const QByteArray& body)
{
    QByteArray r;
    r.reserve(body.size() + 4);
    put16(r, type);
    put16(r, static_cast<quint32>(body.size()));
    return r + body;
}

QByteArray fontRecord()
{
    QByteArray b;
    put16(b, 200);     // 10 pt
    put16(b, 0);       // no attributes
    put16(b, 0x7FFF);  // automatic colour
    put16(b, 400);     // normal weight
    put16(b, 0);       // no super/subscript
    b.append('\0');    // no underline
    b.append('\0');    // family
    b.append('\0');    // character set
    b.append('\0');
    const QString name = QStringLiteral("Arial");
    b.append(static_cast<char>(name.size()));
    b.append('\1');
    putUtf16(b, reinterpret_cast<const char16_t*>(name.utf16()), name.size());
    return record(0x0031, b);
}

QByteArray xfRecord(bool style, quint16 format)
{
    QByteArray b;
    put16(b, 0);                          // font
    put16(b, format);
    put16(b, style ? 0xFFF5 : 0x0001);    // style XF / cell XF with parent 0, locked
    b.append(static_cast<char>(0x20));    // bottom aligned
    b.append('\0');                       // rotation
    b.append('\0');                       // indent, shrink
    b.append(static_cast<char>(style ? 0x00 : (format ? 0x04 : 0x00))); // attributes set here
    put32(b, 0);                          // borders
    put32(b, 0);
    put16(b, 0x20C0);                     // default pattern colours
    return record(0x00E0, b);
}

bool copyFile(QFile& from, QIODevice& to)
{
    if (!from.flush() || !from.seek(0))
        return false;
    QByteArray chunk;
    while (!from.atEnd()) {
        chunk = from.read(1 << 16);
        if (chunk.isEmpty() || to.write(chunk) != chunk.size())
            return false;
    }
    return true;
}

} // namespace

BiffWorkbook::BiffWorkbook(qint64 expectedStrings)
    : m_sheets(QDir::tempPath() + QStringLiteral("/orvanta-xls-XXXXXX"))
    , m_strings(QDir::tempPath() + QStringLiteral("/orvanta-sst-XXXXXX"))
{
    while (m_bucketSize < 1024 && expectedStrings / m_bucketSize > 128)
        m_bucketSize *= 2;
}

bool BiffWorkbook::fail(const QString& why)
{
    if (m_error.isEmpty())
        m_error = why;
    return false;
}

bool BiffWorkbook::open()
{
    if (!m_sheets.open() || !m_strings.open())
        return fail(QStringLiteral("Temporäre Datei: %1").arg(m_sheets.errorString()));
    m_record.reserve(recordLimit + 8);
    m_record.fill('\0', 8);   // total and unique string counts, written at the end
    return true;
}

bool BiffWorkbook::putSheetRecord(quint16 type, const QByteArray& body)
{
    const QByteArray r = record(type, body);
    return m_sheets.write(r) == r.size() || fail(m_sheets.errorString());
}

bool BiffWorkbook::beginSheet(const QString& name)
{
    Sheet sheet;
    QString unique = name.left(31);
    for (int n = 2; std::any_of(m_sheetList.begin(), m_sheetList.end(), [&](const Sheet& s) {
             return s.name == QByteArray(reinterpret_cast<const char*>(unique.utf16()), unique.size() * 2);
         });
         ++n)
        unique = name.left(24) + QStringLiteral(" (%1)").arg(n);
    putUtf16(sheet.name, reinterpret_cast<const char16_t*>(unique.utf16()), unique.size());
    sheet.offset = m_sheets.pos();

    QByteArray bof;
    put16(bof, 0x0600);
    put16(bof, 0x0010);   // worksheet
    put16(bof, 0x0DBB);
    put16(bof, 0x07CC);
    put32(bof, 0);
    put32(bof, 6);
    if (!putSheetRecord(0x0809, bof))
        return false;
    sheet.dimensionsAt = m_sheets.pos() + 4;
    if (!putSheetRecord(0x0200, QByteArray(14, '\0')))
        return false;
    QByteArray window;
    put16(window, m_sheetList.empty() ? 0x06B6 : 0x04B6);   // grid, headers, zeros; first selected
    put16(window, 0);
    put16(window, 0);
    put16(window, 0x40);
    put16(window, 0);
    put16(window, 0);
    put16(window, 0);
    put32(window, 0);
    if (!putSheetRecord(0x023E, window))
        return false;
    m_sheetList.push_back(sheet);
    return true;
}

bool BiffWorkbook::endSheet(int rows, int columns)
{
    if (!putSheetRecord(0x000A, {}))
        return false;
    QByteArray dims;
    put32(dims, 0);
    put32(dims, static_cast<quint32>(rows));
    put16(dims, 0);
    put16(dims, static_cast<quint32>(columns));
    put16(dims, 0);
    const qint64 end = m_sheets.pos();
    if (!m_sheets.seek(m_sheetList.back().dimensionsAt) || m_sheets.write(dims) != dims.size() || !m_sheets.seek(end))
        return fail(m_sheets.errorString());
    return true;
}

bool BiffWorkbook::flushStrings(bool last)
{
    Q_UNUSED(last);
    const QByteArray r = record(m_firstStringRecord ? 0x00FC : 0x003C, m_record);
    m_firstStringRecord = false;
    m_record.clear();
    return m_strings.write(r) == r.size() || fail(m_strings.errorString());
}

bool BiffWorkbook::addString(const QString& whole)
{
    const QString text = whole.left(maxTextLength);
    // A string's length and flags never split; a character never splits either.
    if (m_record.size() + 3 + (text.isEmpty() ? 0 : 2) > recordLimit && !flushStrings(false))
        return false;
    if (m_stringCount % m_bucketSize == 0) {
        if (m_buckets.size() >= 1000) {
            // Too many index entries for one record: keep every other one.
            std::vector<Bucket> kept;
            for (size_t i = 0; i < m_buckets.size(); i += 2)
                kept.push_back(m_buckets[i]);
            m_buckets.swap(kept);
            m_bucketSize *= 2;
        }
        if (m_stringCount % m_bucketSize == 0)
            m_buckets.push_back({m_strings.pos() + 4 + m_record.size(), static_cast<quint16>(4 + m_record.size())});
    }
    ++m_stringCount;
    put16(m_record, static_cast<quint32>(text.size()));
    m_record.append('\1');   // 16-bit characters
    const auto* chars = reinterpret_cast<const char16_t*>(text.utf16());
    qsizetype left = text.size();
    while (left > 0) {
        qsizetype room = (recordLimit - m_record.size()) / 2;
        if (room == 0) {
            if (!flushStrings(false))
                return false;
            m_record.append('\1');   // a continued string repeats its flags
            room = (recordLimit - 1) / 2;
        }
        const qsizetype n = std::min(room, left);
        putUtf16(m_record, chars, n);
        chars += n;
        left -= n;
    }
    return true;
}

bool BiffWorkbook::cell(quint16 type, int row, int column, quint16 xf, const QByteArray& tail)
{
    QByteArray b;
    b.reserve(6 + tail.size());
    put16(b, static_cast<quint32>(row));
    put16(b, static_cast<quint32>(column));
    put16(b, xf);
    return putSheetRecord(type, b + tail);
}

bool BiffWorkbook::addText(int row, int column, const QString& text)
{
    QByteArray index;
    put32(index, m_stringCount);
    return addString(text) && cell(0x00FD, row, column, xfGeneral, index);
}

bool BiffWorkbook::addNumber(int row, int column, double value)
{
    QByteArray v;
    putDouble(v, value);
    return cell(0x0203, row, column, xfGeneral, v);
}

bool BiffWorkbook::addDate(int row, int column, QDate date)
{
    QByteArray v;
    putDouble(v, static_cast<double>(date.toJulianDay() - QDate(1899, 12, 30).toJulianDay()));
    return cell(0x0203, row, column, xfDate, v);
}

QByteArray BiffWorkbook::globals(qint64 sheetsStart, qint64 /*sstStart*/) const
{
    QByteArray g;
    QByteArray b;
    put16(b, 0x0600);
    put16(b, 0x0005);   // workbook globals
    put16(b, 0x0DBB);
    put16(b, 0x07CC);
    put32(b, 0);
    put32(b, 6);
    g += record(0x0809, b);
    b.clear();
    put16(b, 1200);     // UTF-16
    g += record(0x0042, b);
    b.clear();
    put16(b, 0);        // WINDOW1: position, size, flags, tabs
    put16(b, 0);
    put16(b, 0x4000);
    put16(b, 0x2000);
    put16(b, 0x0038);
    put16(b, 0);
    put16(b, 0);
    put16(b, 1);
    put16(b, 0x0258);
    g += record(0x003D, b);
    b.clear();
    put16(b, 0);        // dates count from 1900
    g += record(0x0022, b);
    for (int i = 0; i < 4; ++i)
        g += fontRecord();
    b.clear();
    const QString format = QStringLiteral("DD.MM.YYYY");
    put16(b, dateFormat);
    put16(b, static_cast<quint32>(format.size()));
    b.append('\1');
    putUtf16(b, reinterpret_cast<const char16_t*>(format.utf16()), format.size());
    g += record(0x041E, b);
    for (int i = 0; i < 15; ++i)
        g += xfRecord(true, 0);
    g += xfRecord(false, 0);
    g += xfRecord(false, dateFormat);
    b.clear();
    put16(b, 0x8000);   // built-in style "Normal" on XF 0
    b.append('\0');
    b.append(static_cast<char>(0xFF));
    g += record(0x0293, b);
    qint64 offset = sheetsStart;
    for (const Sheet& sheet : m_sheetList) {
        b.clear();
        put32(b, static_cast<quint32>(offset + sheet.offset));
        b.append('\0');   // visible
        b.append('\0');   // worksheet
        b.append(static_cast<char>(sheet.name.size() / 2));
        b.append('\1');
        b += sheet.name;
        g += record(0x0085, b);
    }
    return g;
}

bool BiffWorkbook::writeTo(QIODevice& out)
{
    if (!flushStrings(true))
        return false;
    QByteArray counts;
    put32(counts, m_stringCount);
    put32(counts, m_stringCount);
    const qint64 stringsSize = m_strings.pos();
    if (!m_strings.seek(4) || m_strings.write(counts) != counts.size() || !m_strings.seek(stringsSize))
        return fail(m_strings.errorString());

    QByteArray post;
    {
        QByteArray b;
        put16(b, m_bucketSize);
        for (const Bucket& bucket : m_buckets) {
            put32(b, 0);   // patched below once the table's position is known
            put16(b, bucket.inRecord);
            put16(b, 0);
        }
        post = record(0x00FF, b) + record(0x000A, {});
    }
    const qint64 preSize = globals(0, 0).size();
    const qint64 sheetsStart = preSize + stringsSize + post.size();
    const QByteArray pre = globals(sheetsStart, preSize);
    for (size_t i = 0; i < m_buckets.size(); ++i) {
        const quint32 pos = qToLittleEndian(static_cast<quint32>(preSize + m_buckets[i].position));
        std::memcpy(post.data() + 4 + 2 + i * 8, &pos, 4);
    }
    const qint64 sheetsSize = m_sheets.pos();
    const qint64 streamSize = std::max(sheetsStart + sheetsSize, miniStreamCutoff);

    // Compound document: stream sectors, one directory sector, the FAT, the FAT's extension.
    const quint32 streamSectors = static_cast<quint32>((streamSize + sectorSize - 1) / sectorSize);
    quint32 fatCount = 1;
    quint32 difatCount = 0;
    for (;;) {
        const quint32 total = streamSectors + 1 + fatCount + difatCount;
        const quint32 needFat = (total + 127) / 128;
        const quint32 needDifat = needFat > 109 ? (needFat - 109 + 126) / 127 : 0;
        if (needFat == fatCount && needDifat == difatCount)
            break;
        fatCount = std::max(fatCount, needFat);
        difatCount = std::max(difatCount, needDifat);
    }
    const quint32 dirSector = streamSectors;
    const quint32 firstFat = dirSector + 1;
    const quint32 firstDifat = firstFat + fatCount;

    QByteArray h;
    h.append("\xD0\xCF\x11\xE0\xA1\xB1\x1A\xE1", 8);
    h.append(QByteArray(16, '\0'));
    put16(h, 0x003E);
    put16(h, 0x0003);
    put16(h, 0xFFFE);
    put16(h, 9);        // 512-byte sectors
    put16(h, 6);        // 64-byte mini sectors
    h.append(QByteArray(6, '\0'));
    put32(h, 0);        // directory sectors (always 0 in version 3)
    put32(h, fatCount);
    put32(h, dirSector);
    put32(h, 0);
    put32(h, static_cast<quint32>(miniStreamCutoff));
    put32(h, endOfChain);   // no mini FAT
    put32(h, 0);
    put32(h, difatCount ? firstDifat : endOfChain);
    put32(h, difatCount);
    for (quint32 i = 0; i < 109; ++i)
        put32(h, i < fatCount ? firstFat + i : freeSector);

    auto write = [&](const QByteArray& bytes) { return out.write(bytes) == bytes.size() || fail(out.errorString()); };
    if (!write(h) || !write(pre) || !copyFile(m_strings, out) || !write(post) || !copyFile(m_sheets, out))
        return fail(out.errorString());
    const qint64 written = sheetsStart + sheetsSize;
    if (!write(QByteArray(static_cast<qsizetype>(qint64(streamSectors) * sectorSize - written), '\0')))
        return false;

    QByteArray dir;
    auto entry = [&](const QString& name, quint8 type, quint32 child, quint32 start, quint32 size) {
        QByteArray e;
        putUtf16(e, reinterpret_cast<const char16_t*>(name.utf16()), name.size());
        e.append(QByteArray(64 - e.size(), '\0'));
        put16(e, name.isEmpty() ? 0 : static_cast<quint32>((name.size() + 1) * 2));
        e.append(static_cast<char>(type));
        e.append(static_cast<char>(type ? 1 : 0));   // black
        put32(e, noStream);
        put32(e, noStream);
        put32(e, child);
        e.append(QByteArray(16 + 4 + 16, '\0'));      // class, state, times
        put32(e, start);
        put32(e, size);
        put32(e, 0);
        dir += e;
    };
    entry(QStringLiteral("Root Entry"), 5, 1, endOfChain, 0);
    entry(QStringLiteral("Workbook"), 2, noStream, 0, static_cast<quint32>(streamSize));
    entry({}, 0, noStream, 0, 0);
    entry({}, 0, noStream, 0, 0);
    if (!write(dir))
        return false;

    QByteArray sector;
    const quint32 entries = fatCount * 128;
    for (quint32 i = 0; i < entries; ++i) {
        quint32 v = freeSector;
        if (i + 1 < streamSectors)
            v = i + 1;
        else if (i + 1 == streamSectors || i == dirSector)
            v = endOfChain;
        else if (i >= firstFat && i < firstDifat)
            v = fatSector;
        else if (i >= firstDifat && i < firstDifat + difatCount)
            v = difatSector;
        put32(sector, v);
        if (sector.size() == sectorSize) {
            if (!write(sector))
                return false;
            sector.clear();
        }
    }
    for (quint32 d = 0; d < difatCount; ++d) {
        sector.clear();
        for (quint32 k = 0; k < 127; ++k) {
            const quint32 fat = 109 + d * 127 + k;
            put32(sector, fat < fatCount ? firstFat + fat : freeSector);
        }
        put32(sector, d + 1 < difatCount ? firstDifat + d + 1 : endOfChain);
        if (!write(sector))
            return false;
    }
    return true;
}

// --- the grid export ----------------------------------------------------------------------------

bool BiffExportWriter::begin(QIODevice& /*out*/, const GridSnapshot& grid)
{
    m_columns = grid.columnCount();
    m_book = std::make_unique<BiffWorkbook>((grid.recordCount() + 1) * std::max(1, m_columns));
    if (!m_book->open())
        return false;
    if (m_columns > BiffWorkbook::maxColumns) {
        m_error = QStringLiteral("Eine Excel-Tabelle hat höchstens %1 Spalten.").arg(BiffWorkbook::maxColumns);
        return false;
    }
    m_captions.clear();
    for (const GridSnapshotColumn& column : grid.columns())
        m_captions << column.caption;
    m_sheet = 1;
    return m_book->beginSheet(QStringLiteral("Export")) && header();
}

bool BiffExportWriter::header()
{
    for (int i = 0; i < m_columns; ++i) {
        if (!m_book->addText(0, i, m_captions[i]))
            return false;
    }
    m_row = 1;
    return true;
}

bool BiffExportWriter::nextRow()
{
    if (m_row < BiffWorkbook::maxRows)
        return true;
    ++m_sheet;
    return m_book->endSheet(m_row, m_columns)
        && m_book->beginSheet(QStringLiteral("Export (%1)").arg(m_sheet)) && header();
}

bool BiffExportWriter::groupRow(QIODevice& /*out*/, int /*level*/, const QString& text)
{
    if (!nextRow() || !m_book->addText(m_row, 0, text))
        return false;
    ++m_row;
    return true;
}

bool BiffExportWriter::dataRow(QIODevice& /*out*/, const GridSnapshot& grid)
{
    if (!nextRow())
        return false;
    for (int i = 0; i < m_columns; ++i) {
        const GridSnapshotCell cell = grid.cell(i);
        bool ok = true;
        switch (cell.kind) {
        case GridCellKind::Number:
            ok = m_book->addNumber(m_row, i, cell.number);
            break;
        case GridCellKind::Date:
            ok = m_book->addDate(m_row, i, cell.date);
            break;
        case GridCellKind::Text:
            ok = cell.text.isEmpty() || m_book->addText(m_row, i, cell.text);
            break;
        }
        if (!ok)
            return false;
    }
    ++m_row;
    return true;
}

bool BiffExportWriter::finish(QIODevice& out)
{
    return m_book->endSheet(m_row, m_columns) && m_book->writeTo(out);
}

} // namespace orvanta
