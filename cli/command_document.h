// A database opened by a command, seen through the document layer, so that
// a record changed here goes through the same steps as one changed in the
// desktop program. Nothing of the desktop's settings is read or kept.
#pragma once

#include "app/document.h"
#include "app/preferences.h"
#include "cli/command.h"
#include "platform/data_folder.h"
#include "platform/settings.h"

namespace cx::cli {

class CommandDocument {
 public:
  CommandDocument(Context& ctx, Database& db)
      : app_{ctx.ui, ctx.locale, preferences_, recent_, DataFolder()}, doc_(app_, db) {}
  CommandDocument(const CommandDocument&) = delete;
  CommandDocument& operator=(const CommandDocument&) = delete;

  Document& doc() { return doc_; }
  const Clock& clock() const { return app_.clock; }

 private:
  MemorySettings settings_;
  Preferences preferences_{settings_};
  RecentFiles recent_{settings_};
  AppContext app_;
  Document doc_;
};

}  // namespace cx::cli
