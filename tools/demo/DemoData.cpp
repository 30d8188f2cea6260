#include "tools/demo/DemoData.h"

#include "db/DatabaseError.h"
#include "db/FbAttachment.h"
#include "db/FbStatement.h"
#include "db/FbTransaction.h"
#include "tools/demo/CallFactory.h"
#include "tools/demo/DemoContacts.h"
#include "tools/demo/LogWriter.h"
#include "tools/demo/NoteRtf.h"

#include <algorithm>

namespace orvanta::demo {
namespace {

constexpr int DemoCalls = 420;
constexpr int DemoDays = 180;
constexpr quint32 DemoSeed = 20240501;

// Runs a prepared procedure call and returns its first output.
int callForResult(FbStatement& st)
{
    st.execute();
    if (!st.hasRow() || st.isNull(0))
        throw DatabaseError(QStringLiteral("Die Prozedur lieferte kein Ergebnis: %1").arg(st.sql()));
    return st.asInt(0);
}

int insertCategories(FbAttachment& db, FbTransaction& tx)
{
    FbStatement st(db, &tx, QStringLiteral("EXECUTE PROCEDURE P_KAT_INSERT (:KID,:KA,:BEM)"));
    int n = 0;
    for (const QString& name : demoCategories()) {
        st.setParam(u"KID", 0);
        st.setParam(u"KA", name);
        st.setParam(u"BEM", QString(name + QStringLiteral(" (Demo)")));
        if (callForResult(st) < 1)
            throw DatabaseError(QStringLiteral("Kategorie \"%1\" konnte nicht angelegt werden.").arg(name));
        ++n;
    }
    return n;
}

struct StoredContact {
    int lid = 0;
    const DemoContact* data = nullptr;
};

std::vector<StoredContact> insertContacts(FbAttachment& db, FbTransaction& tx, DemoStats& stats)
{
    FbStatement cont(db, &tx,
                     QStringLiteral("EXECUTE PROCEDURE P_CONT_INSERT (:ANR,:VNA,:NA,:FA,:TIT,:CONTB,:WEB,:ABT,:KATB,"
                                    ":ST,:PL,:OT,:ZUSA,:L,:BUND,:TEXT)"));
    FbStatement com(db, &tx,
                    QStringLiteral("EXECUTE PROCEDURE P_COM_SYNCHRONIZE (:L,:C,:KB,:LC,:V,:N,:VN,:LCVN,:BEM,:AURE,:NOF,:STAT)"));
    FbStatement mail(db, &tx, QStringLiteral("EXECUTE PROCEDURE P_MAIL_SYNCHRONIZE (:LID,:CID,:MAILADDR,:BEMERK,:STATUS)"));

    std::vector<StoredContact> stored;
    for (const DemoContact& c : demoContacts()) {
        cont.setParam(u"ANR", c.anrede);
        cont.setParam(u"VNA", c.vname);
        cont.setParam(u"NA", c.name);
        cont.setParam(u"FA", c.firma);
        cont.setParam(u"TIT", c.titel);
        cont.setParam(u"CONTB", c.contbez);
        cont.setParam(u"WEB", c.website);
        cont.setParam(u"ABT", c.abteilung);
        cont.setParam(u"KATB", c.kategorie);
        cont.setParam(u"ST", c.str);
        cont.setParam(u"PL", c.plz);
        cont.setParam(u"OT", c.ort);
        cont.setParam(u"ZUSA", c.zusatz);
        cont.setParam(u"L", c.land);
        cont.setParam(u"BUND", c.bundesland);
        cont.setParam(u"TEXT", c.note.isEmpty() ? QVariant() : QVariant(noteRtf(c.note)));
        const int lid = callForResult(cont);
        if (lid < 1)
            throw DatabaseError(QStringLiteral("Kontakt \"%1\" konnte nicht angelegt werden.").arg(c.contbez));
        stored.push_back({lid, &c});
        ++stats.contacts;

        for (const DemoNumber& n : c.numbers) {
            com.setParam(u"L", 0);
            com.setParam(u"C", lid);
            com.setParam(u"KB", n.label);
            com.setParam(u"LC", n.lc);
            com.setParam(u"V", n.vorw);
            com.setParam(u"N", n.number);
            com.setParam(u"VN", digitsOf(n.vorw + n.number));
            com.setParam(u"LCVN", digitsOf(n.lc + n.vorw + n.number));
            com.setParam(u"BEM", n.remark);
            com.setParam(u"AURE", n.autoReject ? 1 : 0);
            com.setParam(u"NOF", digitsOf(n.number));
            com.setParam(u"STAT", 1);
            if (callForResult(com) != 0)
                throw DatabaseError(QStringLiteral("Rufnummer von \"%1\" konnte nicht gespeichert werden.").arg(c.contbez));
            ++stats.numbers;
        }
        for (const DemoMail& m : c.mails) {
            mail.setParam(u"LID", 0);
            mail.setParam(u"CID", lid);
            mail.setParam(u"MAILADDR", m.address);
            mail.setParam(u"BEMERK", m.remark);
            mail.setParam(u"STATUS", 1);
            if (callForResult(mail) != 0)
                throw DatabaseError(QStringLiteral("E-Mail-Adresse von \"%1\" konnte nicht gespeichert werden.").arg(c.contbez));
            ++stats.mails;
        }
    }
    return stored;
}

QString regionOf(const DemoContact& c, const DemoNumber& n)
{
    if (n.vorw.startsWith(QStringLiteral("01")) || n.label == QStringLiteral("Handy") || n.label == QStringLiteral("Mobil"))
        return QStringLiteral("Mobilfunk");
    return c.ort;
}

// A few hundred calls, oldest first, about a third of them from the address book.
std::vector<CallRow> makeCalls(const std::vector<StoredContact>& contacts, const QDate& today)
{
    std::vector<const StoredContact*> weighted;
    for (const StoredContact& s : contacts)
        if (!s.data->numbers.empty())
            for (int i = 0; i < s.data->callWeight; ++i)
                weighted.push_back(&s);

    CallFactory factory(DemoSeed);
    std::vector<CallRow> rows;
    rows.reserve(DemoCalls);
    for (int i = 0; i < DemoCalls; ++i) {
        // A handful of calls today, so "today" is never empty.
        const QDate day = i < 6 ? today : factory.randomDay(today, DemoDays);
        if (!weighted.empty() && factory.bounded(100) < 35) {
            const StoredContact& s = *weighted[size_t(factory.bounded(int(weighted.size())))];
            const DemoNumber& n = s.data->numbers[size_t(factory.bounded(int(s.data->numbers.size())))];
            const bool foreign = !n.lc.isEmpty() && n.lc != QStringLiteral("0049");
            rows.push_back(factory.callWith(day, Caller{dialledForm(n), regionOf(*s.data, n), foreign ? 1 : 2}));
            if (n.autoReject && rows.back().ctype == 0) {
                rows.back().status = QStringLiteral("Abgelehnt");
                rows.back().ctime = QTime(0, 0);
                rows.back().abid = 0;
            }
        } else {
            rows.push_back(factory.randomCall(day));
        }
    }
    // Calls of the current day lie before the current time.
    if (today == Clock::today()) {
        const int nowSecs = QTime(0, 0).secsTo(Clock::now().time());
        for (CallRow& r : rows)
            if (r.date == today && QTime(0, 0).secsTo(r.time) > nowSecs)
                r.time = QTime(0, 0).addSecs(factory.bounded(nowSecs + 1));
    }
    std::stable_sort(rows.begin(), rows.end(), [](const CallRow& a, const CallRow& b) {
        return a.date != b.date ? a.date < b.date : a.time < b.time;
    });
    // Answering-machine messages are numbered in the order they were recorded.
    int abid = 0;
    for (CallRow& r : rows)
        if (r.abid > 0)
            r.abid = ++abid;
    return rows;
}

// Links the calls of each number to its contact with the statement the program itself uses.
int linkCalls(FbAttachment& db, FbTransaction& tx, const std::vector<StoredContact>& contacts)
{
    FbStatement st(db, &tx,
                   QStringLiteral("UPDATE LOG SET FROMBEZ = :FB,FROMANSCHLUSS = :FA,CID = :C WHERE (FROMPHONE = :FP)or(FROMSUBB = :FS)"));
    int linked = 0;
    for (const StoredContact& s : contacts) {
        if (!s.data->linked)
            continue;
        for (const DemoNumber& n : s.data->numbers) {
            st.setParam(u"FB", s.data->contbez);
            st.setParam(u"FA", n.label);
            st.setParam(u"C", s.lid);
            st.setParam(u"FP", dialledForm(n));
            st.setParam(u"FS", dialledForm(n));
            st.execute();
            linked += int(st.rowsAffected());
        }
    }
    return linked;
}

} // namespace

DemoStats fillDemo(FbAttachment& attachment, const QDate& today)
{
    DemoStats stats;
    FbTransaction tx(attachment);
    tx.start();
    try {
        stats.categories = insertCategories(attachment, tx);
        const std::vector<StoredContact> contacts = insertContacts(attachment, tx, stats);
        {
            LogWriter writer(attachment, tx);
            for (const CallRow& row : makeCalls(contacts, today)) {
                writer.insert(row);
                ++stats.calls;
            }
        }
        stats.linkedCalls = linkCalls(attachment, tx, contacts);
        tx.commit();
    } catch (...) {
        tx.rollbackQuietly();
        throw;
    }
    return stats;
}

qint64 generateCalls(FbAttachment& attachment, qint64 count, quint32 seed, const QDate& lastDay)
{
    if (count <= 0)
        return 0;
    constexpr int Days = 365;
    CallFactory factory(seed);
    // Real logs repeat their callers: most calls come from a pool of regulars.
    std::vector<Caller> regulars;
    regulars.reserve(4000);
    for (int i = 0; i < 4000; ++i)
        regulars.push_back(factory.randomCaller());

    FbTransaction tx(attachment);
    tx.start();
    try {
        LogWriter writer(attachment, tx);
        for (qint64 i = 0; i < count; ++i) {
            // Oldest day first, as the monitor writes them.
            const QDate day = lastDay.addDays(-qint64(Days - 1) + (i * Days) / count);
            const int pick = factory.bounded(100);
            CallRow row = pick < 75 ? factory.callWith(day, regulars[size_t(factory.bounded(int(regulars.size())))])
                                    : factory.randomCall(day);
            writer.insert(row);
        }
        tx.commit();
    } catch (...) {
        tx.rollbackQuietly();
        throw;
    }
    return count;
}

} // namespace orvanta::demo
