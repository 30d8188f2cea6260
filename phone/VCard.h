#pragma once
// vCard files (2.1, 3.0 and 4.0) read into plain contact cards, and cards written as vCard 4.0.
// Only the properties an address book keeps are read; everything else is passed over. A reader
// never fails: what it cannot use is listed in the result's messages.

#include <QByteArray>
#include <QByteArrayView>
#include <QList>
#include <QString>
#include <QStringList>

namespace orvanta {

struct VCardAddress {
    QStringList types; // lower case: "home", "work", …
    QString poBox;
    QString extended;
    QString street;
    QString locality;
    QString region;
    QString postalCode;
    QString country;

    friend bool operator==(const VCardAddress&, const VCardAddress&) = default;
};

// A number or e-mail address with its kinds ("cell", "home", "fax", …, lower case) and the label
// a program gave it (the "X-ABLabel" of the same property group), if any.
struct VCardTyped {
    QString value;
    QStringList types;
    QString label;

    friend bool operator==(const VCardTyped&, const VCardTyped&) = default;
};

struct VCardContact {
    QString formattedName; // FN
    // N: family; given; additional; prefix; suffix
    QString familyName;
    QString givenName;
    QString additionalNames;
    QString prefix;
    QString suffix;
    QString organization; // first component of ORG
    QString department;   // the further components of ORG, joined by ", "
    QString title;
    QList<VCardAddress> addresses;
    QList<VCardTyped> phones;
    QList<VCardTyped> emails;
    QStringList urls;
    QString note; // line breaks as '\n'
    QStringList categories;

    // True when the card names nobody and holds no number or address to keep.
    [[nodiscard]] bool isEmpty() const;

    friend bool operator==(const VCardContact&, const VCardContact&) = default;
};

// The name a card without FN is shown by: prefix, given, additional and family name and suffix,
// else the organisation.
[[nodiscard]] QString displayName(const VCardContact& card);

struct VCardReadResult {
    QList<VCardContact> cards;
    // One German line per thing passed over or repaired ("Zeile 7: …"), in file order.
    QStringList messages;
    // Cards that were begun but could not be used (no content); they are not in cards.
    int skippedCards = 0;
};

// Reads every card of a file's contents. Line breaks CR LF, LF or CR; a UTF-8 byte order mark
// and UTF-16 files with a byte order mark are understood. Text without a CHARSET parameter is
// UTF-8 when it is valid UTF-8, else Windows-1252.
[[nodiscard]] VCardReadResult readVCards(QByteArrayView contents);

// The cards as vCard 4.0: UTF-8, CR LF, lines folded at 75 octets, text values escaped.
[[nodiscard]] QByteArray writeVCards(const QList<VCardContact>& cards);

} // namespace orvanta
