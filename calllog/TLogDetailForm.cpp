#include "calllog/TLogDetailForm.h"

#include "calllog/LogConnection.h"
#include "calllog/LogStatements.h"
#include "db/TDM2.h"
#include "db/TransactionWork.h"
#include "phone/PhoneNumbers.h"
#include "ui/dialogs/BusyCursor.h"
#include "platform/DialogService.h"
#include "platform/ErrorLog.h"
#include "platform/WindowMessages.h"
#include "ui/label/TVKCutLabel.h"
#include "ui/scheme/ColorScheme.h"

#include <QAction>
#include <QCloseEvent>
#include <QKeyEvent>
#include <QGridLayout>
#include <QGuiApplication>
#include <QLabel>
#include <QLineEdit>
#include <QLocale>
#include <QPushButton>
#include <QScreen>
#include <QTabWidget>
#include <QVBoxLayout>

namespace orvanta {
namespace {

const QString kLabel = QStringLiteral("# LogDetailForm - ");
const QString kDash = QStringLiteral("-");

} // namespace

TLogDetailForm::TLogDetailForm(TDM2* dm, int logId, QWidget* parent)
    : QWidget(parent, Qt::Window)
    , m_dm(dm)
    , m_logId(logId)
{
    setObjectName(QStringLiteral("LogDetailForm"));
    setWindowTitle(QStringLiteral("Bemerkung/Detailinformationen"));
    setProperty("tag", 0);

    auto* outer = new QVBoxLayout(this);
    outer->setContentsMargins(0, 0, 0, 8);

    m_p1 = new QFrame(this);
    m_p1->setObjectName(QStringLiteral("P1"));
    auto* p1Layout = new QVBoxLayout(m_p1);
    p1Layout->setContentsMargins(12, 8, 12, 8);
    auto* title = new QLabel(QStringLiteral("Bemerkung/Anruf-\nund Verbindungsdetails"), m_p1);
    title->setObjectName(QStringLiteral("P1Title"));
    QFont tf = title->font();
    tf.setBold(true);
    tf.setPointSize(tf.pointSize() + 2);
    title->setFont(tf);
    p1Layout->addWidget(title);
    outer->addWidget(m_p1);

    m_pages = new QTabWidget(this);
    m_pages->setObjectName(QStringLiteral("AdvPageControl1"));
    auto* page1 = new QWidget(m_pages);
    page1->setObjectName(QStringLiteral("AdvTabSheet1"));
    auto* page2 = new QWidget(m_pages);
    page2->setObjectName(QStringLiteral("AdvTabSheet2"));
    m_pages->addTab(page1, QStringLiteral(" Anrufdetails "));
    m_pages->addTab(page2, QStringLiteral(" Verbindungsdetails "));
    auto* g1 = new QGridLayout(page1);
    int r = 0;
    addRow(g1, r++, QStringLiteral("Anruf am/um:"), "VL1");
    addRow(g1, r++, QStringLiteral("Region:"), "VL2");
    addRow(g1, r++, QStringLiteral("Anruferbezeichnung:"), "VL3", true);
    addRow(g1, r++, QStringLiteral("Anrufernummer:"), "VL4");
    addRow(g1, r++, QStringLiteral("Anrufernummer 2:"), "VL5");
    addRow(g1, r++, QStringLiteral("Unternummer:"), "VL6");
    addRow(g1, r++, QStringLiteral("Anruf an (Bezeichnung):"), "VL7");
    addRow(g1, r++, QStringLiteral("Anruf an (Nummer):"), "VL8");
    addRow(g1, r++, QStringLiteral("Anruferanschluß:"), "VL9");
    addRow(g1, r++, QStringLiteral("Status:"), "VL17");
    g1->addWidget(new QLabel(QStringLiteral("Bemerkung:"), page1), r, 0);
    m_rzE1 = new QLineEdit(page1);
    m_rzE1->setObjectName(QStringLiteral("RzE1"));
    m_rzE1->setMaxLength(kRemarkLength);
    g1->addWidget(m_rzE1, r++, 1);
    g1->setRowStretch(r, 1);
    g1->setColumnStretch(1, 1);

    auto* g2 = new QGridLayout(page2);
    r = 0;
    addRow(g2, r++, QStringLiteral("Service:"), "VL10");
    addRow(g2, r++, QStringLiteral("Numbertype:"), "VL11");
    addRow(g2, r++, QStringLiteral("Numberplan:"), "VL12");
    addRow(g2, r++, QStringLiteral("Presentation:"), "VL13");
    addRow(g2, r++, QStringLiteral("B1Protocol:"), "VL14");
    addRow(g2, r++, QStringLiteral("B2Protocol:"), "VL15");
    addRow(g2, r++, QStringLiteral("B3Protocol:"), "VL16");
    addRow(g2, r++, QStringLiteral("Verbindung:"), "VL18");
    addRow(g2, r++, QStringLiteral("Dauer:"), "VL19");
    addRow(g2, r++, QStringLiteral("Kosten:"), "VL20");
    g2->setRowStretch(r, 1);
    g2->setColumnStretch(1, 1);
    auto* pagesBox = new QVBoxLayout;
    pagesBox->setContentsMargins(8, 8, 8, 0);
    pagesBox->addWidget(m_pages);
    outer->addLayout(pagesBox, 1);

    m_ok = new QAction(QStringLiteral("OK"), this);
    m_ok->setObjectName(QStringLiteral("logdetail_OK"));
    m_uebern = new QAction(QStringLiteral("Übernehmen"), this);
    m_uebern->setObjectName(QStringLiteral("logdetail_uebern"));
    addAction(m_ok);
    addAction(m_uebern);
    connect(m_ok, &QAction::triggered, this, &TLogDetailForm::logdetail_OKExecute);
    connect(m_uebern, &QAction::triggered, this, &TLogDetailForm::logdetail_uebernExecute);

    auto* buttons = new QHBoxLayout;
    buttons->setContentsMargins(8, 0, 8, 0);
    buttons->addStretch(1);
    m_rzB1 = new QPushButton(QStringLiteral("OK"), this);
    m_rzB1->setObjectName(QStringLiteral("RzB1"));
    m_rzB2 = new QPushButton(QStringLiteral("Übernehmen"), this);
    m_rzB2->setObjectName(QStringLiteral("RzB2"));
    m_rzB3 = new QPushButton(QStringLiteral("Abbrechen"), this);
    m_rzB3->setObjectName(QStringLiteral("RzB3"));
    for (QPushButton* b : {m_rzB1, m_rzB2, m_rzB3})
        buttons->addWidget(b);
    outer->addLayout(buttons);
    // The buttons follow their actions' enabled state.
    const auto follow = [](QAction* a, QPushButton* b) {
        connect(b, &QPushButton::clicked, a, &QAction::trigger);
        connect(a, &QAction::changed, b, [a, b] { b->setEnabled(a->isEnabled()); });
        b->setEnabled(a->isEnabled());
    };
    follow(m_ok, m_rzB1);
    follow(m_uebern, m_rzB2);
    connect(m_rzB3, &QPushButton::clicked, this, &TLogDetailForm::RzB3Click);
    connect(m_rzE1, &QLineEdit::textChanged, this, &TLogDetailForm::logdetail_OKUpdate);

    logdetail_OKUpdate();
    resize(440, 470);
}

TLogDetailForm::~TLogDetailForm() = default;

QLabel* TLogDetailForm::addRow(QGridLayout* grid, int row, const QString& caption, const char* name, bool cut)
{
    QWidget* page = grid->parentWidget();
    grid->addWidget(new QLabel(caption, page), row, 0);
    QLabel* value = nullptr;
    if (cut) {
        auto* l = new TVKCutLabel(kDash, page);
        l->setAutoSize(false);
        value = l;
    } else {
        value = new QLabel(kDash, page);
    }
    value->setObjectName(QLatin1String(name));
    value->setTextInteractionFlags(Qt::TextSelectableByMouse);
    grid->addWidget(value, row, 1);
    m_vl[QByteArrayView(name).sliced(2).toInt()] = value;
    return value;
}

// ---------------------------------------------------------------------------------------------

void TLogDetailForm::showEvent(QShowEvent* event)
{
    QWidget::showEvent(event);
    if (!m_shown) {
        m_shown = true;
        FormShow();
    }
}

void TLogDetailForm::FormShow()
{
    ApplyColorScheme();
    if (const QScreen* screen = QGuiApplication::primaryScreen())
        move(screen->availableGeometry().center() - rect().center());
    if (m_logId < 1) {
        logError(kLabel + QStringLiteral("Show\r\nDie Detaildaten konnten nicht ermittelt werden."));
        m_locked = true;
    } else if (GetLogDSData()) {
        m_savedRemark = m_rzE1->text();
    } else {
        m_locked = true;
    }
    m_pages->setCurrentIndex(0);
    m_rzE1->setFocus();
    logdetail_OKUpdate();
}

void TLogDetailForm::ApplyColorScheme()
{
    const DetailWindowColors& c = detailWindowColors(appColorScheme());
    QPalette wp = palette();
    wp.setColor(QPalette::Window, c.window);
    setPalette(wp);
    setAutoFillBackground(true);
    QPalette hp = m_p1->palette();
    hp.setColor(QPalette::Window, c.header);
    hp.setColor(QPalette::WindowText, Qt::white);
    m_p1->setPalette(hp);
    m_p1->setAutoFillBackground(true);
    m_p1->findChild<QLabel*>(QStringLiteral("P1Title"))->setPalette(hp);
}

bool TLogDetailForm::GetLogDSData()
{
    if (!logDatabaseConnected(m_dm))
        return false;
    BusyCursor busy;
    DataSet& q = m_dm->LogDetailQuery;
    const QString label = kLabel + QStringLiteral("GetLogDSData");
    QString refusal;
    const bool loaded = runInTransaction(
        m_dm->LogDetailTS, label,
        [&] {
            q.close();
            q.setCommandText(QString::fromLatin1(logsql::kSelectLogRecord));
            q.setParam(QStringLiteral("ID"), m_logId);
            q.open();
            if (!q.isActive()) {
                refusal = QStringLiteral("Auf die Tabelle konnte nicht zugegriffen werden.");
                return false;
            }
            if (q.rowCount() == 0) {
                refusal = QStringLiteral("Der Datensatz konnte nicht ermittelt werden.");
                return false;
            }
            q.first();
            const auto field = [&q](const char* name) -> std::optional<DataSetField> {
                const QString n = QString::fromLatin1(name);
                if (q.fieldIndex(n) < 0)
                    return std::nullopt;
                return q.fieldByName(n);
            };
            // A text column replaces the "-" only when it holds something.
            const auto text = [&](int vl, const char* name) {
                const auto f = field(name);
                if (f && !f->isNull()) {
                    const QString value = f->asString();
                    if (!value.isEmpty())
                        m_vl[vl]->setText(value);
                }
            };
            const auto date = field("TSDATE");
            const auto time = field("TSTIME");
            QString when = (date && !date->isNull()) ? date->asDate().toString(QStringLiteral("dd.MM.yyyy"))
                                                     : QStringLiteral("??.??.????");
            when += QStringLiteral(" - ");
            when += (time && !time->isNull()) ? time->asTime().toString(QStringLiteral("hh:mm")) : QStringLiteral("??:??");
            m_vl[1]->setText(when);
            text(2, "REGION");
            text(3, "FROMBEZ");
            text(4, "FROMPHONE");
            text(5, "FROM2");
            text(6, "FROMSUBB");
            text(7, "ONBEZ");
            text(8, "ONMSN");
            text(9, "FROMANSCHLUSS");
            text(17, "STATUS");
            if (const auto b = field("BEMERK"); b && !b->isNull())
                m_rzE1->setText(b->asString());

            if (const auto s = field("SERVICE"); s && !s->isNull()) {
                bool ok = false;
                const int code = s->asString().trimmed().toInt(&ok);
                const QString name = ok ? ServiceName(code) : QString();
                if (!name.isEmpty())
                    m_vl[10]->setText(name);
            }
            text(11, "NTYPE");
            text(12, "NPLAN");
            text(13, "PRESENT");
            text(14, "B1");
            text(15, "B2");
            text(16, "B3");
            if (const auto c = field("CTYPE"); c && !c->isNull()) {
                bool ok = false;
                const int kind = c->asString().trimmed().toInt(&ok);
                if (ok && kind == 0)
                    m_vl[18]->setText(QStringLiteral("Eingang"));
                else if (ok && kind == 1)
                    m_vl[18]->setText(QStringLiteral("Ausgang"));
            }
            if (const auto d = field("CTIME"); d && !d->isNull())
                m_vl[19]->setText(d->asTime().toString(QStringLiteral("hh:mm:ss")));
            if (const auto k = field("CCHARGE"); k && !k->isNull()) {
                const QLocale locale = QLocale::system();
                m_vl[20]->setText(locale.toCurrencyString(k->asFloat(), locale.currencySymbol(), 2));
            }
            return true;
        },
        ErrorReport::Log);
    q.close();
    if (!refusal.isEmpty())
        logError(label + QStringLiteral("\r\n") + refusal);
    return loaded;
}

bool TLogDetailForm::SetBemerkung()
{
    if (!logDatabaseConnected(m_dm))
        return false;
    BusyCursor busy;
    DataSet& q = m_dm->LogDetailQuery;
    bool gone = false;
    const bool saved = runInTransaction(
        m_dm->LogDetailTS, kLabel + QStringLiteral("SetBemerkung"),
        [&] {
            q.close();
            q.setCommandText(QString::fromLatin1(logsql::kUpdateRemark));
            q.setParam(QStringLiteral("BEM"), m_rzE1->text().left(kRemarkLength));
            q.setParam(QStringLiteral("ID"), m_logId);
            gone = q.execSQL() == 0;
            return !gone;
        },
        ErrorReport::Log);
    q.close();
    if (gone) {
        // The call was deleted meanwhile (the monitor or the maintenance): nothing was saved,
        // and saying otherwise would lose the user's text without a word.
        reportError(kLabel + QStringLiteral("SetBemerkung\r\nDer Protokolleintrag existiert nicht mehr. "
                                            "Die Bemerkung wurde nicht gespeichert."));
    }
    // The host re-reads the call once the remark is committed.
    if (saved)
        postMessage(m_host, WMLOGINFOCHANGE, m_logId, 1);
    return saved;
}

// A save that worked makes the text the saved remark; one that failed keeps the edit pending,
// so the actions stay enabled and "Abbrechen" still asks.
bool TLogDetailForm::save()
{
    const bool saved = SetBemerkung();
    m_locked = false;
    if (saved)
        m_savedRemark = m_rzE1->text();
    logdetail_OKUpdate();
    return saved;
}

void TLogDetailForm::logdetail_OKExecute()
{
    if (save())
        close();
}

void TLogDetailForm::logdetail_uebernExecute()
{
    save();
}

void TLogDetailForm::logdetail_OKUpdate()
{
    const bool enabled = !m_locked && m_rzE1->text() != m_savedRemark;
    if (m_ok->isEnabled() != enabled)
        m_ok->setEnabled(enabled);
    if (m_uebern->isEnabled() != enabled)
        m_uebern->setEnabled(enabled);
}

void TLogDetailForm::RzB3Click()
{
    if (m_rzE1->text() != m_savedRemark) {
        const DialogButton answer = dialogs().question(QStringLiteral("Änderungen speichern?"),
                                                       DialogButton::Yes | DialogButton::No, DialogButton::Yes);
        if (answer == DialogButton::Yes) {
            logdetail_OKUpdate();
            // A save that fails leaves the window open with the text, rather than losing it.
            if (m_uebern->isEnabled() && !save())
                return;
        }
    }
    close();
}

void TLogDetailForm::keyPressEvent(QKeyEvent* event)
{
    switch (event->key()) {
    case Qt::Key_Return:
    case Qt::Key_Enter:
        if (m_ok->isEnabled())
            m_ok->trigger();
        else
            RzB3Click();
        return;
    case Qt::Key_Escape:
        RzB3Click();
        return;
    default:
        QWidget::keyPressEvent(event);
    }
}

void TLogDetailForm::closeEvent(QCloseEvent* event)
{
    postMessage(m_host, WMCLOSELOGDETAILFORM, tag(), 0);
    QWidget::closeEvent(event);
}

} // namespace orvanta
