#include "contacts/ContactCardRows.h"

#include <array>

namespace orvanta {
namespace {

constexpr std::array<ContactCardRow, 16> kRows{{
    {"cxGrid1DBCardView1LID", "LID", "", 0, false, false, false},
    {"cxGrid1DBCardView1CONTBEZ", "CONTBEZ", "Kontaktbezeichnung", 15, true, false, true},
    {"cxGrid1DBCardView1ANREDE", "ANREDE", "Anrede", 1, true, true, false},
    {"cxGrid1DBCardView1TITEL", "TITEL", "Titel", 2, false, true, false},
    {"cxGrid1DBCardView1DBCardViewRow2", nullptr, "Name", 3, true, true, false},
    {"cxGrid1DBCardView1NAME", "NAME", "Nachname", 16, false, false, false},
    {"cxGrid1DBCardView1VNAME", "VNAME", "Vorname", 17, false, false, false},
    {"cxGrid1DBCardView1FIRMA", "FIRMA", "Firma", 4, true, true, false},
    {"cxGrid1DBCardView1KATBEZ", "KATBEZ", "Kategorie", 5, true, true, false},
    {"cxGrid1DBCardView1STR", "STR", "Straße", 6, true, true, false},
    {"cxGrid1DBCardView1PLZ", "PLZ", "PLZ", 18, false, true, false},
    {"cxGrid1DBCardView1ORT", "ORT", "Ort", 19, false, true, false},
    {"cxGrid1DBCardView1DBCardViewRow1", nullptr, "PLZ / Ort", 7, true, true, false},
    {"cxGrid1DBCardView1ZUSATZ", "ZUSATZ", "Zusatz", 8, false, true, false},
    {"cxGrid1DBCardView1LAND", "LAND", "Land", 9, false, true, false},
    {"cxGrid1DBCardView1BUNDESLAND", "BUNDESLAND", "Bundesland", 10, false, true, false},
}};

} // namespace

std::span<const ContactCardRow> contactCardRows()
{
    return kRows;
}

QString contactCardName(const QString& surname, const QString& firstName)
{
    if (firstName.isEmpty())
        return surname;
    return surname.isEmpty() ? firstName : surname + QLatin1Char(' ') + firstName;
}

QString contactCardPlace(const QString& postCode, const QString& town)
{
    if (town.isEmpty())
        return postCode;
    return postCode.isEmpty() ? town : postCode + QStringLiteral("  ") + town;
}

} // namespace orvanta
