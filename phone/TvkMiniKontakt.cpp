#include "phone/TvkMiniKontakt.h"

#include "platform/AppException.h"
#include "platform/ErrorLog.h"
#include "phone/PhoneNumbers.h"
#include "platform/Windows1252.h"

namespace orvanta {

namespace {

// Cut to at most width characters without splitting a surrogate pair.
QString cut(const QString& text, int width)
{
    if (text.size() <= width)
        return text;
    qsizetype length = width;
    if (length > 0 && text.at(length - 1).isHighSurrogate())
        --length;
    return text.left(length);
}

void checkIndex(int index, qsizetype size)
{
    if (index < 0 || index >= size)
        throw AppException(QStringLiteral("Der Eintrag %1 existiert nicht (%2 Einträge).").arg(index).arg(size));
}

template<typename Operation>
auto guarded(const char* operation, Operation&& run, decltype(run()) failed) -> decltype(run())
{
    const QString header = QStringLiteral("# TvkMiniKontakt - ") + QLatin1String(operation);
    try {
        return run();
    } catch (const std::exception& e) {
        reportError(header, &e);
    }
    return failed;
}

} // namespace

int TvkMiniKontakt::width(Field field)
{
    static constexpr std::array<int, FieldCount> widths = {30, 30, 30, 50, 25, 80, 50, 35, 40, 10, 35, 30, 30, 30, 30};
    return widths[index(field)];
}

void TvkMiniKontakt::setValue(Field field, const QString& value)
{
    QString& current = m_fields[index(field)];
    if (current != value)
        current = cut(value, width(field));
}

void TvkMiniKontakt::fillNumbers(TvkKommItem& target, const TvkKommItem& source)
{
    target.KOMMBEZ = cut(source.KOMMBEZ, TvkKommItem::KOMMBEZWidth);
    target.LC = cut(source.LC, TvkKommItem::LCWidth);
    target.VORW = cut(source.VORW, TvkKommItem::VORWWidth);
    target.NUMBER = cut(source.NUMBER, TvkKommItem::NUMBERWidth);
    target.NUMBEROF = cut(NormalizeNumber(target.NUMBER), TvkKommItem::NUMBEROFWidth);
    target.VORWNUMBER = NormalizeNumber(cut(target.VORW + target.NUMBER, TvkKommItem::VORWNUMBERWidth));
    target.LCVORWNUMBER = cut(NormalizeNumber(cut(cut(target.LC + target.VORW, 15) + target.NUMBER, 30)),
        TvkKommItem::LCVORWNUMBERWidth);
    target.BEMERKUNG = cut(source.BEMERKUNG, TvkKommItem::BEMERKUNGWidth);
    target.AUTOREJECT = source.AUTOREJECT;
}

int TvkMiniKontakt::AddKD(const TvkKommItem& item)
{
    return guarded(
        "AddKD",
        [&] {
            TvkKommItem entry;
            entry.LID = item.LID;
            entry.CID = item.CID;
            fillNumbers(entry, item);
            entry.status = item.status;
            m_kd.append(std::move(entry));
            return static_cast<int>(m_kd.size() - 1);
        },
        -1);
}

bool TvkMiniKontakt::EditKD(const TvkKommItem& item, int index)
{
    return guarded(
        "EditKD",
        [&] {
            checkIndex(index, m_kd.size());
            TvkKommItem& entry = m_kd[index];
            fillNumbers(entry, item);
            if (entry.status == EntryStatus::Unchanged)
                entry.status = EntryStatus::Changed;
            return true;
        },
        false);
}

bool TvkMiniKontakt::DeleteKD(int index)
{
    return guarded(
        "DeleteKD",
        [&] {
            checkIndex(index, m_kd.size());
            m_kd[index].status = EntryStatus::Deleted;
            return true;
        },
        false);
}

void TvkMiniKontakt::ClearKD()
{
    m_kd.clear();
}

int TvkMiniKontakt::AddMail(const TvkMailItem& item)
{
    return guarded(
        "AddMail",
        [&] {
            TvkMailItem entry;
            entry.LID = item.LID;
            entry.CID = item.CID;
            entry.MAILADDR = cut(item.MAILADDR, TvkMailItem::MAILADDRWidth);
            entry.BEMERK = cut(item.BEMERK, TvkMailItem::BEMERKWidth);
            entry.status = item.status;
            m_mail.append(std::move(entry));
            return static_cast<int>(m_mail.size() - 1);
        },
        -1);
}

bool TvkMiniKontakt::EditMail(const TvkMailItem& item, int index)
{
    return guarded(
        "EditMail",
        [&] {
            checkIndex(index, m_mail.size());
            TvkMailItem& entry = m_mail[index];
            entry.MAILADDR = cut(item.MAILADDR, TvkMailItem::MAILADDRWidth);
            entry.BEMERK = cut(item.BEMERK, TvkMailItem::BEMERKWidth);
            if (entry.status == EntryStatus::Unchanged)
                entry.status = EntryStatus::Changed;
            return true;
        },
        false);
}

bool TvkMiniKontakt::DeleteMail(int index)
{
    return guarded(
        "DeleteMail",
        [&] {
            checkIndex(index, m_mail.size());
            m_mail[index].status = EntryStatus::Deleted;
            return true;
        },
        false);
}

void TvkMiniKontakt::ClearMail()
{
    m_mail.clear();
}

bool TvkMiniKontakt::setKDStatus(int index, EntryStatus status)
{
    if (index < 0 || index >= m_kd.size())
        return false;
    m_kd[index].status = status;
    return true;
}

bool TvkMiniKontakt::setMailStatus(int index, EntryStatus status)
{
    if (index < 0 || index >= m_mail.size())
        return false;
    m_mail[index].status = status;
    return true;
}

void TvkMiniKontakt::StoreNotes(const QStringList& lines, const QString& text)
{
    m_notes.clear();
    if (text.isEmpty())
        return;
    QString joined;
    for (const QString& line : lines) {
        joined += line;
        joined += QLatin1String("\r\n");
    }
    m_notes = toWindows1252(joined);
}

void TvkMiniKontakt::StoreNotes(const QByteArray& content, const QString& text)
{
    m_notes.clear();
    if (!text.isEmpty())
        m_notes = content;
}

} // namespace orvanta
