#include "calllog/LogReport.h"

#include "db/FbStatement.h"
#include "ui/report/ReportRun.h"

#include <QLocale>

namespace orvanta {

namespace {

constexpr LogReportVariant kVariants[] = {
    {"LogEinfach", "RvCustomConnectionLogEinfach", "order by TSDATE, TSTIME"},
    {"LogDetailliert", "RvCustomConnectionLogDetailliert", "order by TSDATE, TSTIME"},
    {"LogEinfachGruppeDatum", "RvCustomConnectionLogEinfach", "order by TSDATE, TSTIME"},
    {"LogDetailliertGruppeDatum", "RvCustomConnectionLogDetailliert", "order by TSDATE, TSTIME"},
    {"LogEinfachGruppeVerbindung", "RvCustomConnectionLogEinfach", "order by CTYPE, TSDATE, TSTIME"},
    {"LogDetailliertGruppeVerbindung", "RvCustomConnectionLogDetailliert", "order by CTYPE, TSDATE, TSTIME"},
    {"LogEinfachGruppeOriginating", "RvCustomConnectionLogEinfach", "order by FROMBEZ, REGION, TSDATE, TSTIME"},
    {"LogDetailliertGruppeOriginating", "RvCustomConnectionLogDetailliert", "order by FROMBEZ, REGION, TSDATE, TSTIME"},
    {"LogEinfachGruppeTerminating", "RvCustomConnectionLogEinfach", "order by ONBEZ, TSDATE, TSTIME"},
    {"LogDetailliertGruppeTerminating", "RvCustomConnectionLogDetailliert", "order by ONBEZ, TSDATE, TSTIME"},
};

const char* const kSimpleSelect = "select TSDate, TSTime, CTYPE, FROMBEZ, STATUS, ONBEZ from LOG ";
const char* const kDetailedSelect =
    "select TSDate, TSTime, CTYPE, FROMBEZ, STATUS, ONBEZ, CTIME, CCHARGE, BEMERK, ABID, REGION from LOG ";

bool detailed(int variant)
{
    return variant % 2 == 1;
}

// Digits written by hand: a long report formats two of these per row, and QDate's and QTime's
// format strings are parsed on every call.
void putDigits(QChar*& to, int value, int count)
{
    for (int i = count - 1; i >= 0; --i, value /= 10)
        to[i] = QChar(u'0' + value % 10);
    to += count;
}

QString shortDate(QDate date)
{
    if (!date.isValid() || date.year() < 1 || date.year() > 9999)
        return date.toString(QStringLiteral("dd.MM.yyyy"));
    QString text(10, Qt::Uninitialized);
    QChar* to = text.data();
    putDigits(to, date.day(), 2);
    *to++ = u'.';
    putDigits(to, date.month(), 2);
    *to++ = u'.';
    putDigits(to, date.year(), 4);
    return text;
}

QString shortTime(QTime time)
{
    if (!time.isValid())
        return time.toString(QStringLiteral("hh:mm"));
    QString text(5, Qt::Uninitialized);
    QChar* to = text.data();
    putDigits(to, time.hour(), 2);
    *to++ = u':';
    putDigits(to, time.minute(), 2);
    return text;
}

} // namespace

const LogReportVariant* logReportVariant(int variant)
{
    return variant >= 0 && variant < 10 ? &kVariants[variant] : nullptr;
}

LogReportQuery logReportQuery(int variant, QDate start, QDate end)
{
    LogReportQuery query;
    QString where;
    if (!start.isValid()) {
        query.zeitraum = QStringLiteral("(alles)");
    } else if (!end.isValid()) {
        where = QStringLiteral("where TSDATE = :Day ");
        query.params.append({QStringLiteral("Day"), start});
        query.zeitraum = QLatin1Char('(') + shortDate(start) + QLatin1Char(')');
    } else {
        where = QStringLiteral("where (TSDATE >= :StartDay) and (TSDATE <= :EndDay) ");
        query.params.append({QStringLiteral("StartDay"), start});
        query.params.append({QStringLiteral("EndDay"), end});
        query.zeitraum = QLatin1Char('(') + shortDate(start) + QLatin1Char('-') + shortDate(end) + QLatin1Char(')');
    }
    const LogReportVariant* v = logReportVariant(variant);
    query.sql = QLatin1String(detailed(variant) ? kDetailedSelect : kSimpleSelect) + where
        + (v ? QLatin1String(v->order) : QLatin1String());
    return query;
}

LogReportConnection::LogReportConnection(FbStatement& statement, LogReportQuery query, int variant)
    : StatementReportSource(statement, std::move(query.sql), std::move(query.params))
    , m_variant(variant)
{
}

QList<ReportField> LogReportConnection::fields() const
{
    QList<ReportField> list{field("Datum", 16),  field("Zeit", 11),   field("Verbindung", 11),
                            field("Anrufer", 81), field("Status", 41), field("Angerufener", 81)};
    if (detailed(m_variant))
        list += {field("Dauer", 16), field("Kosten", 16), field("Bemerkung", 51), field("Anrufbeantworter", 26),
                 field("Region", 36)};
    list.append(field("Odd", 1));
    return list;
}

QString LogReportConnection::durationText(qint64 seconds)
{
    const QString separator = QStringLiteral(":");
    return QString::number(seconds / 3600) + separator + QStringLiteral("%1").arg(seconds / 60 % 60, 2, 10, QLatin1Char('0'))
        + separator + QStringLiteral("%1").arg(seconds % 60, 2, 10, QLatin1Char('0'));
}

QStringList LogReportConnection::row() const
{
    const FbStatement& s = statement();
    QStringList values;
    values << (s.isNull(0) ? QString() : shortDate(s.asDate(0)));
    values << (s.isNull(1) ? QString() : shortTime(s.asTime(1)));
    values << (s.asInt(2) != 0 ? QStringLiteral("abgehend") : QStringLiteral("ankommend"));
    values << s.asString(3) << s.asString(4) << s.asString(5);
    if (detailed(m_variant)) {
        values << (s.isNull(6) ? durationText(0) : durationText(QTime(0, 0).secsTo(s.asTime(6))));
        const QLocale locale = QLocale::system();
        values << locale.toCurrencyString(double(s.asScaled(7, 2)) / 100, locale.currencySymbol(), 2);
        values << s.asString(8);
        values << (s.asInt(9) != 0 ? QStringLiteral("Mitteilung vorhanden") : QString());
        const QString region = s.asString(10);
        values << (m_variant == 7 && !region.isEmpty() ? QStringLiteral(" (") + region + QLatin1Char(')') : region);
    }
    values << odd();
    return values;
}

bool LogPrint(FbStatement* statement, int variant, ReportOutcome& outcome, QDate end, QDate start)
{
    outcome = ReportOutcome{};
    if (reportStatementMissing(statement, outcome))
        return false;
    const LogReportVariant* v = logReportVariant(variant);
    if (!v) {
        outcome.code = int(ReportResult::NO_REPORT_ASSIGNED);
        return false;
    }
    return runStatementReport(*statement, outcome, [&] {
        LogReportQuery query = logReportQuery(variant, start, end);
        ReportParameters parameters;
        parameters.text.insert(QStringLiteral("Zeitraum"), query.zeitraum);
        LogReportConnection connection(*statement, std::move(query), variant);
        runReport(QLatin1String(v->report), std::move(parameters), &connection, QStringLiteral("Vorschau Anrufprotokoll"));
    });
}

} // namespace orvanta
