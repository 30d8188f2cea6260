#include "tools/appsetup/AppSetupDialog.h"

#include "platform/AppException.h"
#include "platform/DialogService.h"
#include "ui/dialogs/BusyCursor.h"
#include "ui/scheme/ColorScheme.h"

#include <QCheckBox>
#include <QComboBox>
#include <QFileDialog>
#include <QFileInfo>
#include <QFormLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QTableWidget>
#include <QTimer>
#include <QVBoxLayout>

#include <algorithm>

namespace orvanta::appsetup {

namespace {

// "AC" values in the order of the country box.
constexpr int kCountries[] = {1, 2, 3};

QLabel* headerBand(QWidget* parent, const QString& title)
{
    const DetailWindowColors& c = detailWindowColors(appColorScheme());
    auto* band = new QLabel(title, parent);
    band->setObjectName(QStringLiteral("P1"));
    QPalette p = band->palette();
    p.setColor(QPalette::Window, c.header);
    p.setColor(QPalette::WindowText, Qt::white);
    band->setPalette(p);
    band->setAutoFillBackground(true);
    QFont f = band->font();
    f.setBold(true);
    f.setPointSizeF(f.pointSizeF() * 1.2);
    band->setFont(f);
    band->setContentsMargins(12, 8, 12, 8);
    return band;
}

} // namespace

AppSetupDialog::AppSetupDialog(QWidget* parent)
    : QDialog(parent)
    , m_settings(SetupSettings::load())
{
    setObjectName(QStringLiteral("AppSetupForm"));
    setWindowTitle(QStringLiteral("Einstellungen"));
    QPalette wp = palette();
    wp.setColor(QPalette::Window, detailWindowColors(appColorScheme()).window);
    setPalette(wp);
    setAutoFillBackground(true);

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 10);
    layout->addWidget(headerBand(this, QStringLiteral("Varnik Orvanta – Einstellungen")));
    auto* body = new QVBoxLayout;
    body->setContentsMargins(12, 6, 12, 0);
    body->addWidget(buildDatabaseGroup());
    body->addWidget(buildMonitorGroup(), 1);
    layout->addLayout(body, 1);

    auto* buttons = new QHBoxLayout;
    buttons->setContentsMargins(12, 0, 12, 0);
    buttons->addStretch(1);
    auto* ok = new QPushButton(QStringLiteral("OK"), this);
    ok->setObjectName(QStringLiteral("btnOK"));
    ok->setDefault(true);
    auto* cancel = new QPushButton(QStringLiteral("Abbrechen"), this);
    cancel->setObjectName(QStringLiteral("btnCancel"));
    m_apply = new QPushButton(QStringLiteral("Übernehmen"), this);
    m_apply->setObjectName(QStringLiteral("btnApply"));
    for (QPushButton* b : {ok, cancel, m_apply})
        buttons->addWidget(b);
    layout->addLayout(buttons);
    connect(ok, &QPushButton::clicked, this, &AppSetupDialog::accept);
    connect(cancel, &QPushButton::clicked, this, &AppSetupDialog::reject);
    connect(m_apply, &QPushButton::clicked, this, &AppSetupDialog::apply);

    display(m_settings.loaded());
    resize(620, 640);
}

AppSetupDialog::~AppSetupDialog() = default;

