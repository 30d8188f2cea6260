#include "categories/CategoryDialogs.h"

#include "platform/ErrorLog.h"
#include "ui/grid/GridCollation.h"
#include "ui/scheme/ColorScheme.h"

#include <QAction>
#include <QCloseEvent>
#include <QGridLayout>
#include <QHBoxLayout>
#include <QKeyEvent>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QVBoxLayout>

#include <algorithm>

namespace orvanta {

// ---------------------------------------------------------------------------------------------
// Shared frame

KatDialogBase::KatDialogBase(const QString& caption, const QString& headerLine2, QWidget* parent)
    : QDialog(parent, Qt::Dialog | Qt::WindowStaysOnTopHint | Qt::MSWindowsFixedSizeDialogHint)
{
    setWindowTitle(caption);
    setModal(true);
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 8);
    m_header = new QLabel(QStringLiteral("<b>Kategorie</b><br>") + headerLine2, this);
    m_header->setObjectName(QStringLiteral("Sh1"));
    m_header->setContentsMargins(12, 6, 12, 6);
    m_header->setAutoFillBackground(true);
    layout->addWidget(m_header);
    m_body = new QWidget(this);
    m_body->setObjectName(QStringLiteral("Panel1"));
    layout->addWidget(m_body, 1);
}

void KatDialogBase::addButtons(QAction* ok)
{
    addAction(ok);
    m_ok = new QPushButton(QStringLiteral("OK"), this);
    m_ok->setObjectName(QStringLiteral("RzB1"));
    m_ok->setDefault(true);
    connect(m_ok, &QPushButton::clicked, ok, &QAction::trigger);
    connect(ok, &QAction::changed, m_ok, [this, ok] { m_ok->setEnabled(ok->isEnabled()); });
    m_cancel = new QPushButton(QStringLiteral("Abbrechen"), this);
    m_cancel->setObjectName(QStringLiteral("RzB2"));
    connect(m_cancel, &QPushButton::clicked, this, &QDialog::reject);
    auto* row = new QHBoxLayout;
    row->setContentsMargins(14, 0, 14, 0);
    row->addStretch(1);
    row->addWidget(m_ok);
    row->addWidget(m_cancel);
    static_cast<QVBoxLayout*>(layout())->addLayout(row);
}

void KatDialogBase::applyColorScheme()
{
    const EditorDialogColors& c = editorDialogColors(appColorScheme());
    QPalette pal = palette();
    pal.setColor(QPalette::Window, c.panel);
    pal.setColor(QPalette::Mid, c.border);
    setPalette(pal);
    setAutoFillBackground(true);
    QPalette hp = m_header->palette();
    hp.setColor(QPalette::Window, c.headerStart);
    m_header->setPalette(hp);
}

// ---------------------------------------------------------------------------------------------
// Tkateditform

Tkateditform::Tkateditform(QWidget* parent)
    : KatDialogBase(QStringLiteral("Kategorie neu/bearbeiten"), QStringLiteral("neu/bearbeiten"), parent)
{
    setObjectName(QStringLiteral("kateditform"));
    auto* grid = new QVBoxLayout(m_body);
    grid->setContentsMargins(14, 8, 14, 8);
    m_rzE1 = new QLineEdit(m_body);
    m_rzE1->setObjectName(QStringLiteral("RzE1"));
    m_rzE1->setMaxLength(30);
    m_rzE2 = new QLineEdit(m_body);
    m_rzE2->setObjectName(QStringLiteral("RzE2"));
    m_rzE2->setMaxLength(40);
    auto* l1 = new QLabel(QStringLiteral("Kategorie:"), m_body);
    l1->setBuddy(m_rzE1);
    auto* l2 = new QLabel(QStringLiteral("Bemerkung:"), m_body);
    l2->setBuddy(m_rzE2);
    grid->addWidget(l1);
    grid->addWidget(m_rzE1);
    grid->addWidget(l2);
    grid->addWidget(m_rzE2);
    setMinimumWidth(320);
    m_rzE1->installEventFilter(this);
    connect(m_rzE1, &QLineEdit::textChanged, this, [this] {
        if (!m_filling)
            m_changed = true;
        katedit_okUpdate();
    });

    m_katedit_ok = new QAction(QStringLiteral("OK"), this);
    m_katedit_ok->setObjectName(QStringLiteral("katedit_ok"));
    connect(m_katedit_ok, &QAction::triggered, this, &Tkateditform::katedit_okExecute);
    addButtons(m_katedit_ok);
}

void Tkateditform::showEvent(QShowEvent* event)
{
    FormShow();
    QDialog::showEvent(event);
}

