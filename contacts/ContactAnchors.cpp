#include "contacts/ContactAnchors.h"

#include <QDesktopServices>

namespace orvanta {
namespace {

UrlOpener& opener()
{
    static UrlOpener o;
    return o;
}

bool hasControlCharacters(const QString& text)
{
    for (const QChar c : text)
        if (c.unicode() < 0x20 || c.unicode() == 0x7F)
            return true;
    return false;
}

} // namespace

SummaryAnchor parseSummaryAnchor(const QString& href)
{
    SummaryAnchor a;
    // One kind per href, by its prefix: a website that merely contains "Mail_" must not also
    // start the mail client.
    if (href.startsWith(QLatin1String("Notiz_"))) {
        a.kind = SummaryAnchor::Kind::Note;
        bool ok = false;
        a.noteLid = href.mid(6).toInt(&ok);
        a.target = href.mid(6);
        a.refused = !ok || a.noteLid <= 0;
        return a;
    }
    if (href.startsWith(QLatin1String("Mail_"))) {
        a.kind = SummaryAnchor::Kind::Mail;
        a.target = href.mid(5);
        const QUrl url(QStringLiteral("mailto:") + a.target, QUrl::StrictMode);
        if (a.target.isEmpty() || hasControlCharacters(a.target) || a.target.contains(QLatin1Char('?'))
            || !url.isValid()) {
            a.refused = true;
            return a;
        }
        a.url = url;
        return a;
    }
    if (href.startsWith(QLatin1String("Web_"))) {
        a.kind = SummaryAnchor::Kind::Web;
        a.target = href.mid(4);
        QString address = a.target.trimmed();
        if (!address.contains(QLatin1String("://")))
            address.prepend(QStringLiteral("http://"));
        const QUrl url(address, QUrl::StrictMode);
        const QString scheme = url.scheme().toLower();
        if (a.target.isEmpty() || hasControlCharacters(a.target) || !url.isValid() || url.host().isEmpty()
            || (scheme != QLatin1String("http") && scheme != QLatin1String("https"))) {
            a.refused = true;
            return a;
        }
        a.url = url;
        return a;
    }
    a.target = href;
    a.refused = true;
    return a;
}

void setUrlOpener(UrlOpener o)
{
    opener() = std::move(o);
}

bool openUrl(const QUrl& url)
{
    if (opener())
        return opener()(url);
    return QDesktopServices::openUrl(url);
}

} // namespace orvanta