QWidget* AppSetupDialog::buildDatabaseGroup()
{
    auto* group = new QGroupBox(QStringLiteral("Datenbank"), this);
    group->setObjectName(QStringLiteral("gbDatabase"));
    auto* form = new QFormLayout(group);

    m_embedded = new QRadioButton(QStringLiteral("Datenbankdatei auf diesem Rechner"), group);
    m_embedded->setObjectName(QStringLiteral("rbEmbedded"));
    m_server = new QRadioButton(QStringLiteral("Datenbank auf einem Firebird-Server"), group);
    m_server->setObjectName(QStringLiteral("rbServer"));
    auto* kind = new QVBoxLayout;
    kind->addWidget(m_embedded);
    kind->addWidget(m_server);
    form->addRow(QStringLiteral("Ort:"), kind);

    m_serverName = new QLineEdit(group);
    m_serverName->setObjectName(QStringLiteral("edServer"));
    m_serverName->setPlaceholderText(QStringLiteral("Rechnername oder IP-Adresse, z. B. server oder server/3050"));
    form->addRow(QStringLiteral("Server:"), m_serverName);

    m_path = new QLineEdit(group);
    m_path->setObjectName(QStringLiteral("edDatabase"));
    m_browse = new QPushButton(QStringLiteral("Durchsuchen…"), group);
    m_browse->setObjectName(QStringLiteral("btnBrowse"));
    auto* pathRow = new QHBoxLayout;
    pathRow->addWidget(m_path, 1);
    pathRow->addWidget(m_browse);
    form->addRow(QStringLiteral("Datenbank:"), pathRow);

    m_user = new QLineEdit(group);
    m_user->setObjectName(QStringLiteral("edUser"));
    form->addRow(QStringLiteral("Benutzername:"), m_user);
    m_password = new QLineEdit(group);
    m_password->setObjectName(QStringLiteral("edPassword"));
    m_password->setEchoMode(QLineEdit::Password);
    form->addRow(QStringLiteral("Kennwort:"), m_password);

    auto* test = new QPushButton(QStringLiteral("Verbindung testen"), group);
    test->setObjectName(QStringLiteral("btnTest"));
    m_testResult = new QLabel(group);
    m_testResult->setObjectName(QStringLiteral("lblTestResult"));
    m_testResult->setWordWrap(true);
    auto* testRow = new QHBoxLayout;
    testRow->addWidget(test);
    testRow->addWidget(m_testResult, 1);
    form->addRow(QString(), testRow);

    connect(test, &QPushButton::clicked, this, &AppSetupDialog::testConnection);
    connect(m_embedded, &QRadioButton::toggled, this, &AppSetupDialog::updateStates);
    for (QLineEdit* e : {m_serverName, m_path, m_user, m_password})
        connect(e, &QLineEdit::textEdited, this, [this] {
            m_testResult->clear();
            updateStates();
        });
    connect(m_browse, &QPushButton::clicked, this, [this] {
        const QString start = m_path->text().isEmpty() ? QString() : QFileInfo(m_path->text()).absolutePath();
        const QString file = QFileDialog::getOpenFileName(
            this, QStringLiteral("Datenbankdatei wählen"), start,
            QStringLiteral("Firebird-Datenbanken (*.fdb *.gdb);;Alle Dateien (*)"));
        if (!file.isEmpty()) {
            m_path->setText(file);
            m_testResult->clear();
            updateStates();
        }
    });
    return group;
}

QWidget* AppSetupDialog::buildMonitorGroup()
{
    auto* group = new QGroupBox(QStringLiteral("Rufwarte"), this);
    group->setObjectName(QStringLiteral("gbMonitor"));
    auto* layout = new QVBoxLayout(group);

    auto* form = new QFormLayout;
    m_country = new QComboBox(group);
    m_country->setObjectName(QStringLiteral("cbCountry"));
    m_country->addItems({QStringLiteral("Deutschland"), QStringLiteral("Österreich"), QStringLiteral("Schweiz")});
    form->addRow(QStringLiteral("Land der Vorwahlen:"), m_country);
    layout->addLayout(form);

    layout->addWidget(new QLabel(QStringLiteral("Eigene Rufnummern (MSN):"), group));
    m_msns = new QTableWidget(0, 2, group);
    m_msns->setObjectName(QStringLiteral("tblMsns"));
    m_msns->setHorizontalHeaderLabels({QStringLiteral("MSN"), QStringLiteral("Bezeichnung")});
    m_msns->horizontalHeader()->setSectionResizeMode(0, QHeaderView::Interactive);
    m_msns->horizontalHeader()->setStretchLastSection(true);
    m_msns->setColumnWidth(0, 180);
    m_msns->verticalHeader()->setVisible(false);
    m_msns->setSelectionBehavior(QAbstractItemView::SelectRows);
    layout->addWidget(m_msns, 1);

    auto* add = new QPushButton(QStringLiteral("Hinzufügen"), group);
    add->setObjectName(QStringLiteral("btnMsnAdd"));
    m_msnDelete = new QPushButton(QStringLiteral("Entfernen"), group);
    m_msnDelete->setObjectName(QStringLiteral("btnMsnDelete"));
    auto* row = new QHBoxLayout;
    row->addWidget(add);
    row->addWidget(m_msnDelete);
    row->addStretch(1);
    layout->addLayout(row);

    m_autostart = new QCheckBox(QStringLiteral("Rufwarte beim Anmelden automatisch starten"), group);
    m_autostart->setObjectName(QStringLiteral("cbAutostart"));
    layout->addWidget(m_autostart);

    connect(add, &QPushButton::clicked, this, [this] {
        addMsnRow({});
        m_msns->setCurrentCell(m_msns->rowCount() - 1, 0);
        m_msns->editItem(m_msns->item(m_msns->rowCount() - 1, 0));
        updateStates();
    });
    connect(m_msnDelete, &QPushButton::clicked, this, [this] {
        if (m_msns->currentRow() >= 0)
            m_msns->removeRow(m_msns->currentRow());
        updateStates();
    });
    connect(m_msns, &QTableWidget::itemChanged, this, &AppSetupDialog::updateStates);
    connect(m_msns, &QTableWidget::currentCellChanged, this, &AppSetupDialog::updateStates);
    connect(m_country, &QComboBox::currentIndexChanged, this, &AppSetupDialog::updateStates);
    connect(m_autostart, &QCheckBox::toggled, this, &AppSetupDialog::updateStates);
    return group;
}

