#include "app/ContactVCardExport.h"

#include "app/AppServices.h"
#include "contacts/ContactPersistence.h"
#include "contacts/Tcontactlistframe.h"
#include "db/TDM2.h"
#include "phone/ContactCards.h"
#include "platform/ErrorLog.h"
#include "platform/Windows1252.h"
#include "ui/grid/GridController.h"
#include "ui/grid/GridSource.h"
#include "ui/rtf/RtfReader.h"

#include <QAction>
#include <QDir>
#include <QFileDialog>
#include <QMenu>
#include <QSaveFile>
#include <QTextDocument>

namespace orvanta {

namespace {

std::function<QString(QWidget*)>& chooserSeam()
{
    static std::function<QString(QWidget*)> chooser;
    return chooser;
}

// The note as other programs can show it: rich text reduced to its text.
QString plainNote(const QByteArray& stored)
{
    if (RtfReader::isRtf(stored)) {
        QTextDocument doc;
        RtfReader::read(stored, &doc);
        return doc.toPlainText();
    }
    return fromWindows1252(stored);
}

QList<int> shownKeys(Tcontactlistframe& frame)
{
    QList<int> keys;
    const GridController* g = frame.controller();
    const GridSource* s = g ? g->source() : nullptr;
    const int lid = s ? s->fieldIndex(u"LID") : -1;
    if (lid < 0)
        return keys;
    for (const quint32 record : g->recordsInOrder())
        keys << static_cast<int>(s->intValue(record, lid));
    return keys;
}

} // namespace

void setVCardFileChooser(std::function<QString(QWidget*)> chooser)
{
    chooserSeam() = std::move(chooser);
}

int exportShownContacts(Tcontactlistframe& frame, TDM2& dm, const QString& path)
{
    QList<VCardContact> cards;
    for (const int lid : shownKeys(frame)) {
        TvkMiniKontakt contact;
        // A contact deleted meanwhile is reported by the load and left out.
        if (GetDSID_Data(dm, &contact, lid))
            cards << cardFromContact(contact, plainNote(contact.notes()));
    }
    QSaveFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(writeVCards(cards)) < 0 || !file.commit()) {
        warningBox(QStringLiteral("Die Datei \"%1\" konnte nicht geschrieben werden:\r\n%2")
                       .arg(QDir::toNativeSeparators(path), file.errorString()));
        return -1;
    }
    return int(cards.size());
}

void addVCardExport(Tcontactlistframe& frame, TDM2* dm)
{
    QMenu* popup = frame.popupMenu();
    if (!popup || !dm)
        return;
    auto* action = new QAction(QStringLiteral("Als vCard exportieren..."), &frame);
    action->setObjectName(QStringLiteral("cv_vcardexport"));
    action->setStatusTip(QStringLiteral("Die angezeigten Kontakte als vCard-Datei speichern"));
    QAction* before = nullptr;
    const QList<QAction*> entries = popup->actions();
    for (qsizetype i = 0; i + 1 < entries.size(); ++i) {
        if (entries.at(i)->objectName() == QLatin1String("cv_deletecont"))
            before = entries.at(i + 1);
    }
    popup->insertSeparator(before);
    popup->insertAction(before, action);
    QObject::connect(popup, &QMenu::aboutToShow, action, [action, &frame] {
        action->setEnabled(frame.isConnected() && frame.controller() && frame.controller()->recordCount() > 0);
    });
    QObject::connect(action, &QAction::triggered, &frame, [&frame, dm] {
        if (shownKeys(frame).isEmpty()) {
            informationBox(QStringLiteral("Die Liste zeigt keine Kontakte."));
            return;
        }
        QString path;
        if (chooserSeam()) {
            path = chooserSeam()(&frame);
        } else {
            path = QFileDialog::getSaveFileName(&frame, QStringLiteral("Als vCard exportieren"),
                                                QDir::home().filePath(QStringLiteral("Kontakte.vcf")),
                                                QStringLiteral("vCard (*.vcf)"));
        }
        if (path.isEmpty())
            return;
        const int written = exportShownContacts(frame, *dm, path);
        if (written >= 0)
            informationBox(QStringLiteral("%1 Kontakte wurden in \"%2\" gespeichert.")
                               .arg(written)
                               .arg(QDir::toNativeSeparators(path)));
    });
}

} // namespace orvanta
