#include "contacts/EntryEditors.h"

#include "contacts/ContactNotices.h"
#include "contacts/KeyFilter.h"
#include "ui/scheme/ColorScheme.h"

#include <QAction>
#include <QCheckBox>
#include <QGridLayout>
#include <QGuiApplication>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QScreen>
#include <QStyle>
#include <QToolButton>
#include <QVBoxLayout>

namespace orvanta {

EntryEditorBase::EntryEditorBase(const QString& caption, const QString& header, QWidget* parent)
    : QDialog(parent, Qt::Dialog | Qt::WindowStaysOnTopHint | Qt::MSWindowsFixedSizeDialogHint)
{
    setWindowTitle(caption);
    setModal(true);
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 8);
    auto* band = new QLabel(header, this);
    band->setObjectName(QStringLiteral("Sh1"));
    band->setContentsMargins(12, 8, 12, 8);
    QFont bf = band->font();
    bf.setBold(true);
    band->setFont(bf);
    band->setAutoFillBackground(true);
    layout->addWidget(band);
    m_form = new QWidget(this);
    m_form->setObjectName(QStringLiteral("Panel1"));
    auto* grid = new QGridLayout(m_form);
    grid->setContentsMargins(14, 8, 14, 8);
    layout->addWidget(m_form, 1);
}

QLineEdit* EntryEditorBase::addField(const char* name, const QString& label, int maxLength)
{
    auto* grid = static_cast<QGridLayout*>(m_form->layout());
    auto* edit = new QLineEdit(m_form);
    edit->setObjectName(QLatin1String(name));
    if (maxLength > 0)
        edit->setMaxLength(maxLength);
    auto* l = new QLabel(label, m_form);
    l->setBuddy(edit);
    grid->addWidget(l, m_row, 0, Qt::AlignLeft | Qt::AlignVCenter);
    grid->addWidget(edit, m_row, 1);
    ++m_row;
    connect(edit, &QLineEdit::textChanged, this, &EntryEditorBase::okUpdate);
    return edit;
}

void EntryEditorBase::addButtons(const char* okAction)
{
    auto* action = m_okAction = new QAction(QStringLiteral("OK"), this);
    action->setObjectName(QLatin1String(okAction));
    connect(action, &QAction::triggered, this, &EntryEditorBase::okExecute);
    m_okButton = new QPushButton(QStringLiteral("OK"), this);
    m_okButton->setObjectName(QStringLiteral("RzButton1"));
    m_okButton->setDefault(true);
    connect(m_okButton, &QPushButton::clicked, action, &QAction::trigger);
    connect(action, &QAction::changed, m_okButton, [this, action] { m_okButton->setEnabled(action->isEnabled()); });
    m_cancelButton = new QPushButton(QStringLiteral("Abbrechen"), this);
    m_cancelButton->setObjectName(QStringLiteral("RzButton2"));
    connect(m_cancelButton, &QPushButton::clicked, this, &QDialog::reject);
    auto* row = new QHBoxLayout;
    row->setContentsMargins(14, 0, 14, 0);
    row->addStretch(1);
    row->addWidget(m_okButton);
    row->addWidget(m_cancelButton);
    static_cast<QVBoxLayout*>(layout())->addLayout(row);
}

void EntryEditorBase::okUpdate()
{
    if (m_okAction)
        m_okAction->setEnabled(okAllowed());
}

void EntryEditorBase::okExecute()
{
    if (!okAllowed())
        return;
    takeFields();
    m_ok = true;
    accept();
}

void EntryEditorBase::showEvent(QShowEvent* event)
{
    applyColorScheme();
    FormShow();
    okUpdate();
    QDialog::showEvent(event);
    if (const QScreen* screen = QGuiApplication::primaryScreen())
        move(screen->availableGeometry().center() - rect().center());
}

void EntryEditorBase::applyColorScheme()
{
    const EditorDialogColors& c = editorDialogColors(appColorScheme());
    QPalette pal = palette();
    pal.setColor(QPalette::Window, c.panel);
    pal.setColor(QPalette::Light, c.buttonHighlight);
    pal.setColor(QPalette::Mid, c.border);
    setPalette(pal);
    setAutoFillBackground(true);
    if (auto* band = findChild<QLabel*>(QStringLiteral("Sh1"))) {
        QPalette bp = band->palette();
        bp.setColor(QPalette::Window, c.headerStart);
        band->setPalette(bp);
    }
}

