#include "contacts/Tcontacteditform.h"

#include "contacts/ContactNoteEditor.h"
#include "contacts/ContactNotices.h"
#include "contacts/EntryEditors.h"
#include "contacts/KeyFilter.h"
#include "phone/AreaCodes.h"
#include "phone/TvkMiniKontakt.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "platform/IniFile.h"
#include "platform/ProgramFolder.h"
#include "platform/WindowMessages.h"
#include "ui/rtf/RtfText.h"
#include "ui/scheme/ColorScheme.h"

#include <QAction>
#include <QApplication>
#include <QCloseEvent>
#include <QComboBox>
#include <QGridLayout>
#include <QGuiApplication>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QKeyEvent>
#include <QLabel>
#include <QLineEdit>
#include <QMenu>
#include <QPushButton>
#include <QRegularExpression>
#include <QScreen>
#include <QStyle>
#include <QTabWidget>
#include <QTableWidget>
#include <QTextEdit>
#include <QToolButton>
#include <QVBoxLayout>

namespace orvanta {

namespace {

const QString kLabel = QStringLiteral("# Tcontacteditform - ");
const QString kMissing = QStringLiteral("\r\nDatentyp ist nicht initialisiert!\r\n");
const QString kComData = QStringLiteral("Es können keine Kommunikationsdaten bearbeitet werden.");
const QString kMailData = QStringLiteral("Es können keine Email-Adressen bearbeitet werden.");
const QString kNotFound = QStringLiteral("\r\nBei der Ermittlung des Datensatzes ist ein Fehler aufgetreten!\r\n");

constexpr const char* kMruSection = "Anrede";
constexpr int kMruMax = 20;

// Number grid columns.
enum SgColumn { SgImage = 0, SgLabel, SgLc, SgVorw, SgNumber, SgRemark, SgId, SgCount };
enum MailColumn { MailAddr = 0, MailRemark, MailId, MailCount };

Tcontacteditform::CategoryPicker& categoryPicker()
{
    static Tcontacteditform::CategoryPicker p;
    return p;
}

// A line edit takes no line breaks or control characters; pasted ones become blanks.
QString cleanText(const QString& text)
{
    QString out = text;
    for (QChar& c : out)
        if (c.category() == QChar::Other_Control || c == QChar::LineSeparator || c == QChar::ParagraphSeparator)
            c = QLatin1Char(' ');
    return out;
}

QString cut(const QString& text, int width)
{
    return cleanText(text).left(width);
}

QTableWidget* makeGrid(QWidget* parent, const char* name, const QStringList& headers, const QList<int>& widths)
{
    auto* grid = new QTableWidget(0, static_cast<int>(headers.size()), parent);
    grid->setObjectName(QLatin1String(name));
    grid->setHorizontalHeaderLabels(headers);
    grid->setEditTriggers(QAbstractItemView::NoEditTriggers);
    grid->setSelectionBehavior(QAbstractItemView::SelectRows);
    grid->setSelectionMode(QAbstractItemView::SingleSelection);
    grid->verticalHeader()->hide();
    grid->setWordWrap(false);
    grid->horizontalHeader()->setSectionResizeMode(QHeaderView::Interactive);
    grid->horizontalHeader()->setDefaultAlignment(Qt::AlignCenter);
    for (int i = 0; i < widths.size(); ++i)
        grid->setColumnWidth(i, widths.at(i));
    grid->setColumnHidden(static_cast<int>(headers.size()) - 1, true);
    return grid;
}

QString cellText(const QTableWidget* grid, int row, int column)
{
    const QTableWidgetItem* item = grid->item(row, column);
    return item ? item->text() : QString();
}

// The first row whose column `column` is empty, appending one when there is none.
int freeRow(QTableWidget* grid, int column)
{
    for (int r = 0; r < grid->rowCount(); ++r)
        if (cellText(grid, r, column).isEmpty())
            return r;
    grid->insertRow(grid->rowCount());
    return grid->rowCount() - 1;
}

void setCell(QTableWidget* grid, int row, int column, const QString& text, Qt::Alignment align = Qt::AlignLeft)
{
    auto* item = new QTableWidgetItem(text);
    item->setTextAlignment(align | Qt::AlignVCenter);
    grid->setItem(row, column, item);
}

// Empties a grid down to one empty data row.
void blankGrid(QTableWidget* grid)
{
    grid->clearContents();
    grid->setRowCount(1);
}


// What the entry editors give back, cut to the columns' widths; the rest of the entry (key,
// state) is taken from `entry`.
TvkKommItem editedEntry(const Tcomeditform& editor, TvkKommItem entry)
{
    entry.KOMMBEZ = cut(editor.KOMMBEZ, TvkKommItem::KOMMBEZWidth);
    entry.LC = cut(editor.LC, TvkKommItem::LCWidth);
    entry.VORW = cut(editor.VORW, TvkKommItem::VORWWidth);
    entry.NUMBER = cut(editor.NUMBER, TvkKommItem::NUMBERWidth);
    entry.BEMERKUNG = cut(editor.BEMERKUNG, TvkKommItem::BEMERKUNGWidth);
    entry.AUTOREJECT = editor.AUTOREJECT ? 1 : 0;
    return entry;
}

TvkMailItem editedEntry(const Tmaileditform& editor, TvkMailItem entry)
{
    entry.MAILADDR = cut(editor.MAILADDR, TvkMailItem::MAILADDRWidth);
    entry.BEMERK = cut(editor.BEMERK, TvkMailItem::BEMERKWidth);
    return entry;
}
} // namespace

// ---------------------------------------------------------------------------------------------
// Creation

Tcontacteditform::Tcontacteditform(QObject* mainHandle, RecordLookup records, QWidget* parent)
    : QWidget(parent, Qt::Window | Qt::CustomizeWindowHint | Qt::WindowTitleHint | Qt::WindowSystemMenuHint
                          | Qt::WindowCloseButtonHint | Qt::WindowStaysOnTopHint | Qt::MSWindowsFixedSizeDialogHint)
    , m_main(mainHandle)
    , m_records(std::move(records))
{
    setObjectName(QStringLiteral("contacteditform"));
    setAttribute(Qt::WA_DeleteOnClose, false); // the main window frees it
    setWindowTitle(QStringLiteral("Kontakt hinzufügen/ändern"));
    buildLayout();
    // FormCreate
    m_initialising = true;
    loadHistory();
    m_notiz1->setFontFamily(QApplication::font().family());
    m_notes->loadBars();
    setFixedSize(624, 516);
}

Tcontacteditform::~Tcontacteditform() = default;

void Tcontacteditform::setNotePrinter(NotePrinter printer)
{
    ContactNoteEditor::setNotePrinter(std::move(printer));
}

void Tcontacteditform::setCategoryPicker(CategoryPicker picker)
{
    categoryPicker() = std::move(picker);
}

void Tcontacteditform::setFileChooser(FileChooser chooser)
{
    ContactNoteEditor::setFileChooser(std::move(chooser));
}

const QStringList& Tcontacteditform::fixedSalutations()
{
    static const QStringList fixed{QStringLiteral("Herr"), QStringLiteral("Frau"), QStringLiteral("Firma"),
                                   QStringLiteral("Praxis"), QStringLiteral("Bürogemeinschaft")};
    return fixed;
}

QLineEdit* Tcontacteditform::addEdit(QWidget* page, const char* name, int maxLength)
{
    auto* edit = new QLineEdit(page);
    edit->setObjectName(QLatin1String(name));
    edit->setMaxLength(maxLength);
    return edit;
}

void Tcontacteditform::buildLayout()
{
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 8);
    m_header = new QLabel(QStringLiteral("Kontaktdaten -\nhinzufügen/ändern"), this);
    m_header->setObjectName(QStringLiteral("HeaderPanel"));
    m_header->setContentsMargins(14, 8, 14, 8);
    QFont hf = m_header->font();
    hf.setBold(true);
    hf.setPointSize(hf.pointSize() + 2);
    m_header->setFont(hf);
    m_header->setAutoFillBackground(true);
    layout->addWidget(m_header);

