#include "tools/oeimp/ContactImporter.h"

#include "contacts/ContactPersistence.h"
#include "db/TDM2.h"
#include "db/TransactionWork.h"
#include "phone/ContactCsv.h"
#include "platform/Windows1252.h"
#include "ui/rtf/RtfWriter.h"

#include <QFile>
#include <QFileInfo>
#include <QTextDocument>

namespace orvanta::oeimp {

namespace {

// Files beyond this are no address book; reading them would only exhaust memory.
constexpr qint64 kMaxFileSize = 256 * 1024 * 1024;

constexpr const char* kFindByNumber =
    "SELECT FIRST 1 C.LID FROM CONTACT C WHERE UPPER(C.CONTBEZ) = UPPER(:B) AND EXISTS "
    "(SELECT 1 FROM COM M WHERE M.CID = C.LID AND (M.LCVORWNUMBER = :LCVN OR M.VORWNUMBER = :VN))";
constexpr const char* kFindByName = "SELECT FIRST 1 LID FROM CONTACT WHERE UPPER(CONTBEZ) = UPPER(:B)";
constexpr const char* kFindCategory = "SELECT FIRST 1 LID FROM KAT WHERE UPPER(KATBEZ) = UPPER(:K)";
constexpr const char* kInsertCategory = "EXECUTE PROCEDURE P_KAT_INSERT (:KID, :KA, :BEM)";

} // namespace

ImportPlan readImportFile(const QString& path, int homeCountry)
{
    ImportPlan plan;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        plan.error = QStringLiteral("Die Datei \"%1\" kann nicht gelesen werden: %2").arg(path, file.errorString());
        return plan;
    }
    if (file.size() > kMaxFileSize) {
        plan.error = QStringLiteral("Die Datei \"%1\" ist mit %2 MB zu groß für ein Adressbuch.")
                         .arg(path)
                         .arg(file.size() / (1024 * 1024));
        return plan;
    }
    const QByteArray bytes = file.readAll();
    const bool csv = QFileInfo(path).suffix().compare(QLatin1String("csv"), Qt::CaseInsensitive) == 0;
    const VCardReadResult read = csv ? readContactCsv(bytes) : readVCards(bytes);
    plan.messages = read.messages;
    plan.skipped = read.skippedCards;
    for (const VCardContact& card : read.cards) {
        CardImport entry = contactFromCard(card, homeCountry);
        // Characters the code page lacks would become "?": such a note is kept as rich text,
        // which the note window and the export read like any other.
        if (!entry.noteText.isEmpty() && fromWindows1252(toWindows1252(entry.noteText)) != entry.noteText) {
            QTextDocument doc;
            doc.setPlainText(entry.noteText);
            entry.contact.StoreNotes(RtfWriter::write(doc), entry.noteText);
        }
        plan.contacts << std::move(entry);
    }
    if (plan.contacts.isEmpty() && plan.skipped == 0 && plan.messages.isEmpty())
        plan.error = csv ? QStringLiteral("Die Datei enthält keine Kontakte.")
                         : QStringLiteral("Die Datei enthält keine vCard.");
    return plan;
}

bool ContactImporter::isPresent(const TvkMiniKontakt& contact)
{
    return presence(contact) != Presence::Absent;
}

ContactImporter::Presence ContactImporter::presence(const TvkMiniKontakt& contact)
{
    FbStatement& sql = m_dm.NumCheck_SQL;
    bool found = false;
    const bool ok = runInTransaction(m_dm.NumCheck_SQLTS, QStringLiteral("# OEImp - Kontakt suchen"), [&] {
        sql.close();
        const auto hit = [&] {
            sql.execute();
            const bool any = sql.next();
            sql.close();
            return any;
        };
        if (contact.KD().isEmpty()) {
            sql.setSql(QString::fromLatin1(kFindByName));
            sql.setParam(u"B", contact.CONTBEZ());
            found = hit();
            return;
        }
        sql.setSql(QString::fromLatin1(kFindByNumber));
        for (const TvkKommItem& e : contact.KD()) {
            sql.setParam(u"B", contact.CONTBEZ());
            sql.setParam(u"LCVN", e.LCVORWNUMBER.isEmpty() ? QStringLiteral("-") : e.LCVORWNUMBER);
            sql.setParam(u"VN", e.VORWNUMBER.isEmpty() ? QStringLiteral("-") : e.VORWNUMBER);
            if (hit()) {
                found = true;
                return;
            }
        }
    }, ErrorReport::Log);
    sql.close();
    if (!ok)
        return Presence::Unknown;
    return found ? Presence::Present : Presence::Absent;
}

bool ContactImporter::ensureCategory(const QString& name)
{
    if (name.trimmed().isEmpty() || m_knownCategories.contains(name.toUpper()))
        return true;
    FbStatement& sql = m_dm.IBSQL1;
    const bool ok = runInTransaction(m_dm.IBSQLTS, QStringLiteral("# OEImp - Kategorie anlegen"), [&] {
        sql.close();
        sql.setSql(QString::fromLatin1(kFindCategory));
        sql.setParam(u"K", name.trimmed());
        sql.execute();
        const bool exists = sql.next();
        sql.close();
        if (exists)
            return true;
        sql.setSql(QString::fromLatin1(kInsertCategory));
        sql.setParam(u"KID", 0);
        sql.setParam(u"KA", name.trimmed());
        sql.setParam(u"BEM", QString());
        sql.execute();
        const int result = sql.isNull(0) ? 0 : sql.asInt(0);
        sql.close();
        return result > 0 || result == -2; // -2: created meanwhile under another case
    }, ErrorReport::Log);
    sql.close();
    if (ok)
        m_knownCategories << name.toUpper();
    return ok;
}

ImportOutcome ContactImporter::importContact(const TvkMiniKontakt& contact)
{
    if (!m_dm.IBDatabase1.isConnected())
        return ImportOutcome::Failed;
    switch (presence(contact)) {
    case Presence::Present: return ImportOutcome::Skipped;
    // Importing blindly could double the contact.
    case Presence::Unknown: return ImportOutcome::Failed;
    case Presence::Absent: break;
    }
    // Without its category the contact is still worth having; the category stays empty then.
    TvkMiniKontakt record = contact;
    if (!ensureCategory(record.KATBEZ()))
        record.setKATBEZ(QString());
    return InsertConData(m_dm, &record) ? ImportOutcome::Imported : ImportOutcome::Failed;
}

} // namespace orvanta::oeimp