Tcomeditform::Tcomeditform(QWidget* parent)
    : EntryEditorBase(QStringLiteral("Kommunikationsdaten"), QStringLiteral("Kommunikationsdaten\nneu/bearbeiten"),
                      parent)
{
    setObjectName(QStringLiteral("comeditform"));
    m_kommbez = addField("RzEdit2", QStringLiteral("Bezeichnung (z.B.: \"Tel.Büro\"):"), 20);
    m_lc = addField("RzEdit1", QStringLiteral("Länder-\nkennung:"), 5);
    m_vorw = addField("RzEdit3", QStringLiteral("Vorwahl:"), 10);
    m_number = addField("RzEdit4", QStringLiteral("Telefonnummer:"), 15);
    m_remark = addField("RzEdit5", QStringLiteral("Bemerkung:"), 40);
    KeyFilter::install(m_kommbez, &KeyFilter::noLeadingBlank);
    KeyFilter::install(m_lc, &KeyFilter::countryCode);
    KeyFilter::install(m_vorw, &KeyFilter::digits);
    KeyFilter::install(m_number, &KeyFilter::phoneNumber);

    auto* grid = static_cast<QGridLayout*>(m_form->layout());
    auto* rejectRow = new QHBoxLayout;
    m_reject = new QCheckBox(QStringLiteral("Ablehnen"), m_form);
    m_reject->setObjectName(QStringLiteral("RzCheckBox1"));
    auto* hint = new QToolButton(m_form);
    hint->setObjectName(QStringLiteral("RzBitBtn1"));
    hint->setToolTip(QStringLiteral("Hinweis"));
    hint->setIcon(style()->standardIcon(QStyle::SP_MessageBoxInformation));
    connect(hint, &QToolButton::clicked, this, [this] {
        if (contactNotices().autoRejectHint)
            contactNotices().autoRejectHint(this);
    });
    rejectRow->addWidget(m_reject);
    rejectRow->addWidget(hint);
    rejectRow->addStretch(1);
    grid->addLayout(rejectRow, 5, 1);
    addButtons("comeditfo_ok");
    setTabOrder(m_kommbez, m_lc);
    setTabOrder(m_lc, m_vorw);
    setTabOrder(m_vorw, m_number);
    setTabOrder(m_number, m_remark);
    setTabOrder(m_remark, m_reject);
    setTabOrder(m_reject, hint);
    setTabOrder(hint, m_okButton);
    setTabOrder(m_okButton, m_cancelButton);
    setFixedSize(407, 281);
}

void Tcomeditform::FormShow()
{
    m_kommbez->setText(KOMMBEZ);
    m_lc->setText(LC);
    m_vorw->setText(VORW);
    m_number->setText(NUMBER);
    m_remark->setText(BEMERKUNG);
    m_reject->setChecked(AUTOREJECT);
    m_kommbez->setFocus();
}

bool Tcomeditform::okAllowed() const
{
    return !m_kommbez->text().isEmpty() && !m_number->text().isEmpty();
}

void Tcomeditform::takeFields()
{
    KOMMBEZ = m_kommbez->text();
    LC = m_lc->text();
    VORW = m_vorw->text();
    NUMBER = m_number->text();
    BEMERKUNG = m_remark->text();
    AUTOREJECT = m_reject->isChecked();
}

Tmaileditform::Tmaileditform(QWidget* parent)
    : EntryEditorBase(QStringLiteral("Email-Adresse"), QStringLiteral("Email-Adresse\nneu/bearbeiten"), parent)
{
    setObjectName(QStringLiteral("maileditform"));
    m_addr = addField("RzEdit2", QStringLiteral("Email-Adresse:"), 40);
    m_remark = addField("RzEdit5", QStringLiteral("Bemerkung:"), 40);
    KeyFilter::install(m_addr, &KeyFilter::noLeadingBlank);
    addButtons("mailedit_ok");
    setTabOrder(m_addr, m_remark);
    setTabOrder(m_remark, m_okButton);
    setTabOrder(m_okButton, m_cancelButton);
    setFixedSize(407, 194);
}

void Tmaileditform::FormShow()
{
    m_addr->setText(MAILADDR);
    m_remark->setText(BEMERK);
    m_addr->setFocus();
}

bool Tmaileditform::okAllowed() const
{
    return !m_addr->text().isEmpty();
}

void Tmaileditform::takeFields()
{
    MAILADDR = m_addr->text();
    BEMERK = m_remark->text();
}

} // namespace orvanta