    m_pages = new QTabWidget(this);
    m_pages->setObjectName(QStringLiteral("AdvPageControl1"));
    m_pages->addTab(buildContactTab(), QStringLiteral(" Kontaktdaten "));
    m_pages->addTab(buildAddressTab(), QStringLiteral(" Anschrift "));
    m_pages->addTab(buildCommunicationTab(), QStringLiteral(" Kommunikationsdaten "));
    m_pages->addTab(buildNotesTab(), QStringLiteral(" Notizen "));
    auto* pageBox = new QHBoxLayout;
    pageBox->setContentsMargins(8, 4, 8, 4);
    pageBox->addWidget(m_pages);
    layout->addLayout(pageBox, 1);

    m_ok = new QAction(QStringLiteral("OK"), this);
    m_ok->setObjectName(QStringLiteral("conedit_ok"));
    m_uebern = new QAction(QStringLiteral("Übernehmen"), this);
    m_uebern->setObjectName(QStringLiteral("conedit_uebern"));
    m_exit = new QAction(QStringLiteral("Abbrechen"), this);
    m_exit->setObjectName(QStringLiteral("conedit_exit"));
    connect(m_ok, &QAction::triggered, this, &Tcontacteditform::conedit_okExecute);
    connect(m_uebern, &QAction::triggered, this, &Tcontacteditform::conedit_uebernExecute);
    connect(m_exit, &QAction::triggered, this, &QWidget::close);
    const auto button = [this](QAction* action, const char* name) {
        auto* b = new QPushButton(action->text(), this);
        b->setObjectName(QLatin1String(name));
        connect(b, &QPushButton::clicked, action, &QAction::trigger);
        connect(action, &QAction::changed, b, [b, action] { b->setEnabled(action->isEnabled()); });
        return b;
    };
    QPushButton* okButton = button(m_ok, "RzButton3");
    QFont bold = okButton->font();
    bold.setBold(true);
    okButton->setFont(bold);
    okButton->setDefault(true);
    auto* row = new QHBoxLayout;
    row->setContentsMargins(8, 0, 8, 0);
    row->addStretch(1);
    row->addWidget(okButton);
    row->addWidget(button(m_uebern, "RzButton2"));
    row->addWidget(button(m_exit, "RzButton1"));
    layout->addLayout(row);
    conedit_okUpdate();
}

