#include "app/document.h"
#include "gui/data/data_commands.h"
#include "gui/data/receive_window.h"
#include "platform/qt/qt_platform.h"

namespace cx::gui {

DataTarget TargetFor(Document& doc) {
  DataTarget t(doc.session(), [&doc] { doc.ViewChangedExternally(false); }, doc.context().dataFolder);
  t.current = doc.currentRecord();
  t.linkServices = [&doc] { return doc.MakeLinkServices(); };
  t.find = [&doc](const SearchSettings& search) { return doc.Find(search); };
  return t;
}

ReceiveWindow* ReceiveForWindow(QWidget* window, AppContext& context, std::function<Document*()> shown,
                                Settings* settings) {
  // Without a store of the caller's, the window keeps one of its own for as
  // long as it lives.
  Settings* own = settings ? nullptr : OpenDesktopSettings().release();
  ReceiveWindow* w = ReceiveCommand(
      window, settings ? *settings : *own, context.dataFolder, context.ui,
      [shown] {
        Document* doc = shown();
        return doc ? &doc->session() : nullptr;
      },
      [shown] {
        if (Document* doc = shown()) doc->ViewChangedExternally(false);
      });
  if (own) QObject::connect(w, &QObject::destroyed, [own] { delete own; });
  return w;
}

BeamSession* BeamForWindow(QWidget* window, Document& doc, Settings* settings, obex::BeamWhat what) {
  std::unique_ptr<Settings> own = settings ? nullptr : OpenDesktopSettings();
  return BeamCommand(window, TargetFor(doc), settings ? *settings : *own, what);
}

}  // namespace cx::gui
