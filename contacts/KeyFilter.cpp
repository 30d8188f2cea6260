#include "contacts/KeyFilter.h"

#include <QKeyEvent>
#include <QLineEdit>

namespace orvanta {

namespace {

// Where a typed character lands: the start of the selection, else the caret.
int insertPosition(const QLineEdit& edit)
{
    return edit.hasSelectedText() ? edit.selectionStart() : edit.cursorPosition();
}

} // namespace

KeyFilter::KeyFilter(QLineEdit* edit, Accept accept)
    : QObject(edit)
    , m_accept(std::move(accept))
{
}

void KeyFilter::install(QLineEdit* edit, Accept accept)
{
    edit->installEventFilter(new KeyFilter(edit, std::move(accept)));
}

bool KeyFilter::eventFilter(QObject* watched, QEvent* event)
{
    if (event->type() != QEvent::KeyPress)
        return false;
    auto* edit = qobject_cast<QLineEdit*>(watched);
    const auto* key = static_cast<QKeyEvent*>(event);
    if (!edit || key->modifiers().testAnyFlags(Qt::ControlModifier | Qt::AltModifier | Qt::MetaModifier))
        return false;
    const QString text = key->text();
    for (const QChar c : text)
        if (c.isPrint() && !m_accept(*edit, c))
            return true;
    return false;
}

bool KeyFilter::countryCode(const QLineEdit& edit, QChar c)
{
    // A digit in front of the "+" would leave it no longer leading.
    if (digits(edit, c))
        return insertPosition(edit) > 0 || edit.hasSelectedText() || !edit.text().startsWith(QLatin1Char('+'));
    if (c != QLatin1Char('+') || insertPosition(edit) != 0)
        return false;
    QString rest = edit.text();
    if (edit.hasSelectedText())
        rest.remove(edit.selectionStart(), edit.selectedText().size());
    return !rest.contains(QLatin1Char('+'));
}

bool KeyFilter::digits(const QLineEdit&, QChar c)
{
    return c >= QLatin1Char('0') && c <= QLatin1Char('9');
}

bool KeyFilter::phoneNumber(const QLineEdit& edit, QChar c)
{
    return digits(edit, c) || QStringView(u" #+-/").contains(c);
}

bool KeyFilter::noLeadingBlank(const QLineEdit& edit, QChar c)
{
    return c != QLatin1Char(' ') || edit.cursorPosition() > 0;
}

} // namespace orvanta