QWidget* Tcontacteditform::buildContactTab()
{
    auto* page = new QWidget;
    page->setObjectName(QStringLiteral("AdvTabSheet1"));
    auto* grid = new QGridLayout(page);
    grid->setContentsMargins(16, 14, 16, 14);
    grid->setVerticalSpacing(8);

    m_anrede = new QComboBox(page);
    m_anrede->setObjectName(QStringLiteral("RzMRUCB1"));
    m_anrede->setEditable(true);
    m_anrede->setInsertPolicy(QComboBox::NoInsert);
    m_anrede->lineEdit()->setMaxLength(30);
    m_anrede->setContextMenuPolicy(Qt::CustomContextMenu);
    m_anrede->lineEdit()->setContextMenuPolicy(Qt::CustomContextMenu);
    const auto historyMenu = [this](const QPoint& at) {
        QMenu menu(this);
        QAction* remove = menu.addAction(QStringLiteral("&Aus der Historieliste"));
        remove->setObjectName(QStringLiteral("RemoveFromHistory"));
        remove->setEnabled(m_history.contains(m_anrede->currentText()));
        if (menu.exec(m_anrede->mapToGlobal(at)) == remove)
            removeFromHistory();
    };
    connect(m_anrede, &QWidget::customContextMenuRequested, this, historyMenu);
    connect(m_anrede->lineEdit(), &QWidget::customContextMenuRequested, this, historyMenu);

    m_vname = addEdit(page, "RzEdit2", 30);
    m_name = addEdit(page, "RzEdit3", 30);
    m_titel = addEdit(page, "RzEdit1", 25);
    m_firma = addEdit(page, "RzEdit4", 50);
    m_contbez = addEdit(page, "RzEdit9", 80);
    m_contbez->setProperty("designationTag", 0);
    auto* hint = new QToolButton(page);
    hint->setObjectName(QStringLiteral("RzBitBtn1"));
    hint->setToolTip(QStringLiteral("Hinweis"));
    hint->setIcon(style()->standardIcon(QStyle::SP_MessageBoxInformation));
    connect(hint, &QToolButton::clicked, this, [this] {
        if (contactNotices().designationHint)
            contactNotices().designationHint(this);
    });
    m_website = addEdit(page, "RzEdit10", 50);
    m_abteilung = addEdit(page, "RzEdit11", 35);
    m_katbez = addEdit(page, "RzButtonEdit1", 30);
    auto* katButton = new QToolButton(page);
    katButton->setObjectName(QStringLiteral("RzButtonEdit1Button"));
    katButton->setText(QStringLiteral("..."));
    katButton->setToolTip(QStringLiteral("Kategorie aus Kategorieverwaltung übernehmen"));
    connect(katButton, &QToolButton::clicked, this, &Tcontacteditform::pickCategory);

    const struct {
        const char* label;
        QWidget* field;
        QWidget* extra;
    } rows[] = {{"Anrede", m_anrede, nullptr},
                {"Vorname", m_vname, nullptr},
                {"Name", m_name, nullptr},
                {"Titel/Akad.Grad", m_titel, nullptr},
                {"Firma", m_firma, nullptr},
                {"Kontaktbezeichnung", m_contbez, hint},
                {"Internet", m_website, nullptr},
                {"Abteilung", m_abteilung, nullptr},
                {"Kategorie", m_katbez, katButton}};
    int r = 0;
    for (const auto& row : rows) {
        auto* label = new QLabel(QString::fromUtf8(row.label), page);
        label->setBuddy(row.field);
        grid->addWidget(label, r, 0);
        grid->addWidget(row.field, r, 1);
        if (row.extra)
            grid->addWidget(row.extra, r, 2);
        ++r;
    }
    grid->setColumnStretch(1, 1);
    grid->setRowStretch(r, 1);

    QWidget* order[] = {m_anrede, m_vname, m_name, m_titel, m_firma, m_contbez, hint, m_website, m_abteilung,
                        m_katbez, katButton};
    for (std::size_t i = 1; i < std::size(order); ++i)
        setTabOrder(order[i - 1], order[i]);

    for (QLineEdit* e : {m_vname, m_name, m_firma}) {
        connect(e, &QLineEdit::textChanged, this, &Tcontacteditform::nameChanged);
        e->installEventFilter(this);
    }
    for (QLineEdit* e : {m_vname, m_name, m_firma, m_contbez, m_katbez})
        KeyFilter::install(e, &KeyFilter::noLeadingBlank);
    connect(m_contbez, &QLineEdit::textChanged, this, &Tcontacteditform::designationChanged);
    for (QLineEdit* e : {m_titel, m_website, m_abteilung, m_katbez})
        connect(e, &QLineEdit::textChanged, this, &Tcontacteditform::fieldChanged);
    connect(m_anrede, &QComboBox::currentTextChanged, this, &Tcontacteditform::fieldChanged);
    return page;
}

QWidget* Tcontacteditform::buildAddressTab()
{
    auto* page = new QWidget;
    page->setObjectName(QStringLiteral("AdvTabSheet2"));
    auto* grid = new QGridLayout(page);
    grid->setContentsMargins(16, 14, 16, 14);
    grid->setVerticalSpacing(8);
    m_str = addEdit(page, "RzEdit5", 40);
    m_plz = addEdit(page, "RzEdit6", 10);
    m_ort = addEdit(page, "RzEdit7", 35);
    m_zusatz = addEdit(page, "RzEdit8", 30);
    m_land = addEdit(page, "RzEdit12", 30);
    m_bundesland = addEdit(page, "RzEdit13", 30);
    const struct {
        const char* label;
        QLineEdit* field;
    } rows[] = {{"Straße", m_str},       {"PLZ", m_plz},   {"Ort", m_ort},
                {"Zustellzusatz", m_zusatz}, {"Land", m_land}, {"Bundesland", m_bundesland}};
    int r = 0;
    QWidget* previous = nullptr;
    for (const auto& row : rows) {
        auto* label = new QLabel(QString::fromUtf8(row.label), page);
        label->setBuddy(row.field);
        grid->addWidget(label, r, 0);
        grid->addWidget(row.field, r, 1);
        connect(row.field, &QLineEdit::textChanged, this, &Tcontacteditform::fieldChanged);
        if (previous)
            setTabOrder(previous, row.field);
        previous = row.field;
        ++r;
    }
    grid->setColumnStretch(1, 1);
    grid->setRowStretch(r, 1);
    return page;
}

