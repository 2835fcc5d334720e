// Pictures of the data dialogs on the Orders sample, for the screenshot
// program and the help file.
#include <QPrintPreviewWidget>
#include <QPrinter>
#include <QProgressDialog>
#include <QTimer>

#include "design/link_access.h"
#include "gui/data/beam.h"
#include "gui/data/csv_dialogs.h"
#include "gui/data/filter_dialog.h"
#include "gui/data/print_listing.h"
#include "gui/data/receive_window.h"
#include "gui/data/report_dialogs.h"
#include "gui/data/search_dialog.h"
#include "gui/data/sorting_dialog.h"
#include "gui/main/desktop_session.h"
#include "gui/main/main_window.h"
#include "gui/main/shots/shot_context.h"
#include "infrared/memory_transport.h"
#include "ops/linked_listing.h"
#include "ops/report.h"
#include "platform/settings.h"

namespace cx::gui {

void AddDataShots(ShotContext& shots) {
  if (!shots.OpenSample(QStringLiteral("Orders"))) return;
  Workspace& workspace = shots.session().workspace();
  Document& doc = *workspace.shown();
  QWidget* window = &shots.window();
  UiPort& ui = workspace.context().ui;

  {
    SortingDialog sorting(doc.db(), ui, window);
    shots.Save(&sorting, QStringLiteral("data-sorting"));
  }
  {
    EditFiltersDialog filters(doc.db(), window);
    FilterDialogValues v = filters.values();
    v.filter[0].enabled = true;
    v.filter[0].field = 3;  // Quantity
    v.filter[0].lowerLimit = "1";
    v.filter[0].upperLimit = "5";
    v.filter[1].enabled = true;
    v.filter[1].field = 1;  // Item
    v.filter[1].mustContain = "beans";
    v.orBetween = true;
    filters.setValues(v);
    shots.Save(&filters, QStringLiteral("data-filters"));
  }
  {
    SearchDialog search(doc.db(), window);
    SearchSettings s;
    s.text = "grinder";
    search.setSettings(s);
    shots.Save(&search, QStringLiteral("data-search"));
  }
  {
    ReportChooserDialog chooser(doc.db(), 3, window);
    shots.Save(&chooser, QStringLiteral("data-report-chooser"));
    if (auto text = BuildReport(doc.db(), 3, workspace.context().locale, doc.session().Link())) {
      ReportResultsDialog results(*text, window);
      shots.Save(&results, QStringLiteral("data-report"));
    }
  }
  {
    CsvExportDialog exporting(QStringLiteral("/home/ana/Documents/Orders.csv"), window);
    shots.Save(&exporting, QStringLiteral("data-export"));
    CsvImportDialog importing(QStringLiteral("/home/ana/Documents"), window);
    importing.setPath(QStringLiteral("/home/ana/Documents/More orders.csv"));
    shots.Save(&importing, QStringLiteral("data-import"));
  }
  {
    LinkServices services = doc.MakeLinkServices();
    LinkedRecordsListing linked(services, workspace.context().locale);
    const QString listing = ListingText(doc.session(), true, 0, &linked);
    QPrinter printer(QPrinter::HighResolution);
    QPrintPreviewWidget preview(&printer);
    QObject::connect(&preview, &QPrintPreviewWidget::paintRequested,
                     [&](QPrinter* p) { ListingPages(*p, listing).Print(QStringLiteral("Orders")); });
    preview.resize(560, 640);
    preview.fitInView();
    shots.Save(&preview, QStringLiteral("data-print-preview"));
  }
  {
    // No device ever answers, so the search window stays up to be seen.
    BeamSession beam(std::make_unique<MemoryTransport>(), std::vector<obex::BeamObject>(1), ui, window);
    beam.Start();
    for (int i = 0; i < 100 && !(beam.searchWindow() && beam.searchWindow()->isVisible()); ++i) {
      ShotContext::Settle(20);
    }
    if (beam.searchWindow()) shots.Save(beam.searchWindow(), QStringLiteral("data-beam-search"));
    beam.CancelSearch();
    for (int i = 0; i < 100 && beam.outcome() == BeamSession::Outcome::Running; ++i) ShotContext::Settle(20);
  }
  {
    MemorySettings settings;
    ReceiveWindow receive(settings, workspace.context().dataFolder, ui, [] { return nullptr; }, {}, window);
    shots.Save(&receive, QStringLiteral("data-receive"));
  }
}

}  // namespace cx::gui
