#pragma once
// A contact record as an exchange card and back: what the address book keeps is mapped onto the
// vCard properties other programs understand, and a card from elsewhere becomes a new contact
// record (numbers split with the area-code tables).

#include "phone/TvkMiniKontakt.h"
#include "phone/VCard.h"

#include <QString>
#include <QStringList>

namespace orvanta {

// A written number split as the contact record stores it: "+49 30 6148273", "0049-30-6148273"
// and (home country Germany) "030 6148273" all give LC "0049", VORW "30", NUMBER "6148273".
// Numbers of other countries keep their international form in NUMBER; a number whose area code
// is not listed keeps all its digits in NUMBER. homeCountry: 1 Germany, 2 Austria, 3 Switzerland.
struct NumberParts {
    QString LC;
    QString VORW;
    QString NUMBER;
};
[[nodiscard]] NumberParts splitDialledNumber(QStringView written, int homeCountry);

// The number in international form, "+49 30 6148273", when it has a country code; else the area
// code and number as stored.
[[nodiscard]] QString writtenNumber(const TvkKommItem& item);

// The label of a number from its vCard kinds when the card gives none: "Handy", "Fax", "Telefon".
[[nodiscard]] QString numberLabel(const VCardTyped& phone);

struct CardImport {
    TvkMiniKontakt contact; // every number and address New
    // German notes on what did not fit ("2. Adresse nicht übernommen", values cut to width).
    QStringList notes;
    // The whole note as text; the record holds it in the Windows code page, which not every
    // character has (the caller may store it as rich text instead).
    QString noteText;
};
[[nodiscard]] CardImport contactFromCard(const VCardContact& card, int homeCountry);

// The contact as a card; the note is given as plain text (the stored one may be rich text).
[[nodiscard]] VCardContact cardFromContact(const TvkMiniKontakt& contact, const QString& notePlainText);

// Salutations that start a name prefix and are kept apart from the title ("Herr Dr." is the
// salutation "Herr" and the title "Dr.").
[[nodiscard]] bool isSalutation(const QString& word);

} // namespace orvanta