QWidget* Tcontacteditform::buildCommunicationTab()
{
    auto* page = new QWidget;
    page->setObjectName(QStringLiteral("AdvTabSheet3"));
    auto* layout = new QVBoxLayout(page);
    layout->setContentsMargins(10, 8, 10, 8);

    const auto buttons = [this, page](const char* n1, const char* n2, const char* n3, void (Tcontacteditform::*a)(),
                                      void (Tcontacteditform::*b)(), void (Tcontacteditform::*c)()) {
        auto* col = new QVBoxLayout;
        const struct {
            const char* name;
            const char* caption;
            void (Tcontacteditform::*run)();
        } list[] = {{n1, "Hinzufügen", a}, {n2, "Bearbeiten", b}, {n3, "Löschen", c}};
        for (const auto& entry : list) {
            auto* btn = new QPushButton(QString::fromUtf8(entry.caption), page);
            btn->setObjectName(QLatin1String(entry.name));
            connect(btn, &QPushButton::clicked, this, entry.run);
            col->addWidget(btn);
        }
        col->addStretch(1);
        return col;
    };

    layout->addWidget(new QLabel(QStringLiteral("Rufnummern"), page));
    m_sg1 = makeGrid(page, "SG1",
                     {QString(), QStringLiteral("Bezeichnung"), QStringLiteral("Land"), QStringLiteral("Vorwahl"),
                      QStringLiteral("Nummer"), QStringLiteral("Bemerkung"), QStringLiteral("id")},
                     {20, 117, 40, 60, 93, 88});
    m_sg1->horizontalHeader()->setSectionResizeMode(SgImage, QHeaderView::Fixed);
    auto* numbers = new QHBoxLayout;
    numbers->addWidget(m_sg1, 1);
    numbers->addLayout(buttons("RzButton4", "RzButton5", "RzButton6", &Tcontacteditform::NewComData,
                               &Tcontacteditform::EditComData, &Tcontacteditform::DelComData));
    layout->addLayout(numbers, 1);
    connect(m_sg1, &QTableWidget::cellDoubleClicked, this, [this] { EditComData(); });

    layout->addWidget(new QLabel(QStringLiteral("Email-Adressen"), page));
    m_mailGrid = makeGrid(page, "MailGrid", {QStringLiteral("Adresse"), QStringLiteral("Bemerkung"), QStringLiteral("id")},
                          {252, 255});
    m_mailGrid->horizontalHeader()->setDefaultAlignment(Qt::AlignLeft | Qt::AlignVCenter);
    auto* mails = new QHBoxLayout;
    mails->addWidget(m_mailGrid, 1);
    mails->addLayout(buttons("RzButton7", "RzButton8", "RzButton9", &Tcontacteditform::NewMailData,
                             &Tcontacteditform::EditMailData, &Tcontacteditform::DelMailData));
    layout->addLayout(mails, 1);
    connect(m_mailGrid, &QTableWidget::cellDoubleClicked, this, [this] { EditMailData(); });
    blankGrid(m_sg1);
    blankGrid(m_mailGrid);
    return page;
}

QWidget* Tcontacteditform::buildNotesTab()
{
    auto* page = new QWidget;
    page->setObjectName(QStringLiteral("AdvTabSheet4"));
    auto* layout = new QVBoxLayout(page);
    layout->setContentsMargins(0, 0, 0, 0);
    m_notes = new ContactNoteEditor(page);
    m_notes->setDesignation([this] { return m_contbez->text(); });
    m_notiz1 = m_notes->editor();
    layout->addWidget(m_notes);
    connect(m_notiz1, &QTextEdit::textChanged, this, [this] {
        m_modified = true;
        conedit_okUpdate();
    });
    return page;
}

// ---------------------------------------------------------------------------------------------
// Showing and closing

void Tcontacteditform::showEvent(QShowEvent* event)
{
    QWidget::showEvent(event);
    if (m_shown)
        return;
    m_shown = true;
    if (const QScreen* screen = QGuiApplication::primaryScreen())
        move(screen->availableGeometry().center() - rect().center());
    FormShow();
}

void Tcontacteditform::FormShow()
{
    applyColorScheme();
    m_initialising = true;
    if (!record()) {
        reportError(kLabel + QStringLiteral("OnShow\r\nTyp für das vorhalten der Daten ist nicht initialisiert!\r\n"
                                            "Aufgabe kann nicht ausgeführt werden."));
        DisableEditing();
    } else if (m_editMode == 0) {
        if (!FieldInitialNew() || !CheckNewNumber())
            DisableEditing();
    } else {
        m_pages->setCurrentIndex(0);
        m_anrede->setFocus();
        if (m_dataIndex < 0 || !FieldInitialEdit())
            DisableEditing();
    }
    m_notes->RichEditSelectionChange();
    m_initialising = false;
    m_modified = false;
    conedit_okUpdate();
}

void Tcontacteditform::closeEvent(QCloseEvent* event)
{
    FormClose();
    QWidget::closeEvent(event);
}

