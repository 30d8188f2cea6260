#pragma once
// What a click on an anchor of the contact summary asks for. The summary writes three kinds of
// href: "Notiz_<LID>" (the notes window), "Mail_<address>" and "Web_<address>" (handed to the
// desktop). The addresses come from the database as anyone typed or imported them, so only
// web and mail targets ever reach the desktop; anything else is refused.

#include <QString>
#include <QUrl>

#include <functional>

namespace orvanta {

struct SummaryAnchor {
    enum class Kind { None, Note, Mail, Web };
    Kind kind = Kind::None;
    int noteLid = 0;   // Kind::Note
    QUrl url;          // Kind::Mail, Kind::Web; invalid when refused
    bool refused = false;
    QString target;    // the address as it was asked for (for the log when refused)
};

// Reads an href of the summary. A web address without "://" gets "http://" in front; one with
// a scheme other than http or https is refused, as is a mail address carrying a query (mail
// clients read "?attach=" and the like).
[[nodiscard]] SummaryAnchor parseSummaryAnchor(const QString& href);

// How an accepted address is opened; QDesktopServices by default, replaceable for tests.
using UrlOpener = std::function<bool(const QUrl&)>;
void setUrlOpener(UrlOpener opener);
[[nodiscard]] bool openUrl(const QUrl& url);

} // namespace orvanta
