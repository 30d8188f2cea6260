#include "calllog/NoticeForms.h"

#include "ui/markup/MarkupPanel.h"
#include "ui/scheme/ColorScheme.h"

#include <QGuiApplication>
#include <QHBoxLayout>
#include <QLabel>
#include <QPushButton>
#include <QScreen>
#include <QVBoxLayout>

namespace orvanta {

NoticeForm::NoticeForm(const QString& heading, const QString& markup, QWidget* parent)
    : QDialog(parent, Qt::Dialog | Qt::WindowStaysOnTopHint | Qt::MSWindowsFixedSizeDialogHint)
{
    setWindowTitle(QStringLiteral("Hinweis"));
    setModal(true);
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(14, 12, 14, 12);
    m_heading = new QLabel(heading, this);
    m_heading->setObjectName(QStringLiteral("Heading"));
    QFont hf = m_heading->font();
    hf.setBold(true);
    m_heading->setFont(hf);
    layout->addWidget(m_heading);
    m_text = new MarkupPanel(this);
    m_text->setObjectName(QStringLiteral("MarkupText"));
    m_text->setText(markup);
    layout->addWidget(m_text, 1);
    auto* buttons = new QHBoxLayout;
    buttons->addStretch(1);
    m_close = new QPushButton(QStringLiteral("Schließen"), this);
    m_close->setObjectName(QStringLiteral("RzButton2"));
    m_close->setDefault(true);
    buttons->addWidget(m_close);
    layout->addLayout(buttons);
    connect(m_close, &QPushButton::clicked, this, &QDialog::accept);
    layout->setSizeConstraint(QLayout::SetFixedSize);
}

QString NoticeForm::heading() const
{
    return m_heading->text();
}

void NoticeForm::showEvent(QShowEvent* event)
{
    ApplyColorScheme();
    QDialog::showEvent(event);
    if (const QScreen* screen = QGuiApplication::primaryScreen())
        move(screen->availableGeometry().center() - rect().center());
}

void NoticeForm::ApplyColorScheme()
{
    QPalette pal = palette();
    pal.setColor(QPalette::Window, detailWindowColors(appColorScheme()).window);
    setPalette(pal);
    setAutoFillBackground(true);
}

THinweisForm::THinweisForm(QWidget* parent)
    : NoticeForm(QStringLiteral("Hinweis zur Kontaktbezeichnung:"), markupText(), parent)
{
    setObjectName(QStringLiteral("HinweisForm"));
}

const QString& THinweisForm::markupText()
{
    // Shown as written, the typing error of "übernehemen" included.
    static const QString text = QStringLiteral(
        "Sie können die Vorgabe übernehemen oder eine eigene möglichst treffende und<BR>"
        "aussagekräftige Kontaktbezeichnung eingeben. Ihre Kontakte werden in der Listen-<BR>"
        "bzw. Visitenkartenansicht durch diese Kontaktbezeichnung dargestellt.<BR>"
        "Als Richtlinie  ist folgendes zu empfehlen:<BR><BR>"
        "<IND x=\"5\"><B>'Name, Vorname'</B><IND x=\"155\">bei Kontakten ohne Firmenangabe oder<BR>"
        "<IND x=\"5\"><B>'Firma / Name, Vorname'</B><IND x=\"155\">bei Kontakten mit Firmen- und Personenangabe bzw.<BR>"
        "<IND x=\"5\"><B>'Firma'</B><IND x=\"155\">bei Kontakten ohne Personenangabe.<BR>");
    return text;
}

THinwAutoAblehnForm::THinwAutoAblehnForm(QWidget* parent)
    : NoticeForm(QStringLiteral("Hinweis zum automatischen Ablehnen:"), markupText(), parent)
{
    setObjectName(QStringLiteral("HinwAutoAblehnForm"));
}

const QString& THinwAutoAblehnForm::markupText()
{
    static const QString text = QStringLiteral(
        "Ist der Haken bei \"Ablehnen\" gesetzt, werden eingehende Anrufe von dieser Telefonnummer<BR>"
        "automatisch abgelehnt!<BR>"
        "Dabei wird der Anruf kurz angenommen und sofort wieder aufgelegt. Dieses Verfahren wird <BR>"
        "auch &quot;hartes Ablehnen&quot; genannt.<BR><BR>"
        "Bitte beachten Sie, dass dem Anrufer dadurch Kosten entstehen!");
    return text;
}

} // namespace orvanta