void Tcontacteditform::FormClose()
{
    if (m_closed)
        return;
    m_closed = true;
    saveHistory();
    postMessage(m_main, WMCLOSECONTACTFORM, m_tag, 0);
    m_notes->saveBars();
}

void Tcontacteditform::applyColorScheme()
{
    const int scheme = appColorScheme();
    const ListFrameColors& c = listFrameColors(scheme);
    QPalette pal = palette();
    pal.setColor(QPalette::Window, c.panel);
    pal.setColor(QPalette::Mid, c.panelBorder);
    setPalette(pal);
    setAutoFillBackground(true);
    QPalette hp = m_header->palette();
    hp.setColor(QPalette::Window, c.captionBar);
    hp.setColor(QPalette::WindowText, Qt::white);
    m_header->setPalette(hp);
}

void Tcontacteditform::DisableEditing()
{
    m_pages->setEnabled(false);
    m_dataError = true;
    conedit_okUpdate();
}

TvkMiniKontakt* Tcontacteditform::record() const
{
    return m_records && m_dataIndex >= 0 ? m_records(m_dataIndex) : nullptr;
}

void Tcontacteditform::setSaveLocked(bool failed)
{
    if (failed)
        m_saveLocked = true;
    conedit_okUpdate();
}

// ---------------------------------------------------------------------------------------------
// Filling the fields

bool Tcontacteditform::FieldInitialNew()
{
    const bool was = m_initialising;
    m_initialising = true;
    bool ok = true;
    try {
        ok = SetBlankGrid() && SetBlankMailGrid();
        m_pages->setCurrentIndex(0);
        m_anrede->setCurrentText(QString());
        for (QLineEdit* e : findChildren<QLineEdit*>(QRegularExpression(QStringLiteral("^Rz(Edit\\d+|ButtonEdit1)$"))))
            e->clear();
        m_notiz1->clear();
        m_anrede->setFocus();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("FieldInitialNew"), &e);
        ok = false;
    }
    m_initialising = was;
    return ok;
}

bool Tcontacteditform::FieldInitialEdit()
{
    const bool was = m_initialising;
    m_initialising = true;
    bool ok = false;
    try {
        const TvkMiniKontakt* r = record();
        if (!r) {
            reportError(kLabel + QStringLiteral("FieldInitialEdit\r\nDaetntyp ist nicht initialisiert!\r\n"
                                                "Kontakt kann nicht bearbeitet werden."));
        } else if (SetGridLines() && SetGridMailLines()) {
            m_anrede->setCurrentText(r->ANREDE());
            m_vname->setText(r->VNAME());
            m_name->setText(r->NAME());
            m_titel->setText(r->TITEL());
            m_firma->setText(r->FIRMA());
            m_contbez->setText(r->CONTBEZ());
            m_website->setText(r->WEBSITE());
            m_abteilung->setText(r->ABTEILUNG());
            m_katbez->setText(r->KATBEZ());
            m_str->setText(r->STR());
            m_plz->setText(r->PLZ());
            m_ort->setText(r->ORT());
            m_zusatz->setText(r->ZUSATZ());
            m_land->setText(r->LAND());
            m_bundesland->setText(r->BUNDESLAND());
            // A stored designation of the user's own is not overwritten by the name fields.
            m_contbez->setProperty("designationTag",
                                   r->CONTBEZ() == BuildContBez(r->VNAME(), r->NAME(), r->FIRMA()) ? 0 : 1);
            m_notiz1->clear();
            if (!r->notes().isEmpty())
                RtfText::setContent(m_notiz1, r->notes());
            ok = true;
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("FieldInitialEdit"), &e);
    }
    m_initialising = was;
    return ok;
}

bool Tcontacteditform::SetBlankGrid()
{
    try {
        blankGrid(m_sg1);
        return true;
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetBlankGrid"), &e);
    }
    return false;
}

bool Tcontacteditform::SetBlankMailGrid()
{
    try {
        blankGrid(m_mailGrid);
        return true;
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetBlankMailGrid"), &e);
    }
    return false;
}

bool Tcontacteditform::SetGridLines()
{
    const TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("SetGridLines") + kMissing
                    + QStringLiteral("Anzeigedaten konnten nicht aufbereitet werden."));
        return false;
    }
    m_sg1->setUpdatesEnabled(false);
    bool ok = true;
    try {
        blankGrid(m_sg1);
        const QIcon rejectIcon = style()->standardIcon(QStyle::SP_MessageBoxCritical);
        for (int i = 0; i < r->KD().size(); ++i) {
            const TvkKommItem& e = r->KD().at(i);
            if (e.status == EntryStatus::Deleted)
                continue;
            const int row = freeRow(m_sg1, SgLabel);
            auto* image = new QTableWidgetItem;
            if (e.AUTOREJECT)
                image->setIcon(rejectIcon);
            m_sg1->setItem(row, SgImage, image);
            setCell(m_sg1, row, SgLabel, e.KOMMBEZ);
            setCell(m_sg1, row, SgLc, e.LC, Qt::AlignRight);
            setCell(m_sg1, row, SgVorw, e.VORW, Qt::AlignRight);
            setCell(m_sg1, row, SgNumber, e.NUMBER, Qt::AlignRight);
            setCell(m_sg1, row, SgRemark, e.BEMERKUNG);
            setCell(m_sg1, row, SgId, QString::number(i));
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetGridLines\r\nAnzeigedaten konnten nicht aufbereitet werden."), &e);
        ok = false;
    }
    m_sg1->setUpdatesEnabled(true);
    return ok;
}

