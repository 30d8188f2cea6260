#include "app/ExportFeature.h"

#include "app/TLogform.h"
#include "calllog/Tlogframe.h"
#include "contacts/Tcontactlistframe.h"
#include "export/TExportGridForm.h"
#include "ui/grid/GridController.h"

namespace orvanta {

namespace {

// The log's ABID column is internal: hidden while the wizard is open, never written, and shown
// again afterwards when it was shown before.
void LogExportExecute(TLogform& w)
{
    auto* frame = dynamic_cast<Tlogframe*>(w.logFrame());
    GridController* grid = frame ? frame->controller() : nullptr;
    if (!grid)
        return;
    const int abid = grid->columnByField(u"ABID");
    const bool wasVisible = abid >= 0 && grid->isColumnVisible(abid);
    if (wasVisible)
        grid->setColumnVisible(abid, false);
    {
        TExportGridForm form(grid, &w, abid >= 0 ? QStringList{grid->column(abid).name} : QStringList{});
        form.exec();
    }
    if (wasVisible)
        grid->setColumnVisible(abid, true);
}

// The contact list's grid as it is shown, table or cards.
void ContExportExecute(TLogform& w)
{
    auto* frame = dynamic_cast<Tcontactlistframe*>(w.contactFrame());
    GridController* grid = frame ? frame->controller() : nullptr;
    if (!grid)
        return;
    TExportGridForm form(grid, &w);
    form.exec();
}

} // namespace

void registerExportFeature(TLogform& w)
{
    w.actions().define(QStringLiteral("_LogFo_ContExport"), [&w] { ContExportExecute(w); },
                       [&w] { return w.contactFrame() && w.contactFrame()->isConnected(); });
    w.actions().define(QStringLiteral("_LogFo_Export"), [&w] { LogExportExecute(w); },
                       [&w] { return w.logFrame() && !w.logFrame()->isBusy(); });
}

} // namespace orvanta
