#pragma once
// The address book of the demo: people and companies in Germany, Austria and Switzerland.

#include <QString>
#include <QStringList>

#include <vector>

namespace orvanta::demo {

struct DemoNumber {
    QString label; // KOMMBEZ
    QString lc;
    QString vorw;
    QString number;
    QString remark;
    bool autoReject = false;
};

struct DemoMail {
    QString address;
    QString remark;
};

struct DemoContact {
    QString anrede, titel, vname, name, firma, abteilung, website, contbez, kategorie;
    QString str, plz, ort, zusatz, land, bundesland;
    std::vector<DemoNumber> numbers;
    std::vector<DemoMail> mails;
    QStringList note; // paragraphs; empty: no note
    int callWeight = 1; // how often this contact shows up in the log
    bool linked = true; // false: its calls are left for the user to link
};

[[nodiscard]] const QStringList& demoCategories();
[[nodiscard]] const std::vector<DemoContact>& demoContacts();

// The number as a caller's line reports it in Germany ("030…", "0043…").
[[nodiscard]] QString dialledForm(const DemoNumber& n);

} // namespace orvanta::demo