bool Tcontacteditform::SetGridMailLines()
{
    const TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("SetGridMailLines") + kMissing
                    + QStringLiteral("Anzeigedaten konnten nicht aufbereitet werden."));
        return false;
    }
    m_mailGrid->setUpdatesEnabled(false);
    bool ok = true;
    try {
        blankGrid(m_mailGrid);
        for (int i = 0; i < r->Mail().size(); ++i) {
            const TvkMailItem& e = r->Mail().at(i);
            if (e.status == EntryStatus::Deleted)
                continue;
            const int row = freeRow(m_mailGrid, MailAddr);
            setCell(m_mailGrid, row, MailAddr, e.MAILADDR);
            setCell(m_mailGrid, row, MailRemark, e.BEMERK);
            setCell(m_mailGrid, row, MailId, QString::number(i));
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("SetGridMailLines\r\nAnzeigedaten konnten nicht aufbereitet werden."), &e);
        ok = false;
    }
    m_mailGrid->setUpdatesEnabled(true);
    return ok;
}

bool Tcontacteditform::CheckNewNumber()
{
    TvkMiniKontakt* r = record();
    if (m_newNumber.isEmpty() || !r || r->LID() != 0)
        return true;
    try {
        TvkKommItem e;
        e.KOMMBEZ = QStringLiteral("Telefon");
        e.status = EntryStatus::New;
        e.NUMBER = m_newNumber.left(TvkKommItem::NUMBERWidth);
        const QString start = m_newNumber.left(4);
        const QString rest = m_newNumber.mid(4);
        QString prefix, subscriber, region;
        bool found = false;
        if (start == QLatin1String("0049")) {
            found = GetGermanAereaCodes(rest, prefix, subscriber, region);
        } else if (start == QLatin1String("0043")) {
            found = GetAustriaAereaCodes(rest, prefix, subscriber, region);
        } else if (start == QLatin1String("0041")) {
            found = GetSwissAereaCodes(rest, prefix, subscriber, region);
        } else {
            switch (m_homeCountry) {
            case 1: found = GetGermanAereaCodes(m_newNumber, prefix, subscriber, region); break;
            case 2: found = GetAustriaAereaCodes(m_newNumber, prefix, subscriber, region); break;
            case 3: found = GetSwissAereaCodes(m_newNumber, prefix, subscriber, region); break;
            default: break;
            }
        }
        // The lookup splits off nothing for an unknown prefix: that is no find.
        if (found && !prefix.isEmpty()) {
            if (start == QLatin1String("0049") || start == QLatin1String("0043") || start == QLatin1String("0041"))
                e.LC = start;
            e.VORW = prefix;
            e.BEMERKUNG = region;
            e.NUMBER = subscriber.isEmpty() ? m_newNumber : subscriber;
        }
        if (r->AddKD(e) < 0)
            return false;
        return SetGridLines();
    } catch (const std::exception& ex) {
        reportError(kLabel + QStringLiteral("CheckNewNumber"), &ex);
    }
    return false;
}

// ---------------------------------------------------------------------------------------------
// Contact designation and change tracking

QString Tcontacteditform::BuildContBez(const QString& v, const QString& n, const QString& f)
{
    const bool hv = !v.isEmpty();
    const bool hn = !n.isEmpty();
    const bool hf = !f.isEmpty();
    QString s;
    if (hv && hn && hf)
        s = f + QStringLiteral(" / ") + n + QStringLiteral(", ") + v;
    else if (hv && hn)
        s = n + QStringLiteral(", ") + v;
    else if (hv && hf)
        s = f + QStringLiteral(" / ") + v;
    else if (hn && hf)
        s = f + QStringLiteral(" / ") + n;
    else
        s = hv ? v : hn ? n : f;
    return s.left(80);
}

bool Tcontacteditform::eventFilter(QObject* watched, QEvent* event)
{
    // A key in a name field: a designation that no longer is the automatic one was typed by the
    // user and is left alone from now on.
    if (event->type() == QEvent::KeyPress && !m_initialising
        && (watched == m_vname || watched == m_name || watched == m_firma)
        && m_contbez->property("designationTag").toInt() == 0
        && m_contbez->text() != BuildContBez(m_vname->text(), m_name->text(), m_firma->text()))
        m_contbez->setProperty("designationTag", 1);
    return QWidget::eventFilter(watched, event);
}

void Tcontacteditform::nameChanged()
{
    if (m_initialising)
        return;
    m_modified = true;
    if (m_contbez->property("designationTag").toInt() == 0)
        m_contbez->setText(BuildContBez(m_vname->text(), m_name->text(), m_firma->text()));
    conedit_okUpdate();
}

void Tcontacteditform::designationChanged()
{
    if (m_initialising)
        return;
    m_modified = true;
    if (m_contbez->text() == BuildContBez(m_vname->text(), m_name->text(), m_firma->text()))
        m_contbez->setProperty("designationTag", 0);
    conedit_okUpdate();
}

void Tcontacteditform::fieldChanged()
{
    if (m_initialising)
        return;
    m_modified = true;
    conedit_okUpdate();
}

void Tcontacteditform::conedit_okUpdate()
{
    const bool named = !m_vname->text().isEmpty() || !m_name->text().isEmpty() || !m_firma->text().isEmpty();
    const bool enabled = !m_dataError && !m_saveLocked && m_modified && named;
    m_ok->setEnabled(enabled);
    m_uebern->setEnabled(enabled);
}

