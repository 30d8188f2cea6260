#include "export/TExportGridForm.h"

#include "platform/Clock.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSnapshot.h"

#include <QCheckBox>
#include <QCloseEvent>
#include <QCoreApplication>
#include <QDesktopServices>
#include <QDir>
#include <QFileInfo>
#include <QFileSystemModel>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QLabel>
#include <QLineEdit>
#include <QMovie>
#include <QPushButton>
#include <QRadioButton>
#include <QRegularExpressionValidator>
#include <QTimer>
#include <QTreeView>
#include <QUrl>
#include <QVBoxLayout>

namespace orvanta {

namespace {

const QString exportContext = QStringLiteral("# ExportForm - ToExport\r\n");
const QString openContext = QStringLiteral("# ExportForm - ToOpen\r\n");
const QString successText = QStringLiteral("Der Export wurde erfolgreich abgeschlossen.");
const QString failureText = QStringLiteral("Der Export wurde mit Fehlern beendet.");

QLabel* label(QWidget* parent, const char* name, const QString& text)
{
    auto* l = new QLabel(text, parent);
    l->setObjectName(QLatin1String(name));
    return l;
}

QString extensionOf(int format)
{
    return format >= 0 && format <= 3 ? exportExtension(static_cast<ExportFormat>(format)) : QString();
}

// Page 1: the format and whether to open the file afterwards.
class TExportFrame1 final : public QWidget {
public:
    explicit TExportFrame1(QWidget* parent)
        : QWidget(parent)
    {
        setObjectName(QStringLiteral("TExportFrame1"));
        auto* lay = new QVBoxLayout(this);
        lay->addWidget(label(this, "Label1",
                             QStringLiteral("Bitte wählen Sie das Format aus, in das Ihre Daten exportiert\nwerden sollen.\n\n"
                                            "Klicken Sie anschließend auf \"Weiter\" um mit dem Export\nfortzufahren.")));
        int i = 0;
        for (const char* caption : {"HTML", "Excel", "XML", "Text"}) {
            m_rb[i] = new QRadioButton(QLatin1String(caption), this);
            m_rb[i]->setObjectName(QStringLiteral("rb%1").arg(i + 1));
            lay->addWidget(m_rb[i++]);
        }
        m_cb1 = new QCheckBox(QStringLiteral("Datei nach dem Export öffnen"), this);
        m_cb1->setObjectName(QStringLiteral("cb1"));
        lay->addWidget(m_cb1);
        lay->addStretch();
    }
    void Firststep(int format, bool openAfter)
    {
        m_rb[format >= 0 && format <= 3 ? format : 0]->setChecked(true);
        m_cb1->setChecked(openAfter);
    }
    void readBack(int& format, bool& openAfter) const
    {
        format = 0;
        for (int i = 1; i < 4; ++i) {
            if (m_rb[i]->isChecked())
                format = i;
        }
        openAfter = m_cb1->isChecked();
    }

private:
    QRadioButton* m_rb[4] = {};
    QCheckBox* m_cb1 = nullptr;
};

// Page 2: the folder tree and the file name.
class TExportFrame2 final : public QWidget {
public:
    explicit TExportFrame2(QWidget* parent)
        : QWidget(parent)
    {
        setObjectName(QStringLiteral("TExportFrame2"));
        auto* lay = new QVBoxLayout(this);
        lay->addWidget(label(this, "Label1", QStringLiteral("Wählen Sie hier das Zielverzeichnis aus.")));
        m_model = new QFileSystemModel(this);
        m_model->setFilter(QDir::AllDirs | QDir::NoDotAndDotDot | QDir::Drives);
        m_model->setRootPath(QDir::rootPath());
        m_tree = new QTreeView(this);
        m_tree->setObjectName(QStringLiteral("cxSTV1"));
        m_tree->setModel(m_model);
        for (int c = 1; c < m_model->columnCount(); ++c)
            m_tree->hideColumn(c);
        m_tree->header()->hide();
        // A right click selects the folder under the mouse, as a left click does.
        m_tree->setContextMenuPolicy(Qt::CustomContextMenu);
        connect(m_tree, &QTreeView::customContextMenuRequested, m_tree, [this](const QPoint& pos) {
            const QModelIndex index = m_tree->indexAt(pos);
            if (index.isValid())
                m_tree->setCurrentIndex(index);
        });
        lay->addWidget(m_tree, 1);
        lay->addWidget(label(this, "Label2",
                             QStringLiteral("Bitte geben Sie einen Namen für die Exportdatei an (ohne \nErweiterung z.B.: .html).")));
        m_e1 = new QLineEdit(this);
        m_e1->setObjectName(QStringLiteral("E1"));
        m_e1->setMaxLength(254);
        // No blank at the start of a name (typed or pasted).
        m_e1->setValidator(new QRegularExpressionValidator(QRegularExpression(QStringLiteral("([^ ].*)?")), m_e1));
        lay->addWidget(m_e1);
    }
    QLineEdit* edit() const { return m_e1; }
    void Firststep(const QString& folder, const QString& name)
    {
        // Nothing chosen yet: start at the home folder, where the export goes without a choice.
        {
            const QModelIndex index = m_model->index(folder.isEmpty() ? QDir::homePath() : folder);
            m_tree->setCurrentIndex(index);
            m_tree->scrollTo(index);
        }
        m_e1->setText(name);
    }
    void GetPathValues(QString& folder, QString& name) const
    {
        const QModelIndex index = m_tree->currentIndex();
        folder = index.isValid() ? m_model->filePath(index) : QString();
        name = m_e1->text();
    }

private:
    QFileSystemModel* m_model = nullptr;
    QTreeView* m_tree = nullptr;
    QLineEdit* m_e1 = nullptr;
};

// Page 3: shown while the rows are written.
class TExportFrame3 final : public QWidget {
public:
    explicit TExportFrame3(QWidget* parent)
        : QWidget(parent)
    {
        setObjectName(QStringLiteral("TExportFrame3"));
        auto* lay = new QVBoxLayout(this);
        m_anim = label(this, "Anim1", {});
        lay->addWidget(m_anim);
        lay->addWidget(label(this, "Label1",
                             QStringLiteral("Der Export wird durchgeführt.\nJe nach Datenaufkommen kann dieser Vorgang einige\n"
                                            "Zeit in Anspruch nehmen.\n\nBitte haben Sie etwas Geduld.")));
        m_progress = label(this, "LProgress", {});
        lay->addWidget(m_progress);
        lay->addStretch();
    }
    void start()
    {
        // The clip is optional: without a file named "loading" beside the program the player stays still.
        const QString clip = QCoreApplication::applicationDirPath() + QStringLiteral("/loading");
        if (QFileInfo::exists(clip)) {
            auto* movie = new QMovie(clip, {}, m_anim);
            if (movie->isValid()) {
                m_anim->setMovie(movie);
                movie->start();
            }
        }
    }
    void showProgress(qint64 rows) { m_progress->setText(QStringLiteral("%1 Zeilen geschrieben").arg(rows)); }

private:
    QLabel* m_anim = nullptr;
    QLabel* m_progress = nullptr;
};

// Page 4: the result.
class TExportFrame4 final : public QWidget {
public:
    explicit TExportFrame4(QWidget* parent)
        : QWidget(parent)
    {
        setObjectName(QStringLiteral("TExportFrame4"));
        auto* lay = new QVBoxLayout(this);
        m_l1 = label(this, "L1", successText);
        QFont bold = m_l1->font();
        bold.setBold(true);
        m_l1->setFont(bold);
        m_l1->setWordWrap(true);
        lay->addWidget(m_l1);
        lay->addStretch();
    }
    void setResult(const QString& text)
    {
        m_l1->setText(text);
        QCoreApplication::processEvents();
    }

private:
    QLabel* m_l1 = nullptr;
};

} // namespace

TExportGridForm::TExportGridForm(GridController* grid, QWidget* parent, QStringList excludedColumns)
    : QDialog(parent, Qt::Dialog | Qt::WindowTitleHint | Qt::WindowSystemMenuHint | Qt::WindowCloseButtonHint
                          | Qt::WindowStaysOnTopHint)
    , m_grid(grid)
    , m_excluded(std::move(excludedColumns))
{
    setObjectName(QStringLiteral("TExportGridForm"));
    setWindowTitle(QStringLiteral("Export"));
    setFixedSize(513, 358);
    auto* outer = new QVBoxLayout(this);
    outer->setContentsMargins(0, 0, 0, 0);
    auto* top = new QHBoxLayout;
    auto* p2 = new QWidget(this);
    p2->setObjectName(QStringLiteral("P2"));
    p2->setFixedWidth(72);
    p2->setAutoFillBackground(true);
    auto* image = new QLabel(p2);
    image->setObjectName(QStringLiteral("Image1"));
    top->addWidget(p2);
    m_host = new QWidget(this);
    m_host->setObjectName(QStringLiteral("P3"));
    auto* hostLayout = new QVBoxLayout;
    hostLayout->setContentsMargins(4, 8, 8, 0);
    m_host->setLayout(hostLayout);
    top->addWidget(m_host, 1);
    outer->addLayout(top, 1);
    auto* p1 = new QWidget(this);
    p1->setObjectName(QStringLiteral("P1"));
    auto* buttons = new QHBoxLayout(p1);
    buttons->addStretch();
    m_prior = new QPushButton(QStringLiteral("< Zurück"), p1);
    m_prior->setObjectName(QStringLiteral("RzButton3"));
    m_next = new QPushButton(QStringLiteral("Weiter >"), p1);
    m_next->setObjectName(QStringLiteral("RzButton2"));
    m_next->setDefault(true);
    QFont bold = m_next->font();
    bold.setBold(true);
    m_next->setFont(bold);
    m_cancel = new QPushButton(QStringLiteral("Abbrechen"), p1);
    m_cancel->setObjectName(QStringLiteral("RzButton1"));
    buttons->addWidget(m_prior);
    buttons->addWidget(m_next);
    buttons->addWidget(m_cancel);
    outer->addWidget(p1);
    connect(m_prior, &QPushButton::clicked, this, [this] { SetFrames(0); });
    connect(m_next, &QPushButton::clicked, this, [this] { SetFrames(1); });
    connect(m_cancel, &QPushButton::clicked, this, &TExportGridForm::cancelClicked);
    SetFirstFrame();
}

TExportGridForm::~TExportGridForm() = default;

void TExportGridForm::releasePage()
{
    if (!m_current)
        return;
    if (auto* p1 = dynamic_cast<TExportFrame1*>(m_current.data()))
        p1->readBack(m_format, m_openAfter);
    else if (auto* p2 = dynamic_cast<TExportFrame2*>(m_current.data()))
        p2->GetPathValues(m_folder, m_fileName);
    delete m_current.data();
    m_page = NoPage;
}

void TExportGridForm::showPage(Page page)
{
    releasePage();
    QWidget* w = nullptr;
    switch (page) {
    case PageFormat: {
        auto* p = new TExportFrame1(m_host);
        p->Firststep(m_format, m_openAfter);
        w = p;
        break;
    }
    case PageTarget: {
        auto* p = new TExportFrame2(m_host);
        p->Firststep(m_folder, m_fileName);
        connect(p->edit(), &QLineEdit::textChanged, this, &TExportGridForm::updateButtons);
        w = p;
        break;
    }
    case PageRunning:
        w = new TExportFrame3(m_host);
        break;
    case PageResult:
        w = new TExportFrame4(m_host);
        break;
    case NoPage:
        break;
    }
    m_current = w;
    m_page = page;
    if (w) {
        m_host->layout()->addWidget(w);
        w->show();
    }
    updateButtons();
}

void TExportGridForm::SetFirstFrame()
{
    if (m_page == PageFormat)
        return;
    showPage(PageFormat);
}

void TExportGridForm::SetFrames(int direction)
{
    switch (m_page) {
    case PageFormat:
        if (direction == 1)
            showPage(PageTarget);
        break;
    case PageResult:
        if (direction == 1)
            accept();
        break;
    case PageTarget:
        if (direction == 0) {
            showPage(PageFormat);
        } else {
            showPage(PageRunning);
            static_cast<TExportFrame3*>(m_current.data())->start();
            QCoreApplication::processEvents();
            QTimer::singleShot(m_startDelay, this, &TExportGridForm::runExport);
        }
        break;
    default:
        break;
    }
}

void TExportGridForm::runExport()
{
    const bool ok = ToExport();
    showPage(PageResult);
    static_cast<TExportFrame4*>(m_current.data())->setResult(ok ? successText : failureText);
    if (ok && m_openAfter)
        ToOpen();
}

QString TExportGridForm::targetFile() const
{
    const QString ext = extensionOf(m_format);
    if (ext.isEmpty())
        return {};
    return QDir(m_folder).filePath(m_fileName + u'.' + ext);
}

bool TExportGridForm::ToExport()
{
    if (!m_grid) {
        logError(exportContext + QStringLiteral("Datenquelle ist nicht initialisiert!"));
        return false;
    }
    if (m_fileName.isEmpty())
        m_fileName = QStringLiteral("Export_") + Clock::today().toString(QStringLiteral("ddMMyyyy"));
    // The name is a name, never a path: nothing may land outside the chosen folder.
    if (m_fileName.contains(u'/') || m_fileName.contains(u'\\') || m_fileName.contains(QLatin1String(".."))) {
        logError(exportContext + QStringLiteral("Der Dateiname ist ungültig!"));
        return false;
    }
    if (m_folder.isEmpty())
        m_folder = QDir::homePath();
    if (!QFileInfo(m_folder).isDir()) {
        logError(exportContext + QStringLiteral("Das ausgewählte Verzeichnis konnte nicht gefunden werden!"));
        return false;
    }
    const QString path = targetFile();
    if (path.isEmpty()) {
        logError(exportContext + QStringLiteral("Das Exportformat ist unbekannt!"));
        return false;
    }
    if (QFileInfo::exists(path)) {
        const QString text = QStringLiteral("Die angegebene Exportdatei \"") + QDir::toNativeSeparators(path)
            + QStringLiteral("\"\r\nexistiert bereits!\r\n\r\nÜberschreiben?");
        if (dialogs().show(DialogKind::Warning, {}, text, DialogButton::Yes | DialogButton::No, DialogButton::Yes)
            != DialogButton::Yes)
            return true;
    }
    GridSnapshot snapshot(*m_grid, m_excluded);
    const ExportResult result = exportGrid(snapshot, static_cast<ExportFormat>(m_format), path, [this](qint64 rows) {
        if (auto* page = dynamic_cast<TExportFrame3*>(m_current.data()))
            page->showProgress(rows);
        // Keep the waiting page painted; the buttons are disabled meanwhile.
        QCoreApplication::processEvents(QEventLoop::ExcludeUserInputEvents);
        return true;
    });
    if (!result.ok)
        logError(exportContext + result.error);
    return result.ok;
}

void TExportGridForm::ToOpen()
{
    const QString path = targetFile();
    if (path.isEmpty()) {
        logError(openContext + QStringLiteral("Das Exportformat ist unbekannt!"));
        return;
    }
    if (!QFileInfo::exists(path)) {
        logError(openContext + QStringLiteral("Die Exportdatei konnte nicht gefunden werden!"));
        return;
    }
    // The desktop only says whether it found a program for the file.
    if (!QDesktopServices::openUrl(QUrl::fromLocalFile(path)))
        logError(openContext + QStringLiteral("Dieser Dateinamenserweiterung ist keine Applikation zugeordnet."));
}

void TExportGridForm::updateButtons()
{
    auto set = [](QPushButton* b, bool enabled) {
        if (b->isEnabled() != enabled)
            b->setEnabled(enabled);
    };
    auto caption = [this](const QString& text) {
        if (m_next->text() != text)
            m_next->setText(text);
    };
    switch (m_page) {
    case PageFormat:
        caption(QStringLiteral("Weiter >"));
        set(m_next, true);
        set(m_prior, false);
        set(m_cancel, true);
        break;
    case PageTarget: {
        const auto* p = static_cast<TExportFrame2*>(m_current.data());
        caption(QStringLiteral("Exportieren"));
        set(m_next, !p->edit()->text().isEmpty());
        set(m_prior, true);
        set(m_cancel, true);
        break;
    }
    case PageRunning:
        caption(QStringLiteral("Exportieren"));
        set(m_next, false);
        set(m_prior, false);
        set(m_cancel, false);
        break;
    case PageResult:
        caption(QStringLiteral("Schließen"));
        set(m_next, true);
        set(m_prior, false);
        set(m_cancel, false);
        break;
    case NoPage:
        break;
    }
}

void TExportGridForm::cancelClicked()
{
    if (dialogs().show(DialogKind::Question, {}, QStringLiteral("Exportvorgang abbrechen?"),
                       DialogButton::Yes | DialogButton::No, DialogButton::Yes)
        == DialogButton::Yes)
        QDialog::reject();
}

void TExportGridForm::reject()
{
    // Escape and the close box while the rows are written would leave a half-done export.
    if (m_page == PageRunning)
        return;
    QDialog::reject();
}

void TExportGridForm::closeEvent(QCloseEvent* event)
{
    if (m_page == PageRunning) {
        event->ignore();
        return;
    }
    QDialog::closeEvent(event);
}

} // namespace orvanta
