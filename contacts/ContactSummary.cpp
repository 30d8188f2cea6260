#include "contacts/ContactSummary.h"

#include "contacts/ContactStatements.h"
#include "db/TDM2.h"
#include "platform/ErrorLog.h"
#include "ui/markup/MarkupPanel.h"

namespace orvanta {
namespace {

const QString kInd35 = QStringLiteral("<IND x=\"35\">");
const QString kInd310 = QStringLiteral("<IND x=\"310\">");
const QString kBr = QStringLiteral("<BR>");

// A column's text, empty for null or a column the statement does not have.
QString textOf(const DataSet& q, const char* field)
{
    if (q.fieldIndex(QString::fromLatin1(field)) < 0)
        return {};
    return q.fieldByName(QString::fromLatin1(field)).asString();
}

void openFor(DataSet& q, const char* statement, int lid)
{
    q.close();
    q.setCommandText(QString::fromLatin1(statement));
    q.setParam(QStringLiteral("id"), lid);
    q.open();
}

// The contact and address block; false when the contact does not exist.
bool appendContact(DataSet& q, int lid, QStringList& out)
{
    openFor(q, contactsql::kSelectDetail, lid);
    if (!q.isActive() || q.rowCount() == 0)
        return false;
    q.first();
    const QString katbez = textOf(q, "KATBEZ");
    QString title = QStringLiteral("<BR>  <IMG src=\"idx:0\" align=\"middle\">  <B>") + textOf(q, "CONTBEZ");
    if (!katbez.isEmpty())
        title += QStringLiteral("  -  ") + katbez;
    out << title + QStringLiteral("</B><BR><BR>");
    out << kInd35 + QStringLiteral("<B><U>Kontakt</U>") + kInd310 + QStringLiteral("<U>Adresse</U></B><BR>");

    QStringList contact;
    QStringList address;
    const auto addIf = [](QStringList& column, const QString& indent, const QString& value) {
        if (!value.isEmpty())
            column << indent + value;
    };
    addIf(contact, kInd35, textOf(q, "ANREDE"));
    QString name;
    for (const char* part : {"TITEL", "VNAME"}) {
        const QString v = textOf(q, part);
        if (!v.isEmpty())
            name += v + QLatin1Char(' ');
    }
    name += textOf(q, "NAME");
    addIf(contact, kInd35, name);
    addIf(contact, kInd35, textOf(q, "FIRMA"));
    addIf(contact, kInd35, textOf(q, "ABTEILUNG"));
    const QString web = textOf(q, "WEBSITE");
    if (!web.isEmpty())
        contact << kInd35 + QStringLiteral("<A href=\"Web_") + web + QStringLiteral("\">") + web + QStringLiteral("</A>");
    if (!textOf(q, "NOTIZ").isEmpty())
        contact << kInd35 + QStringLiteral("<A href=\"Notiz_") + QString::number(lid) + QStringLiteral("\">Notizen</A>");

    addIf(address, kInd310, textOf(q, "STR"));
    addIf(address, kInd310, textOf(q, "ZUSATZ"));
    const QString plz = textOf(q, "PLZ");
    addIf(address, kInd310, (plz.isEmpty() ? QString() : plz + QStringLiteral("  ")) + textOf(q, "ORT"));
    addIf(address, kInd310, textOf(q, "BUNDESLAND"));
    addIf(address, kInd310, textOf(q, "LAND"));

    const qsizetype rows = std::max(contact.size(), address.size());
    for (qsizetype i = 0; i < rows; ++i) {
        if (i < contact.size() && i < address.size())
            out << contact[i] + address[i] + kBr;
        else
            out << (i < contact.size() ? contact[i] : address[i]) + kBr;
    }
    out << kBr;
    q.close();
    return true;
}

void appendNumbers(DataSet& q, int lid, QStringList& out)
{
    openFor(q, contactsql::kSelectNumbers, lid);
    if (!q.isActive() || q.rowCount() == 0)
        return;
    out << kInd35 + QStringLiteral("<B><U>Telekommunikationsdaten</U></B><BR><BR>");
    for (q.first(); !q.eof(); q.next()) {
        QString line = kInd35;
        const QString lc = textOf(q, "LC");
        const QString vorw = textOf(q, "VORW");
        const QString number = textOf(q, "NUMBER");
        const QString label = textOf(q, "KOMMBEZ");
        if (!lc.isEmpty())
            line += lc + QLatin1Char(' ');
        if (!vorw.isEmpty())
            line += QLatin1Char('(') + vorw + QStringLiteral(") - ");
        if (!number.isEmpty())
            line += number + QLatin1Char(' ');
        if (!label.isEmpty())
            line += QStringLiteral(" <B>") + label + QStringLiteral("</B> ");
        if (q.fieldIndex(u"AUTOREJECT") >= 0 && q.fieldByName(u"AUTOREJECT").asInteger() == 1)
            line += QStringLiteral("  <FONT color=\"clred\">(automatisch Ablehnen)</FONT>");
        line += kBr;
        out << line;
        const QString remark = textOf(q, "BEMERKUNG");
        if (!remark.isEmpty())
            out << QStringLiteral("<IND x=\"50\"><I>") + remark + QStringLiteral("</I><BR>");
    }
    out << kBr;
    q.close();
}

void appendMails(DataSet& q, int lid, QStringList& out)
{
    openFor(q, contactsql::kSelectMails, lid);
    if (!q.isActive() || q.rowCount() == 0)
        return;
    out << kInd35 + QStringLiteral("<B><U>Emailadressen</U></B><BR><BR>");
    for (q.first(); !q.eof(); q.next()) {
        QString line = kInd35;
        const QString addr = textOf(q, "MAILADDR");
        // The table names the remark BEMERK; older databases called it BEMERKUNG.
        QString remark = textOf(q, "BEMERK");
        if (remark.isEmpty())
            remark = textOf(q, "BEMERKUNG");
        if (!addr.isEmpty())
            line += QStringLiteral("<A href=\"Mail_") + addr + QStringLiteral("\">") + addr + QStringLiteral("</A>");
        if (!remark.isEmpty())
            line += QStringLiteral(" - <I>") + remark + QStringLiteral("</I>");
        out << line + kBr;
    }
    q.close();
}

} // namespace

QStringList contactSummaryLines(TDM2& dm, int lid)
{
    if (lid <= 0)
        return {kEmptySummary};
    QStringList out;
    DataSet& q = dm.GetDetailQuery;
    // Only reads: each statement opens on a fresh snapshot of the detail transaction (the
    // query restarts it), and the transaction is left committed.
    try {
        const bool found = appendContact(q, lid, out);
        if (found) {
            appendNumbers(q, lid, out);
            appendMails(q, lid, out);
        }
        q.close();
        TDM2::commitIfActive(dm.DetailTS);
        if (!found)
            return {kEmptySummary};
    } catch (const std::exception& e) {
        q.close();
        dm.DetailTS.rollbackQuietly();
        reportError(QStringLiteral("# _getHTMLcontactdata - SetHTMLStaticText"), &e);
        return {kEmptySummary};
    }
    return out;
}

void SetHTMLStaticText(MarkupPanel* panel, TDM2& dm, int lid)
{
    if (!panel)
        return;
    panel->setLines(contactSummaryLines(dm, lid));
}

} // namespace orvanta
