// Random cells through the .xls writer, read back by a small independent reader of the
// compound document and the BIFF8 records; any difference aborts.
#include "export/writers/BiffWriter.h"

#include <QBuffer>
#include <QString>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

using namespace orvanta;

namespace {

struct Cell {
    int sheet = 0;
    int row = 0;
    int column = 0;
    bool text = false;
    QString string;
    double number = 0;
    bool operator==(const Cell& o) const
    {
        return sheet == o.sheet && row == o.row && column == o.column && text == o.text
            && (text ? string == o.string : std::memcmp(&number, &o.number, sizeof number) == 0);
    }
};

void check(bool ok)
{
    if (!ok)
        std::abort();
}

quint32 u32(const QByteArray& b, qsizetype at)
{
    check(at >= 0 && at + 4 <= b.size());
    const auto* p = reinterpret_cast<const unsigned char*>(b.constData() + at);
    return p[0] | (p[1] << 8) | (p[2] << 16) | (quint32(p[3]) << 24);
}

quint16 u16(const QByteArray& b, qsizetype at)
{
    check(at >= 0 && at + 2 <= b.size());
    const auto* p = reinterpret_cast<const unsigned char*>(b.constData() + at);
    return static_cast<quint16>(p[0] | (p[1] << 8));
}

QByteArray sector(const QByteArray& file, quint32 id)
{
    const qsizetype at = 512 + qsizetype(id) * 512;
    check(at + 512 <= file.size());
    return file.mid(at, 512);
}

// The Workbook stream of a compound document with 512-byte sectors.
QByteArray workbookStream(const QByteArray& file)
{
    check(file.size() >= 512 && file.startsWith(QByteArray("\xD0\xCF\x11\xE0\xA1\xB1\x1A\xE1", 8)));
    check(u16(file, 30) == 9);
    const quint32 fatSectors = u32(file, 44);
    std::vector<quint32> fat;
    for (quint32 i = 0; i < fatSectors; ++i) {
        check(i < 109);   // the fuzz files stay far below the header's 109 FAT sectors
        const QByteArray s = sector(file, u32(file, 76 + qsizetype(i) * 4));
        for (int k = 0; k < 128; ++k)
            fat.push_back(u32(s, k * 4));
    }
    auto chain = [&](quint32 start) {
        QByteArray data;
        for (quint32 id = start, steps = 0; id != 0xFFFFFFFE; id = fat[id], ++steps) {
            check(id < fat.size() && steps <= fat.size());
            data += sector(file, id);
        }
        return data;
    };
    const QByteArray dir = chain(u32(file, 48));
    for (qsizetype e = 0; e + 128 <= dir.size(); e += 128) {
        const QString name = QString::fromUtf16(reinterpret_cast<const char16_t*>(dir.constData() + e),
                                                std::max(0, u16(dir, e + 64) / 2 - 1));
        if (name == QLatin1String("Workbook") && dir[e + 66] == 2) {
            const quint32 size = u32(dir, e + 120);
            check(size >= 4096);   // never in the mini stream
            const QByteArray data = chain(u32(dir, e + 116));
            check(data.size() >= qsizetype(size));
            return data.left(size);
        }
    }
    check(false);
    return {};
}

struct Record {
    quint16 type;
    QByteArray data;
};

Record recordAt(const QByteArray& s, qsizetype& at)
{
    const quint16 type = u16(s, at);
    const quint16 len = u16(s, at + 2);
    check(len <= 8224 && at + 4 + len <= s.size());
    Record r{type, s.mid(at + 4, len)};
    at += 4 + len;
    return r;
}

// Strings of the shared table: segments are the SST record and its CONTINUE records.
std::vector<QString> readStrings(const std::vector<QByteArray>& segments)
{
    std::vector<QString> out;
    check(!segments.empty());
    const quint32 count = u32(segments[0], 4);
    size_t seg = 0;
    qsizetype at = 8;
    auto next = [&] {
        ++seg;
        check(seg < segments.size());
        at = 0;
    };
    for (quint32 i = 0; i < count; ++i) {
        if (at >= segments[seg].size())
            next();
        const quint16 cch = u16(segments[seg], at);
        check(at + 2 < segments[seg].size());
        quint8 flags = static_cast<quint8>(segments[seg][at + 2]);
        at += 3;
        QString s;
        while (s.size() < cch) {
            if (at >= segments[seg].size()) {
                next();
                flags = static_cast<quint8>(segments[seg][0]);
                at = 1;
            }
            check((flags & 0x0C) == 0);   // no rich text, no phonetics
            if (flags & 1) {
                s += QChar(u16(segments[seg], at));
                at += 2;
            } else {
                s += QChar(static_cast<uchar>(segments[seg][at]));
                at += 1;
            }
        }
        out.push_back(s);
    }
    return out;
}

std::vector<Cell> readBook(const QByteArray& file)
{
    const QByteArray s = workbookStream(file);
    qsizetype at = 0;
    Record r = recordAt(s, at);
    check(r.type == 0x0809 && u16(r.data, 2) == 0x0005);
    std::vector<quint32> sheets;
    std::vector<QByteArray> sst;
    for (;;) {
        r = recordAt(s, at);
        if (r.type == 0x000A)
            break;
        if (r.type == 0x0085)
            sheets.push_back(u32(r.data, 0));
        else if (r.type == 0x00FC)
            sst = {r.data};
        else if (r.type == 0x003C && !sst.empty())
            sst.push_back(r.data);
    }
    const std::vector<QString> strings = readStrings(sst);
    std::vector<Cell> cells;
    for (size_t sh = 0; sh < sheets.size(); ++sh) {
        qsizetype p = sheets[sh];
        r = recordAt(s, p);
        check(r.type == 0x0809 && u16(r.data, 2) == 0x0010);
        for (;;) {
            r = recordAt(s, p);
            if (r.type == 0x000A)
                break;
            Cell c;
            c.sheet = static_cast<int>(sh);
            if (r.type == 0x00FD) {
                c.row = u16(r.data, 0);
                c.column = u16(r.data, 2);
                c.text = true;
                const quint32 index = u32(r.data, 6);
                check(index < strings.size());
                c.string = strings[index];
                cells.push_back(c);
            } else if (r.type == 0x0203) {
                c.row = u16(r.data, 0);
                c.column = u16(r.data, 2);
                check(r.data.size() == 14);
                std::memcpy(&c.number, r.data.constData() + 6, 8);
                cells.push_back(c);
            }
        }
    }
    return cells;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    // Input: a list of cells, each a kind byte, a row byte, a column byte and for text a length
    // byte (times 97, so strings cross record boundaries) and characters taken from the input.
    // The characters of one input are capped: a few hundred thousand cross every record and
    // sector boundary, while inputs of 2000 long strings only made each run slow and large.
    constexpr qsizetype maxCharacters = 300'000;
    qsizetype characters = 0;
    size_t at = 0;
    auto byte = [&]() -> uint8_t { return at < size ? data[at++] : 0; };
    BiffWorkbook book(size);
    check(book.open());
    check(book.beginSheet(QStringLiteral("Export")));
    std::vector<Cell> written;
    int sheet = 0;
    while (at < size && written.size() < 2000) {
        const uint8_t kind = byte();
        Cell c;
        c.sheet = sheet;
        c.row = byte();
        c.column = byte();
        if (kind % 5 == 0) {
            check(book.endSheet(256, 256));
            check(book.beginSheet(QStringLiteral("Export")));
            c.sheet = ++sheet;
            continue;
        }
        if (kind % 2 == 0) {
            c.text = true;
            const int len = static_cast<int>(std::min<qsizetype>(byte() * 97, maxCharacters - characters));
            characters += len;
            for (int i = 0; i < len; ++i)
                c.string += QChar(static_cast<char16_t>(0x20 + (data[(at + i) % size] * 131 + i) % 0x2000));
            check(book.addText(c.row, c.column, c.string));
        } else {
            std::uint64_t bits = 0;
            for (int i = 0; i < 8; ++i)
                bits = (bits << 8) | byte();
            std::memcpy(&c.number, &bits, 8);
            check(book.addNumber(c.row, c.column, c.number));
        }
        written.push_back(c);
    }
    check(book.endSheet(256, 256));
    QBuffer out;
    check(out.open(QIODevice::WriteOnly));
    check(book.writeTo(out));
    check(readBook(out.data()) == written);
    return 0;
}
