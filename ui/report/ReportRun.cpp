#include "ui/report/ReportRun.h"

#include "platform/AppException.h"
#include "platform/Clock.h"
#include "platform/ProgramFolder.h"
#include "ui/report/ReportParser.h"
#include "ui/report/TRavePreviewF.h"

#include <QFile>
#include <QFileInfo>

namespace orvanta {

namespace {

ReportPreviewHook& hook()
{
    static ReportPreviewHook h;
    return h;
}

} // namespace

void setReportPreviewHook(ReportPreviewHook h)
{
    hook() = std::move(h);
}

ReportProject loadReportProject(const QString& path)
{
    const QString name = QFileInfo(path).fileName();
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        throw AppException(QStringLiteral("Die Berichtsdatei „%1“ kann nicht gelesen werden: %2").arg(path, file.errorString()));
    if (file.size() > ReportParser::kMaxFileSize)
        throw AppException(QStringLiteral("%1: die Datei ist größer als %2 MB")
                               .arg(name)
                               .arg(ReportParser::kMaxFileSize / (1024 * 1024)));
    ReportParseResult result = ReportParser::parse(file.readAll());
    if (!result.ok())
        throw AppException(name + QStringLiteral(": ") + result.error);
    return std::move(result.project);
}

void runReport(const QString& reportName, ReportParameters parameters, ReportDataSource* source,
               const QString& previewTitle)
{
    const ReportProject project = loadReportProject(programFile(QString::fromLatin1(kReportFile)));
    const ReportDefinition* definition = project.find(reportName);
    if (!definition)
        throw AppException(QStringLiteral("%1: es gibt keinen Bericht „%2“").arg(QString::fromLatin1(kReportFile), reportName));
    ReportLayout layout(*definition, std::move(parameters), source, Clock::now());
    layout.start();
    const QString title = previewTitle.isEmpty() ? definition->title : previewTitle;
    if (hook())
        hook()(layout, title);
    else
        TRavePreviewF::showModal(layout, title);
}

} // namespace orvanta