void Tcontacteditform::KatHasChanged(const QString& katbez)
{
    try {
        if (TvkMiniKontakt* r = record())
            r->setKATBEZ(katbez);
        const bool was = m_initialising;
        m_initialising = true;
        m_katbez->setText(katbez);
        m_initialising = was;
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("KatHasChanged"), &e);
    }
}

void Tcontacteditform::pickCategory()
{
    if (!categoryPicker())
        return;
    const QString chosen = categoryPicker()(this);
    if (!chosen.isEmpty())
        m_katbez->setText(chosen);
}

// ---------------------------------------------------------------------------------------------
// Number and e-mail entries

int Tcontacteditform::selectedEntry(QTableWidget* grid, int textColumn, int idColumn, int listSize) const
{
    const int row = grid->currentRow();
    if (row < 0)
        return -1;
    const QString text = cellText(grid, row, textColumn);
    const QString id = cellText(grid, row, idColumn);
    bool ok = false;
    const int index = id.toInt(&ok);
    if (text.isEmpty() || id.isEmpty() || !ok || index < 0 || index >= listSize)
        return -1;
    return index;
}

void Tcontacteditform::NewComData()
{
    TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("NewComData") + kMissing + kComData);
        return;
    }
    try {
        Tcomeditform editor(this);
        if (editor.exec() == QDialog::Accepted && editor.ok()) {
            TvkKommItem e = editedEntry(editor, TvkKommItem{});
            e.status = EntryStatus::New;
            r->AddKD(e);
            if (!SetGridLines())
                DisableEditing();
            fieldChanged();
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("NewComData\r\nFehler bei der Durchführung!\r\n") + kComData, &e);
    }
}

void Tcontacteditform::EditComData()
{
    TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("EditComData") + kMissing + kComData);
        return;
    }
    try {
        const int index = selectedEntry(m_sg1, SgLabel, SgId, static_cast<int>(r->KD().size()));
        if (index < 0)
            return;
        const TvkKommItem current = r->KD().at(index);
        Tcomeditform editor(this);
        editor.KOMMBEZ = current.KOMMBEZ;
        editor.LC = current.LC;
        editor.VORW = current.VORW;
        editor.NUMBER = current.NUMBER;
        editor.BEMERKUNG = current.BEMERKUNG;
        editor.AUTOREJECT = current.AUTOREJECT != 0;
        if (editor.exec() == QDialog::Accepted && editor.ok()) {
            const TvkKommItem e = editedEntry(editor, current);
            r->EditKD(e, index);
            if (!SetGridLines())
                DisableEditing();
            fieldChanged();
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("EditComData") + kNotFound + kComData, &e);
    }
}

void Tcontacteditform::DelComData()
{
    TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("DelComData") + kMissing + kComData);
        return;
    }
    try {
        const int index = selectedEntry(m_sg1, SgLabel, SgId, static_cast<int>(r->KD().size()));
        if (index < 0)
            return;
        const QString question = QStringLiteral("Kommunikationsdaten \"") + cellText(m_sg1, m_sg1->currentRow(), SgLabel)
            + QStringLiteral("\" löschen?");
        if (dialogs().show(DialogKind::Warning, {}, question, DialogButton::Yes | DialogButton::No, DialogButton::Yes)
            != DialogButton::Yes)
            return;
        r->DeleteKD(index);
        if (!SetGridLines())
            DisableEditing();
        fieldChanged();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("DelComData") + kNotFound + kComData, &e);
    }
}

void Tcontacteditform::NewMailData()
{
    TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("NewMailData") + kMissing + kMailData);
        return;
    }
    try {
        Tmaileditform editor(this);
        if (editor.exec() == QDialog::Accepted && editor.ok()) {
            TvkMailItem e = editedEntry(editor, TvkMailItem{});
            e.status = EntryStatus::New;
            r->AddMail(e);
            if (!SetGridMailLines())
                DisableEditing();
            fieldChanged();
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("NewMailData\r\nFehler bei der Durchführung!\r\n") + kMailData, &e);
    }
}

void Tcontacteditform::EditMailData()
{
    TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("EditMailData") + kMissing + kMailData);
        return;
    }
    try {
        const int index = selectedEntry(m_mailGrid, MailAddr, MailId, static_cast<int>(r->Mail().size()));
        if (index < 0)
            return;
        const TvkMailItem current = r->Mail().at(index);
        Tmaileditform editor(this);
        editor.MAILADDR = current.MAILADDR;
        editor.BEMERK = current.BEMERK;
        if (editor.exec() == QDialog::Accepted && editor.ok()) {
            const TvkMailItem e = editedEntry(editor, current);
            r->EditMail(e, index);
            if (!SetGridMailLines())
                DisableEditing();
            fieldChanged();
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("EditMailData") + kNotFound + kMailData, &e);
    }
}

void Tcontacteditform::DelMailData()
{
    TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("DelMailData") + kMissing
                    + QStringLiteral("Es können keine Adressen bearbeitet werden."));
        return;
    }
    try {
        const int index = selectedEntry(m_mailGrid, MailAddr, MailId, static_cast<int>(r->Mail().size()));
        if (index < 0)
            return;
        const QString question = QStringLiteral("Email-Adresse \"")
            + cellText(m_mailGrid, m_mailGrid->currentRow(), MailAddr) + QStringLiteral("\" löschen?");
        if (dialogs().show(DialogKind::Warning, {}, question, DialogButton::Yes | DialogButton::No, DialogButton::Yes)
            != DialogButton::Yes)
            return;
        r->DeleteMail(index);
        if (!SetGridMailLines())
            DisableEditing();
        fieldChanged();
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("DelMailData") + kNotFound + kMailData, &e);
    }
}

