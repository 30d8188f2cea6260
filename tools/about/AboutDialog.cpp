#include "tools/about/AboutDialog.h"

#include "db/FbAttachment.h"
#include "db/StoredConnection.h"
#include "platform/ProgramFolder.h"
#include "ui/scheme/ColorScheme.h"

#include <QDir>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QPushButton>
#include <QVBoxLayout>

namespace orvanta::about {

namespace {

QLabel* value(QWidget* parent, const char* name, const QString& text)
{
    auto* label = new QLabel(text, parent);
    label->setObjectName(QLatin1String(name));
    label->setTextInteractionFlags(Qt::TextSelectableByMouse);
    label->setWordWrap(true);
    return label;
}

} // namespace

AboutDialog::AboutDialog(QWidget* parent)
    : QDialog(parent)
{
    setObjectName(QStringLiteral("AboutForm"));
    setWindowTitle(QStringLiteral("Info"));
    const DetailWindowColors& colors = detailWindowColors(appColorScheme());
    QPalette wp = palette();
    wp.setColor(QPalette::Window, colors.window);
    setPalette(wp);
    setAutoFillBackground(true);

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 12);

    auto* band = new QWidget(this);
    band->setObjectName(QStringLiteral("P1"));
    QPalette bp = band->palette();
    bp.setColor(QPalette::Window, colors.header);
    bp.setColor(QPalette::WindowText, Qt::white);
    band->setPalette(bp);
    band->setAutoFillBackground(true);
    band->setSizePolicy(QSizePolicy::Preferred, QSizePolicy::Fixed);
    auto* bandLayout = new QVBoxLayout(band);
    bandLayout->setContentsMargins(16, 12, 16, 12);
    QLabel* name = value(band, "lblProgram", QStringLiteral("Varnik Orvanta"));
    QFont big = name->font();
    big.setBold(true);
    big.setPointSizeF(big.pointSizeF() * 1.6);
    name->setFont(big);
    bandLayout->addWidget(name);
    bandLayout->addWidget(value(band, "lblVersion", QStringLiteral("Version ") + QStringLiteral(ORVANTA_VERSION)));
    layout->addWidget(band);

    QString database = StoredConnection::readDatabaseName();
    if (database.isEmpty())
        database = QStringLiteral("(keine Datenbank eingestellt)");

    auto* form = new QFormLayout;
    form->setContentsMargins(16, 8, 16, 8);
    form->setLabelAlignment(Qt::AlignLeft);
    form->addRow(QStringLiteral("Lizenz:"), value(this, "lblLicence", QStringLiteral("Freeware – kostenlos nutzbar und weitergebbar")));
    form->addRow(QStringLiteral("Programmverzeichnis:"), value(this, "lblProgramFolder", QDir::toNativeSeparators(programFolder())));
    form->addRow(QStringLiteral("Datenbank:"), value(this, "lblDatabase", database));
    form->addRow(QStringLiteral("Qt-Version:"), value(this, "lblQtVersion", QString::fromLatin1(qVersion())));
    form->addRow(QStringLiteral("Firebird-Client:"), value(this, "lblFirebirdVersion", FbAttachment::clientVersion()));
    layout->addLayout(form);
    layout->addStretch(1);

    auto* buttons = new QHBoxLayout;
    buttons->setContentsMargins(16, 0, 16, 0);
    buttons->addStretch(1);
    auto* ok = new QPushButton(QStringLiteral("OK"), this);
    ok->setObjectName(QStringLiteral("btnOK"));
    ok->setDefault(true);
    buttons->addWidget(ok);
    layout->addLayout(buttons);
    connect(ok, &QPushButton::clicked, this, &QDialog::accept);
    setMinimumWidth(480);
    adjustSize();
}

AboutDialog::~AboutDialog() = default;

} // namespace orvanta::about
