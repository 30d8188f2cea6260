#pragma once
// What every contact-list test needs: a fresh database reached through the data module as at a
// real start, an error log and a program folder in a temporary folder, scripted dialogs, and a
// receiver for the messages the frame posts; plus a way to put contacts in.

#include "tests/support/MessageReceiver.h"
#include "tests/support/ProgramTestEnv.h"

#include <QFile>
#include <QTest>

namespace orvanta::test {

class ContactTestEnv final {
public:
    ContactTestEnv()
        : m_env(QDateTime(QDate(2024, 5, 15), QTime(12, 0)), ProgramTestEnv::ErrorLogSetup::Create)
    {
    }

    TempDatabase& db() { return m_env.db(); }
    TDM2& dm() { return m_env.dm(); }
    ScriptedDialogService& dialogs() { return m_env.dialogs(); }
    MessageReceiver& host() { return m_host; }
    QString file(const QString& name) const { return m_env.file(name); }
    void writeFile(const QString& name, const QByteArray& bytes) const { QVERIFY(m_env.writeFile(name, bytes)); }
    QString errorLogText() const
    {
        QFile f(m_env.errorLog()->filePath());
        return f.open(QIODevice::ReadOnly) ? QString::fromLatin1(f.readAll()) : QString();
    }

    // A SQL literal of a text: NULL for a null QString.
    static QString lit(const QString& v)
    {
        if (v.isNull())
            return QStringLiteral("NULL");
        QString q = v;
        q.replace(QLatin1Char('\''), QStringLiteral("''"));
        return QLatin1Char('\'') + q + QLatin1Char('\'');
    }

    struct Contact {
        int lid = 0;
        QString contbez, anrede, titel, vname, name, firma, abteilung, website, notiz;
        QString str, plz, ort, zusatz, land, bundesland;
        QString kategorie; // null: none
        bool address = true;
    };

    void addContact(const Contact& c)
    {
        db().exec(QStringLiteral("INSERT INTO CONTACT (LID, ANREDE, TITEL, NAME, VNAME, FIRMA, CONTBEZ, WEBSITE, "
                                 "ABTEILUNG, NOTIZ) VALUES (%1, %2, %3, %4, %5, %6, %7, %8, %9, %10)")
                      .arg(c.lid)
                      .arg(lit(c.anrede), lit(c.titel), lit(c.name), lit(c.vname), lit(c.firma), lit(c.contbez),
                           lit(c.website), lit(c.abteilung), lit(c.notiz)));
        if (c.address)
            db().exec(QStringLiteral("INSERT INTO ADDR (LID, CID, STR, PLZ, ORT, ZUSATZ, LAND, BUNDESLAND) VALUES "
                                     "(%1, %1, %2, %3, %4, %5, %6, %7)")
                          .arg(c.lid)
                          .arg(lit(c.str), lit(c.plz), lit(c.ort), lit(c.zusatz), lit(c.land), lit(c.bundesland)));
        if (!c.kategorie.isNull()) {
            int kid = m_categories.value(c.kategorie);
            if (kid == 0) {
                kid = static_cast<int>(m_categories.size()) + 1;
                m_categories.insert(c.kategorie, kid);
                db().exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ) VALUES (%1, %2)").arg(kid).arg(lit(c.kategorie)));
            }
            db().exec(QStringLiteral("INSERT INTO CONKAT (LID, CID, KID) VALUES (%1, %1, %2)").arg(c.lid).arg(kid));
        }
    }

    // A simple contact: designation, town and category.
    void add(int lid, const QString& contbez, const QString& ort = {}, const QString& kat = {},
             const QString& plz = {})
    {
        Contact c;
        c.lid = lid;
        c.contbez = contbez;
        c.name = contbez;
        c.ort = ort;
        c.plz = plz;
        c.kategorie = kat;
        addContact(c);
    }

    void addNumber(int lid, int cid, const QString& lc, const QString& vorw, const QString& number,
                   const QString& label, int autoReject, const QString& remark)
    {
        db().exec(QStringLiteral("INSERT INTO COM (LID, CID, KOMMBEZ, LC, VORW, NUMBER, BEMERKUNG, AUTOREJECT) "
                                 "VALUES (%1, %2, %3, %4, %5, %6, %7, %8)")
                      .arg(lid)
                      .arg(cid)
                      .arg(lit(label), lit(lc), lit(vorw), lit(number), lit(remark))
                      .arg(autoReject));
    }

    void addMail(int lid, int cid, const QString& address, const QString& remark)
    {
        db().exec(QStringLiteral("INSERT INTO E_MAIL (LID, CID, MAILADDR, BEMERK) VALUES (%1, %2, %3, %4)")
                      .arg(lid)
                      .arg(cid)
                      .arg(lit(address), lit(remark)));
    }

private:
    ProgramTestEnv m_env;
    MessageReceiver m_host;
    QHash<QString, int> m_categories;
};

} // namespace orvanta::test