// ---------------------------------------------------------------------------------------------
// Saving

bool Tcontacteditform::GetDataToSave()
{
    TvkMiniKontakt* r = record();
    if (!r) {
        reportError(kLabel + QStringLiteral("GetDataToSave") + kMissing
                    + QStringLiteral("Kontaktdaten können nicht gespeichert werden."));
        return false;
    }
    r->setANREDE(cleanText(m_anrede->currentText()));
    r->setVNAME(cleanText(m_vname->text()));
    r->setNAME(cleanText(m_name->text()));
    r->setTITEL(cleanText(m_titel->text()));
    r->setFIRMA(cleanText(m_firma->text()));
    r->setCONTBEZ(cleanText(m_contbez->text()));
    r->setWEBSITE(cleanText(m_website->text()));
    r->setABTEILUNG(cleanText(m_abteilung->text()));
    r->setKATBEZ(cleanText(m_katbez->text()));
    r->setSTR(cleanText(m_str->text()));
    r->setPLZ(cleanText(m_plz->text()));
    r->setORT(cleanText(m_ort->text()));
    r->setZUSATZ(cleanText(m_zusatz->text()));
    r->setLAND(cleanText(m_land->text()));
    r->setBUNDESLAND(cleanText(m_bundesland->text()));
    const QString plain = m_notiz1->toPlainText();
    r->StoreNotes(plain.isEmpty() ? QByteArray() : RtfText::content(*m_notiz1), plain);
    return true;
}

void Tcontacteditform::sendSave()
{
    const int kind = m_editMode == 0 ? (m_newNumber.isEmpty() ? 0 : 2) : 1;
    sendMessage(m_main, WMSAVECONDATA, m_dataIndex, kind);
}

void Tcontacteditform::conedit_okExecute()
{
    conedit_okUpdate();
    if (!m_ok->isEnabled())
        return;
    if (GetDataToSave() && m_modified)
        sendSave();
    // A failed save keeps the window, and with it everything typed, open.
    if (!m_saveLocked)
        close();
}

void Tcontacteditform::conedit_uebernExecute()
{
    conedit_okUpdate();
    if (!m_uebern->isEnabled() || !GetDataToSave())
        return;
    sendSave();
    if (m_saveLocked)
        return;
    if (m_editMode == 0)
        m_editMode = 1;
    m_initialising = true;
    if (!FieldInitialEdit())
        DisableEditing();
    m_initialising = false;
    m_modified = false;
    m_notes->RichEditSelectionChange();
    conedit_okUpdate();
}

// ---------------------------------------------------------------------------------------------
// Salutation history and tool-bar arrangement

void Tcontacteditform::loadHistory()
{
    m_history.clear();
    const IniFile ini(programFile(QStringLiteral("mru")));
    const QString section = QLatin1String(kMruSection);
    const int count = std::clamp(ini.readInteger(section, QStringLiteral("1_Count"), 0), 0, kMruMax);
    for (int i = 0; i < count; ++i) {
        const QString item = cleanText(ini.readString(section, QStringLiteral("1_Item") + QString::number(i))).left(30);
        if (!item.trimmed().isEmpty() && !m_history.contains(item))
            m_history.append(item);
    }
    fillSalutationBox();
}

void Tcontacteditform::fillSalutationBox()
{
    const QString current = m_anrede->currentText();
    const bool was = m_initialising;
    m_initialising = true;
    m_anrede->clear();
    m_anrede->addItems(m_history);
    for (const QString& fixed : fixedSalutations())
        if (!m_history.contains(fixed))
            m_anrede->addItem(fixed);
    m_anrede->setCurrentIndex(-1);
    m_anrede->setCurrentText(current);
    m_initialising = was;
}

void Tcontacteditform::removeFromHistory()
{
    m_history.removeAll(m_anrede->currentText());
    fillSalutationBox();
}

void Tcontacteditform::saveHistory()
{
    const QString current = cleanText(m_anrede->currentText()).trimmed();
    if (!current.isEmpty() && !fixedSalutations().contains(current)) {
        m_history.removeAll(current);
        m_history.prepend(current);
    }
    while (m_history.size() > kMruMax)
        m_history.removeLast();
    IniFile ini(programFile(QStringLiteral("mru")));
    ini.setPath(programFile(QStringLiteral("mru")));
    const QString section = QLatin1String(kMruSection);
    const int count = static_cast<int>(m_history.size());
    ini.writeInteger(section, QStringLiteral("1_Count"), count);
    for (int i = 0; i < count; ++i)
        ini.writeString(section, QStringLiteral("1_Item") + QString::number(i), m_history.at(i));
    // Every item key beyond the count goes, however many a damaged file held.
    static const QRegularExpression itemKey(QStringLiteral("^1_Item(\\d+)$"), QRegularExpression::CaseInsensitiveOption);
    for (const QString& key : ini.keys(section)) {
        const QRegularExpressionMatch m = itemKey.match(key);
        if (m.hasMatch() && m.captured(1).toLongLong() >= count)
            ini.deleteKey(section, key);
    }
    if (!ini.save())
        logError(kLabel + QStringLiteral("FormClose\r\nDie Anrede-Historie konnte nicht gespeichert werden."));
}

} // namespace orvanta
