#pragma once
// The contact-list test set-up with categories: contacts and categories put in with keys of the
// test's choosing, the generators moved past them so the program's own inserts do not collide.

#include "tests/contacts/ContactTestEnv.h"

namespace orvanta::test {

class CategoryTestEnv final {
public:
    ContactTestEnv& base() { return m_env; }
    TempDatabase& db() { return m_env.db(); }
    TDM2& dm() { return m_env.dm(); }
    ScriptedDialogService& dialogs() { return m_env.dialogs(); }
    QString file(const QString& name) const { return m_env.file(name); }
    void writeFile(const QString& name, const QByteArray& bytes) const { m_env.writeFile(name, bytes); }
    QString errorLogText() const { return m_env.errorLogText(); }

    void addCategory(int lid, const QString& name, const QString& remark = {})
    {
        db().exec(QStringLiteral("INSERT INTO KAT (LID, KATBEZ, BEMERKUNG) VALUES (%1, %2, %3)")
                      .arg(lid)
                      .arg(ContactTestEnv::lit(name), ContactTestEnv::lit(remark)));
        bumpGenerators();
    }
    // A contact with an address; with kid > 0 linked to that category by the link key lid + 100.
    void addContact(int lid, const QString& contbez, int kid = 0, const QString& ort = {})
    {
        m_env.add(lid, contbez, ort);
        if (kid > 0)
            db().exec(QStringLiteral("INSERT INTO CONKAT (LID, CID, KID) VALUES (%1, %2, %3)")
                          .arg(lid + 100)
                          .arg(lid)
                          .arg(kid));
        bumpGenerators();
    }
    int count(const QString& sql) { return db().scalar(sql).toInt(); }
    QString text(const QString& sql) { return db().scalar(sql).toString(); }

private:
    void bumpGenerators()
    {
        db().exec(QStringLiteral("SET GENERATOR GEN_KAT_ID TO 1000;\nSET GENERATOR GEN_CONKAT_ID TO 1000;"));
    }

    ContactTestEnv m_env;
};

} // namespace orvanta::test
