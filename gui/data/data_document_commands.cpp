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

ReceiveWindow* ReceiveForWindow(QWidget* window, AppContext& context, std::function<Document*()> shown) {
  // The window keeps its settings store for as long as it lives.
  Settings* settings = OpenDesktopSettings().release();
  ReceiveWindow* w = ReceiveCommand(
      window, *settings, context.dataFolder, context.ui,
      [shown] {
        Document* doc = shown();
        return doc ? &doc->session() : nullptr;
      },
      [shown] {
        if (Document* doc = shown()) doc->ViewChangedExternally(false);
      });
  QObject::connect(w, &QObject::destroyed, [settings] { delete settings; });
  return w;
}

}  // namespace cx::gui