void Tkateditform::FormShow()
{
    applyColorScheme();
    m_confirmed = false;
    m_filling = true;
    m_rzE1->setText(m_name);
    m_rzE2->setText(m_remark);
    m_filling = false;
    // Filling is no change of the user's.
    m_changed = false;
    katedit_okUpdate();
    m_rzE1->setFocus();
}

bool Tkateditform::eventFilter(QObject* watched, QEvent* event)
{
    if (watched == m_rzE1 && event->type() == QEvent::KeyPress) {
        const auto* key = static_cast<QKeyEvent*>(event);
        const int at = m_rzE1->hasSelectedText() ? m_rzE1->selectionStart() : m_rzE1->cursorPosition();
        // A name never begins with a blank.
        if (key->text() == QLatin1String(" ") && at == 0)
            return true;
    }
    return KatDialogBase::eventFilter(watched, event);
}

void Tkateditform::katedit_okUpdate()
{
    if (m_rzE1->text().isEmpty())
        m_katedit_ok->setEnabled(false);
    else if (m_changed)
        m_katedit_ok->setEnabled(true);
}

void Tkateditform::katedit_okExecute()
{
    if (m_rzE1->text().isEmpty())
        return;
    m_name = m_rzE1->text();
    m_remark = m_rzE2->text();
    m_confirmed = true;
    accept();
}

// ---------------------------------------------------------------------------------------------
// TSelKatForm

TSelKatForm::TSelKatForm(QWidget* parent)
    : KatDialogBase(QStringLiteral("Kategorie wählen"), QStringLiteral("wählen"), parent)
{
    setObjectName(QStringLiteral("SelKatForm"));
    auto* box = new QVBoxLayout(m_body);
    box->setContentsMargins(14, 8, 14, 8);
    auto* label = new QLabel(QStringLiteral("Kontakt verschieben in Kategorie:"), m_body);
    m_flb1 = new QListWidget(m_body);
    m_flb1->setObjectName(QStringLiteral("FLB1"));
    m_flb1->setSelectionMode(QAbstractItemView::SingleSelection);
    label->setBuddy(m_flb1);
    box->addWidget(label);
    box->addWidget(m_flb1, 1);
    resize(300, 340);

    m_selKat_OK = new QAction(QStringLiteral("OK"), this);
    m_selKat_OK->setObjectName(QStringLiteral("SelKat_OK"));
    connect(m_selKat_OK, &QAction::triggered, this, &TSelKatForm::SelKat_OKExecute);
    addButtons(m_selKat_OK);
    connect(m_flb1, &QListWidget::itemSelectionChanged, this, &TSelKatForm::SelKat_OKUpdate);
    SelKat_OKUpdate();
}

void TSelKatForm::Add_kd(int id, const QString& name)
{
    try {
        if (id < 1 || name.isEmpty())
            return;
        m_entries.push_back({ name, id });
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# SelKatForm - Add_kd"), &e);
    }
}

int TSelKatForm::GetKatID(const QString& name) const
{
    try {
        for (const Entry& e : m_entries)
            if (e.name == name)
                return e.id;
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# SelKatForm - GetKatID"), &e);
    }
    return -1;
}

void TSelKatForm::InitList()
{
    try {
        m_flb1->clear();
        QStringList names;
        for (const Entry& e : m_entries)
            names << e.name;
        // The order of the grids: case-insensitive, umlauts with their base letter.
        std::stable_sort(names.begin(), names.end(), [](const QString& a, const QString& b) {
            return gridcollation::less(a.toLatin1(), b.toLatin1());
        });
        m_flb1->addItems(names);
        if (m_flb1->count() > 0)
            m_flb1->setCurrentRow(0);
    } catch (const std::exception& e) {
        reportError(QStringLiteral("# SelKatForm - InitList"), &e);
    }
    SelKat_OKUpdate();
}

void TSelKatForm::showEvent(QShowEvent* event)
{
    applyColorScheme();
    InitList();
    QDialog::showEvent(event);
    m_flb1->setFocus();
}

void TSelKatForm::closeEvent(QCloseEvent* event)
{
    m_entries.clear();
    QDialog::closeEvent(event);
}

void TSelKatForm::SelKat_OKUpdate()
{
    m_selKat_OK->setEnabled(!m_flb1->selectedItems().isEmpty());
}

void TSelKatForm::SelKat_OKExecute()
{
    const QList<QListWidgetItem*> selected = m_flb1->selectedItems();
    if (selected.isEmpty())
        return;
    m_confirmed = true;
    m_chosenName = selected.first()->text();
    m_chosenId = GetKatID(m_chosenName);
    accept();
}

} // namespace orvanta
