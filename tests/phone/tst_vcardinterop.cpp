// vCards exchanged with an independent implementation (Python's vobject, see vcard_vobject.py):
// its cards read here with every field in place, and ours read there with every field equal.

#include "phone/VCard.h"
#include "tests/TestPaths.h"
#include "tests/support/TestRegistry.h"

#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QTemporaryDir>
#include <QTest>

#include <algorithm>

using namespace orvanta;

namespace {

QJsonArray strings(const QStringList& list)
{
    return QJsonArray::fromStringList(list);
}

// Numbers and addresses in a fixed order: vobject writes properties sorted by name.
QJsonArray sorted(QJsonArray array)
{
    QList<QByteArray> keys;
    for (const QJsonValue& v : std::as_const(array))
        keys << QJsonDocument(v.toObject()).toJson(QJsonDocument::Compact);
    std::sort(keys.begin(), keys.end());
    QJsonArray out;
    for (const QByteArray& k : std::as_const(keys))
        out << QJsonDocument::fromJson(k).object();
    return out;
}

QJsonObject typed(const VCardTyped& entry)
{
    return {{QStringLiteral("value"), entry.value}, {QStringLiteral("types"), strings(entry.types)},
            {QStringLiteral("label"), entry.label}};
}

// A card in the shape the script prints.
QJsonObject shape(const VCardContact& card)
{
    QJsonArray adr, tel, email;
    for (const VCardAddress& a : card.addresses) {
        adr << QJsonObject{{QStringLiteral("types"), strings(a.types)},
                           {QStringLiteral("parts"), strings({a.poBox, a.extended, a.street, a.locality, a.region,
                                                              a.postalCode, a.country})}};
    }
    for (const VCardTyped& t : card.phones)
        tel << typed(t);
    for (const VCardTyped& m : card.emails)
        email << typed(m);
    QStringList org;
    if (!card.organization.isEmpty() || !card.department.isEmpty())
        org << card.organization;
    if (!card.department.isEmpty())
        org << card.department;
    return {{QStringLiteral("fn"), card.formattedName},
            {QStringLiteral("n"), strings({card.familyName, card.givenName, card.additionalNames, card.prefix,
                                           card.suffix})},
            {QStringLiteral("org"), strings(org)},
            {QStringLiteral("title"), card.title},
            {QStringLiteral("adr"), sorted(adr)},
            {QStringLiteral("tel"), sorted(tel)},
            {QStringLiteral("email"), sorted(email)},
            {QStringLiteral("url"), strings(card.urls)},
            {QStringLiteral("note"), card.note},
            {QStringLiteral("categories"), strings(card.categories)}};
}

QJsonArray normalized(const QJsonArray& cards)
{
    QJsonArray out;
    for (const QJsonValue& v : cards) {
        QJsonObject card = v.toObject();
        for (const char* key : {"adr", "tel", "email"})
            card[QLatin1String(key)] = sorted(card[QLatin1String(key)].toArray());
        out << card;
    }
    return out;
}

QJsonArray runScript(const QString& mode, const QString& path)
{
    QProcess p;
    p.start(QStringLiteral("/usr/bin/python3"),
            {QStringLiteral(ORVANTA_SOURCE_DIR "/tests/phone/vcard_vobject.py"), mode, path});
    if (!p.waitForFinished(60000) || p.exitStatus() != QProcess::NormalExit || p.exitCode() != 0) {
        qWarning().noquote() << "vobject failed:" << p.readAllStandardError();
        return {};
    }
    return QJsonDocument::fromJson(p.readAllStandardOutput()).array();
}

void compareCards(const QJsonArray& actual, const QJsonArray& expected)
{
    QCOMPARE(actual.size(), expected.size());
    for (qsizetype i = 0; i < actual.size(); ++i) {
        const QJsonObject a = actual.at(i).toObject();
        const QJsonObject e = expected.at(i).toObject();
        for (auto it = e.begin(); it != e.end(); ++it) {
            QVERIFY2(a.value(it.key()) == it.value(),
                     qPrintable(QStringLiteral("card %1, %2:\n  actual   %3\n  expected %4")
                                    .arg(i)
                                    .arg(it.key(),
                                         QString::fromUtf8(QJsonDocument(QJsonArray{a.value(it.key())}).toJson(QJsonDocument::Compact)),
                                         QString::fromUtf8(QJsonDocument(QJsonArray{it.value()}).toJson(QJsonDocument::Compact)))));
        }
    }
}

} // namespace

class TestVCardInterop : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void readsCardsWrittenByVobject()
    {
        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("vobject.vcf"));
        const QJsonArray expected = runScript(QStringLiteral("write"), path);
        QCOMPARE(expected.size(), 2);

        QFile file(path);
        QVERIFY(file.open(QIODevice::ReadOnly));
        const VCardReadResult result = readVCards(file.readAll());
        QVERIFY2(result.messages.isEmpty(), qPrintable(result.messages.join(QLatin1Char('\n'))));
        QJsonArray actual;
        for (const VCardContact& card : result.cards)
            actual << shape(card);
        compareCards(actual, normalized(expected));
    }

    void writesCardsVobjectReadsEqual()
    {
        VCardContact full;
        full.formattedName = QStringLiteral("Dr. Jürgen Müller, Jr.");
        full.familyName = QStringLiteral("Müller");
        full.givenName = QStringLiteral("Jürgen");
        full.additionalNames = QStringLiteral("Karl");
        full.prefix = QStringLiteral("Dr.");
        full.suffix = QStringLiteral("Jr.");
        full.organization = QStringLiteral("Müller; Söhne, KG");
        full.department = QStringLiteral("Vertrieb");
        full.title = QStringLiteral("Leiter\\Einkauf");
        full.addresses << VCardAddress{{QStringLiteral("work")}, QStringLiteral("Postfach 12"), QStringLiteral("3. OG"),
                                       QStringLiteral("Hauptstraße 1"), QStringLiteral("Berlin"),
                                       QStringLiteral("Berlin"), QStringLiteral("10115"), QStringLiteral("Deutschland")};
        full.phones << VCardTyped{QStringLiteral("+49 30 1234567"), {QStringLiteral("work"), QStringLiteral("voice")}, {}}
                    << VCardTyped{QStringLiteral("0171 7654321"), {QStringLiteral("cell")}, QStringLiteral("Handy, privat")};
        full.emails << VCardTyped{QStringLiteral("j.mueller@example.de"), {}, QStringLiteral("Büro")};
        full.urls << QStringLiteral("https://example.de/kontakt?a=1,b=2;c");
        full.note = QStringLiteral("Erste Zeile; mit Semikolon, Komma und \\ Rückstrich\nzweite Zeile: ")
            + QStringLiteral("äöüß€").repeated(30);
        full.categories = {QStringLiteral("Kunden"), QStringLiteral("Lieferanten, Partner")};
        VCardContact firm;
        firm.formattedName = QStringLiteral("Straßenbau AG");
        firm.organization = QStringLiteral("Straßenbau AG");
        firm.phones << VCardTyped{QStringLiteral("0043 1 5551234"), {QStringLiteral("fax")}, {}};

        QTemporaryDir dir;
        const QString path = dir.filePath(QStringLiteral("ours.vcf"));
        QFile file(path);
        QVERIFY(file.open(QIODevice::WriteOnly));
        file.write(writeVCards({full, firm}));
        file.close();

        const QJsonArray read = runScript(QStringLiteral("read"), path);
        compareCards(normalized(read), QJsonArray{shape(full), shape(firm)});
    }
};

ORVANTA_TEST(TestVCardInterop)
#include "tst_vcardinterop.moc"
