#include "contacts/Tnotizviewform.h"

#include "contacts/ContactReports.h"
#include "contacts/ContactStatements.h"
#include "db/TDM2.h"
#include "platform/ErrorLog.h"
#include "ui/dialogs/BusyCursor.h"
#include "ui/rtf/RtfReader.h"
#include "ui/rtf/RtfWriter.h"

#include <QFrame>
#include <QHBoxLayout>
#include <QLabel>
#include <QPushButton>
#include <QStatusBar>
#include <QTextEdit>
#include <QVBoxLayout>

namespace orvanta {
namespace {

QPointer<Tnotizviewform>& theInstance()
{
    static QPointer<Tnotizviewform> w;
    return w;
}

const QString kLabel = QStringLiteral("# Notizanzeige - GetNotizData\r\n");

bool printNote(const QString& designation, const QByteArray& rtf)
{
    ReportOutcome outcome;
    if (NotizDruck(designation, rtf, outcome))
        return true;
    reportError(reportFailureEntry(QStringLiteral("NotizDruck"), outcome));
    return false;
}

Tnotizviewform::NotePrinter& printer()
{
    static Tnotizviewform::NotePrinter p = printNote;
    return p;
}

} // namespace

Tnotizviewform::Tnotizviewform(TDM2* dm, int contactLid, QWidget* parent)
    : QWidget(parent, Qt::Window | Qt::WindowStaysOnTopHint | Qt::WindowSystemMenuHint | Qt::WindowMaximizeButtonHint
                          | Qt::WindowCloseButtonHint)
    , m_dm(dm)
    , m_lid(contactLid)
{
    setObjectName(QStringLiteral("notizviewform"));
    setAttribute(Qt::WA_DeleteOnClose);
    setWindowTitle(QStringLiteral("Notiz"));
    resize(550, 418);
    setMinimumSize(350, 260);
    auto* box = new QVBoxLayout(this);
    box->setContentsMargins(0, 0, 0, 0);
    box->setSpacing(0);
    auto* p1 = new QFrame(this);
    p1->setObjectName(QStringLiteral("P1"));
    p1->setFixedHeight(25);
    auto* p1l = new QHBoxLayout(p1);
    p1l->setContentsMargins(6, 0, 6, 0);
    m_l1 = new QLabel(p1);
    m_l1->setObjectName(QStringLiteral("L1"));
    m_l1->setFont(QFont(QStringLiteral("Verdana"), 8));
    m_l1->setTextFormat(Qt::PlainText);
    p1l->addWidget(m_l1);
    box->addWidget(p1);
    m_notiz1 = new QTextEdit(this);
    m_notiz1->setObjectName(QStringLiteral("Notiz1"));
    m_notiz1->setReadOnly(true);
    m_notiz1->setFont(QFont(QStringLiteral("Arial"), 8));
    box->addWidget(m_notiz1, 1);
    auto* p2 = new QFrame(this);
    p2->setObjectName(QStringLiteral("P2"));
    p2->setFixedHeight(35);
    auto* p2l = new QHBoxLayout(p2);
    p2l->setContentsMargins(6, 4, 6, 4);
    m_print = new QPushButton(QStringLiteral("Drucken"), p2);
    m_print->setObjectName(QStringLiteral("RzB2"));
    m_print->setEnabled(false);
    m_close = new QPushButton(QStringLiteral("Schließen"), p2);
    m_close->setObjectName(QStringLiteral("RzB1"));
    QFont bold = m_close->font();
    bold.setBold(true);
    m_close->setFont(bold);
    p2l->addWidget(m_print);
    p2l->addStretch(1);
    p2l->addWidget(m_close);
    box->addWidget(p2);
    auto* status = new QStatusBar(this);
    status->setObjectName(QStringLiteral("dxStatusBar1"));
    box->addWidget(status);
    connect(m_close, &QPushButton::clicked, this, &QWidget::close);
    connect(m_print, &QPushButton::clicked, this, &Tnotizviewform::RzB2Click);
}

Tnotizviewform::~Tnotizviewform()
{
    if (theInstance() == this)
        theInstance() = nullptr;
}

Tnotizviewform* Tnotizviewform::instance()
{
    return theInstance().data();
}

Tnotizviewform* Tnotizviewform::showNote(TDM2* dm, int lid)
{
    if (Tnotizviewform* w = instance()) {
        w->SetContactLID(lid);
        w->show();
        w->raise();
        w->activateWindow();
        return w;
    }
    auto* w = new Tnotizviewform(dm, lid);
    theInstance() = w;
    w->show();
    return w;
}

void Tnotizviewform::setNotePrinter(NotePrinter p)
{
    printer() = p ? std::move(p) : printNote;
}

void Tnotizviewform::RzB2Click()
{
    if (m_contbez.isEmpty()) {
        reportError(QStringLiteral("Es konnte keine Kontaktbezeichnung ermittelt werden."));
        return;
    }
    if (printer())
        (void)printer()(m_contbez, RtfWriter::write(*m_notiz1->document()));
}

void Tnotizviewform::closeInstance()
{
    if (Tnotizviewform* w = instance())
        w->close();
}

void Tnotizviewform::showEvent(QShowEvent* event)
{
    QWidget::showEvent(event);
    if (m_loads == 0 && m_lid > 0)
        load();
}

void Tnotizviewform::SetContactLID(int lid)
{
    if (lid == m_lid || lid < 1)
        return;
    m_lid = lid;
    load();
}

void Tnotizviewform::load()
{
    ++m_loads;
    ClearContent();
    if (GetNotizData()) {
        m_print->setEnabled(true);
        m_l1->setText(QStringLiteral("Notizen zum Kontakt \"") + m_contbez + QLatin1Char('"'));
    } else {
        ClearContent();
    }
}

void Tnotizviewform::ClearContent()
{
    m_print->setEnabled(false);
    m_contbez.clear();
    m_l1->clear();
    m_notiz1->clear();
}

bool Tnotizviewform::GetNotizData()
{
    if (!m_dm || !m_dm->DBConnect())
        return false;
    BusyCursor busy;
    DataSet& q = m_dm->GetBlob;
    bool ok = false;
    try {
        q.close();
        q.setCommandText(QString::fromLatin1(contactsql::kSelectNote));
        q.setParam(QStringLiteral("ID"), m_lid);
        q.open();
        if (!q.isActive()) {
            reportError(kLabel + QStringLiteral("Datenbankabfrage konnte nicht ausgeführt werden.\r\n"
                                                "Notiz kann nicht angezeigt werden."));
        } else {
            // A contact deleted meanwhile has no note to show: the window stays empty.
            ok = q.rowCount() > 0;
            if (ok) {
                q.first();
                const int notiz = q.fieldIndex(u"NOTIZ");
                const QByteArray rtf = notiz >= 0 ? q.store().bytes(0, notiz).toByteArray() : QByteArray();
                // A note some other program stored as plain text is shown as such.
                if (RtfReader::isRtf(rtf))
                    RtfReader::read(rtf, m_notiz1->document());
                else if (!rtf.isEmpty())
                    m_notiz1->setPlainText(QString::fromLatin1(rtf));
                m_contbez = q.fieldByName(u"CONTBEZ").asString();
            }
        }
    } catch (const std::exception& e) {
        reportError(kLabel + QStringLiteral("Notiz kann nicht angezeigt werden."), &e);
        ok = false;
    }
    q.close();
    // It only reads.
    m_dm->BlobTS.rollbackQuietly();
    return ok;
}

} // namespace orvanta