void AppSetupDialog::addMsnRow(const MsnRecord& msn)
{
    const int row = m_msns->rowCount();
    m_msns->insertRow(row);
    m_msns->setItem(row, 0, new QTableWidgetItem(msn.MSN));
    m_msns->setItem(row, 1, new QTableWidgetItem(msn.Bezeichnung));
}

void AppSetupDialog::display(const SetupValues& v)
{
    const QSignalBlocker blockTable(m_msns);
    const DatabaseLocation location = splitDatabaseName(v.connection.database);
    (location.server.isEmpty() ? m_embedded : m_server)->setChecked(true);
    m_serverName->setText(location.server);
    m_path->setText(location.path);
    m_user->setText(v.connection.user);
    m_password->setText(v.connection.password);
    m_country->setCurrentIndex(static_cast<int>(std::find(std::begin(kCountries), std::end(kCountries), v.country)
                                                - std::begin(kCountries)));
    if (m_country->currentIndex() >= static_cast<int>(std::size(kCountries)))
        m_country->setCurrentIndex(-1);
    m_msns->setRowCount(0);
    for (const MsnRecord& msn : v.msns)
        addMsnRow(msn);
    m_autostart->setChecked(v.autostart);
    updateStates();
}

SetupValues AppSetupDialog::values() const
{
    SetupValues v;
    v.connection.database = joinDatabaseName(
        {m_server->isChecked() ? m_serverName->text() : QString(), m_path->text()});
    v.connection.user = m_user->text().trimmed();
    v.connection.password = m_password->text();
    const int country = m_country->currentIndex();
    // No choice made keeps the value as read (a country this window does not offer).
    v.country = country < 0 ? m_settings.loaded().country : kCountries[country];
    for (int row = 0; row < m_msns->rowCount(); ++row) {
        const auto text = [&](int column) {
            const QTableWidgetItem* item = m_msns->item(row, column);
            return item != nullptr ? item->text().trimmed() : QString();
        };
        MsnRecord msn{text(0), text(1)};
        // A row left empty is no entry.
        if (!msn.MSN.isEmpty() || !msn.Bezeichnung.isEmpty())
            v.msns.append(msn);
    }
    v.autostart = m_autostart->isChecked();
    return v;
}

void AppSetupDialog::updateStates()
{
    const bool server = m_server->isChecked();
    m_serverName->setEnabled(server);
    m_browse->setEnabled(!server);
    m_msnDelete->setEnabled(m_msns->currentRow() >= 0);
    m_apply->setEnabled(values() != m_settings.loaded());
}

bool AppSetupDialog::testConnection()
{
    const StoredConnection connection = values().connection;
    const auto fail = [this](const QString& text) {
        m_testResult->setText(QStringLiteral("Verbindung fehlgeschlagen."));
        dialogs().error(text, QStringLiteral("Verbindung testen"));
        return false;
    };
    if (const QString problem = SetupSettings::validateConnection(connection); !problem.isEmpty())
        return fail(problem);
    const DatabaseLocation location = splitDatabaseName(connection.database);
    if (location.server.isEmpty() && !QFileInfo(location.path).isFile())
        return fail(QStringLiteral("Die Datenbankdatei \"%1\" gibt es nicht.").arg(location.path));
    try {
        BusyCursor busy;
        connection.test();
    } catch (const AppException& e) {
        return fail(QStringLiteral("Keine Verbindung zur Datenbank \"%1\" möglich:\n%2").arg(connection.database, e.message()));
    } catch (const std::exception& e) {
        return fail(QStringLiteral("Keine Verbindung zur Datenbank \"%1\" möglich:\n%2")
                        .arg(connection.database, QString::fromLocal8Bit(e.what())));
    }
    m_testResult->setText(QStringLiteral("Verbindung erfolgreich hergestellt."));
    dialogs().information(QStringLiteral("Die Verbindung zur Datenbank \"%1\" wurde erfolgreich hergestellt.")
                              .arg(connection.database),
                          QStringLiteral("Verbindung testen"));
    return true;
}

bool AppSetupDialog::apply()
{
    const StoredConnection before = m_settings.loaded().connection;
    const QString problem = m_settings.save(values());
    updateStates();
    if (!problem.isEmpty()) {
        dialogs().error(QStringLiteral("Die Einstellungen konnten nicht gespeichert werden.\n\n") + problem);
        return false;
    }
    // The program and the monitor connect once, at their start.
    if (m_settings.loaded().connection != before)
        dialogs().information(QStringLiteral("Die neue Datenbankverbindung gilt ab dem nächsten Start von Orvanta "
                                             "und der Rufwarte."));
    return true;
}

void AppSetupDialog::accept()
{
    if (apply())
        QDialog::accept();
}

void AppSetupDialog::showEvent(QShowEvent* event)
{
    QDialog::showEvent(event);
    if (m_problemsShown || m_settings.problems().isEmpty())
        return;
    m_problemsShown = true;
    QTimer::singleShot(0, this, [this] { dialogs().warning(m_settings.problems().join(u'\n')); });
}

} // namespace orvanta::appsetup
