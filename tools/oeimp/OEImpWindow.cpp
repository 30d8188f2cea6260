#include "tools/oeimp/OEImpWindow.h"

#include "db/TDM2.h"

#include <QApplication>
#include <QDir>
#include <QFileDialog>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QLabel>
#include <QListWidget>
#include <QProgressBar>
#include <QPushButton>
#include <QSplitter>
#include <QTableWidget>
#include <QVBoxLayout>

namespace orvanta::oeimp {

namespace {

OEImpWindow::FileChooser& chooserSeam()
{
    static OEImpWindow::FileChooser chooser;
    return chooser;
}

// The result next to the designation, where it stays in sight however wide the rest is.
enum Column { Designation, Result, Name, Given, Company, Numbers, Mails, Town, Category, Notes, ColumnCount };

QString numbersOf(const TvkMiniKontakt& c)
{
    QStringList out;
    for (const TvkKommItem& e : c.KD())
        out << e.KOMMBEZ + QStringLiteral(": ") + QStringList{e.LC, e.VORW, e.NUMBER}.join(QLatin1Char(' ')).trimmed();
    return out.join(QStringLiteral("; "));
}

QString mailsOf(const TvkMiniKontakt& c)
{
    QStringList out;
    for (const TvkMailItem& e : c.Mail())
        out << e.MAILADDR;
    return out.join(QStringLiteral("; "));
}

} // namespace

void OEImpWindow::setFileChooser(FileChooser chooser)
{
    chooserSeam() = std::move(chooser);
}

OEImpWindow::OEImpWindow(TDM2& dm, int homeCountry, QWidget* parent)
    : QDialog(parent)
    , m_dm(dm)
    , m_homeCountry(homeCountry)
{
    setObjectName(QStringLiteral("OEImpForm"));
    setWindowTitle(QStringLiteral("Kontakte importieren"));
    resize(980, 560);
    auto* layout = new QVBoxLayout(this);

    auto* top = new QHBoxLayout;
    m_choose = new QPushButton(QStringLiteral("Datei wählen..."), this);
    m_choose->setObjectName(QStringLiteral("btnChoose"));
    m_file = new QLabel(QStringLiteral("Wählen Sie eine vCard-Datei (.vcf) oder einen CSV-Export eines Adressbuchs."), this);
    m_file->setObjectName(QStringLiteral("lblFile"));
    m_file->setTextInteractionFlags(Qt::TextSelectableByMouse);
    top->addWidget(m_choose);
    top->addWidget(m_file, 1);
    layout->addLayout(top);

    auto* split = new QSplitter(Qt::Vertical, this);
    m_preview = new QTableWidget(0, ColumnCount, split);
    m_preview->setObjectName(QStringLiteral("tblPreview"));
    m_preview->setHorizontalHeaderLabels({QStringLiteral("Bezeichnung"), QStringLiteral("Ergebnis"), QStringLiteral("Name"),
                                          QStringLiteral("Vorname"), QStringLiteral("Firma"),
                                          QStringLiteral("Telefon"), QStringLiteral("E-Mail"),
                                          QStringLiteral("PLZ/Ort"), QStringLiteral("Kategorie"),
                                          QStringLiteral("Hinweise")});
    m_preview->setEditTriggers(QAbstractItemView::NoEditTriggers);
    m_preview->setSelectionBehavior(QAbstractItemView::SelectRows);
    m_preview->verticalHeader()->setVisible(false);
    m_preview->horizontalHeader()->setStretchLastSection(true);
    m_messages = new QListWidget(split);
    m_messages->setObjectName(QStringLiteral("lstMessages"));
    split->setStretchFactor(0, 4);
    split->setStretchFactor(1, 1);
    layout->addWidget(split, 1);

    m_progress = new QProgressBar(this);
    m_progress->setObjectName(QStringLiteral("pbImport"));
    m_progress->setRange(0, 1);
    m_progress->setValue(0);
    layout->addWidget(m_progress);

    auto* bottom = new QHBoxLayout;
    m_summary = new QLabel(this);
    m_summary->setObjectName(QStringLiteral("lblSummary"));
    m_import = new QPushButton(QStringLiteral("Importieren"), this);
    m_import->setObjectName(QStringLiteral("btnImport"));
    m_import->setEnabled(false);
    m_close = new QPushButton(QStringLiteral("Schließen"), this);
    m_close->setObjectName(QStringLiteral("btnClose"));
    bottom->addWidget(m_summary, 1);
    bottom->addWidget(m_import);
    bottom->addWidget(m_close);
    layout->addLayout(bottom);

    m_connected = m_dm.IBDatabase1.isConnected();
    if (!m_connected)
        m_summary->setText(QStringLiteral("Keine Verbindung zur Datenbank – ein Import ist nicht möglich."));

    connect(m_choose, &QPushButton::clicked, this, &OEImpWindow::chooseFile);
    connect(m_import, &QPushButton::clicked, this, &OEImpWindow::runImport);
    connect(m_close, &QPushButton::clicked, this, &QDialog::accept);
}

void OEImpWindow::chooseFile()
{
    QString path;
    if (chooserSeam()) {
        path = chooserSeam()(this);
    } else {
        path = QFileDialog::getOpenFileName(this, QStringLiteral("Kontakte importieren"), QDir::homePath(),
                                            QStringLiteral("Adressbücher (*.vcf *.vcard *.csv);;vCard (*.vcf *.vcard);;"
                                                           "CSV-Export (*.csv);;Alle Dateien (*)"));
    }
    if (!path.isEmpty())
        openFile(path);
}

bool OEImpWindow::openFile(const QString& path)
{
    m_plan = readImportFile(path, m_homeCountry);
    m_imported = m_skipped = m_failed = 0;
    m_file->setText(QDir::toNativeSeparators(path));
    fillPreview();
    if (!m_plan.error.isEmpty()) {
        m_summary->setText(m_plan.error);
        m_import->setEnabled(false);
        return false;
    }
    // Marked beforehand, so the preview shows what the import will really create.
    int present = 0;
    if (m_connected) {
        ContactImporter importer(m_dm);
        for (int row = 0; row < m_plan.contacts.size(); ++row) {
            if (importer.isPresent(m_plan.contacts.at(row).contact)) {
                m_preview->item(row, Result)->setText(QStringLiteral("schon vorhanden"));
                ++present;
            }
        }
    }
    const auto count = [](qsizetype n, const char* one, const char* many) {
        return QStringLiteral("%1 %2").arg(n).arg(QString::fromUtf8(n == 1 ? one : many));
    };
    QString text = count(m_plan.contacts.size() - present, "Kontakt wird angelegt.", "Kontakte werden angelegt.");
    if (present > 0)
        text += QLatin1Char(' ') + count(present, "ist schon vorhanden.", "sind schon vorhanden.");
    if (m_plan.skipped > 0)
        text += QLatin1Char(' ') + count(m_plan.skipped, "Eintrag der Datei ist kein Kontakt.", "Einträge der Datei sind keine Kontakte.");
    m_summary->setText(m_connected ? text : QStringLiteral("Keine Verbindung zur Datenbank – ein Import ist nicht möglich."));
    m_import->setEnabled(m_connected && !m_plan.contacts.isEmpty());
    m_progress->setRange(0, std::max<int>(1, int(m_plan.contacts.size())));
    m_progress->setValue(0);
    return true;
}

void OEImpWindow::fillPreview()
{
    m_preview->setRowCount(0);
    m_preview->setRowCount(int(m_plan.contacts.size()));
    m_messages->clear();
    m_messages->addItems(m_plan.messages);
    for (int row = 0; row < m_plan.contacts.size(); ++row) {
        const CardImport& entry = m_plan.contacts.at(row);
        const TvkMiniKontakt& c = entry.contact;
        const QString cells[ColumnCount] = {c.CONTBEZ(), QString(), c.NAME(), c.VNAME(), c.FIRMA(), numbersOf(c), mailsOf(c),
                                            QStringList{c.PLZ(), c.ORT()}.join(QLatin1Char(' ')).trimmed(),
                                            c.KATBEZ(), entry.notes.join(QStringLiteral("; "))};
        for (int col = 0; col < ColumnCount; ++col)
            m_preview->setItem(row, col, new QTableWidgetItem(cells[col]));
        for (const QString& note : entry.notes)
            m_messages->addItem(c.CONTBEZ() + QStringLiteral(": ") + note);
    }
    m_preview->resizeColumnsToContents();
    for (int col = 0; col < ColumnCount; ++col)
        m_preview->setColumnWidth(col, std::min(m_preview->columnWidth(col), 260));
    m_preview->setColumnWidth(Result, 170);
}

void OEImpWindow::runImport()
{
    if (!m_connected || m_plan.contacts.isEmpty())
        return;
    m_import->setEnabled(false);
    m_choose->setEnabled(false);
    m_close->setEnabled(false);
    m_imported = m_failed = 0;
    m_skipped = m_plan.skipped;
    ContactImporter importer(m_dm);
    m_progress->setRange(0, int(m_plan.contacts.size()));
    for (int row = 0; row < m_plan.contacts.size(); ++row) {
        const ImportOutcome outcome = importer.importContact(m_plan.contacts.at(row).contact);
        QString result;
        switch (outcome) {
        case ImportOutcome::Imported:
            ++m_imported;
            result = QStringLiteral("importiert");
            break;
        case ImportOutcome::Skipped:
            ++m_skipped;
            result = QStringLiteral("übersprungen (schon vorhanden)");
            break;
        case ImportOutcome::Failed:
            ++m_failed;
            result = QStringLiteral("fehlerhaft");
            m_messages->addItem(m_plan.contacts.at(row).contact.CONTBEZ()
                                + QStringLiteral(": konnte nicht gespeichert werden"));
            break;
        }
        m_preview->item(row, Result)->setText(result);
        m_progress->setValue(row + 1);
        QCoreApplication::processEvents(QEventLoop::ExcludeUserInputEvents);
    }
    m_summary->setText(QStringLiteral("%1 importiert, %2 übersprungen, %3 fehlerhaft").arg(m_imported).arg(m_skipped).arg(m_failed));
    // The same contacts a second time would only be skipped.
    m_plan.contacts.clear();
    m_choose->setEnabled(true);
    m_close->setEnabled(true);
}

} // namespace orvanta::oeimp
