// Printing the "NAME: VALUE" listing through the desktop's print dialog
// and preview.
#pragma once

#include <QString>
#include <QStringList>
#include <cstddef>
#include <functional>

#include "ops/listing.h"
#include "ops/session.h"

class QPrinter;
class QWidget;

namespace cx::gui {

// The listing of every record in view (`all`) or of record `current`,
// linked records indented beneath their Link field when `linked` is given.
QString ListingText(const DataSession& session, bool all, size_t current, LinkedListing* linked);

// The listing cut into pages for `printer`: a fixed-pitch face (so the
// indents line up), lines too wide for the paper continued on the next
// line. Laid out line by line, so that a listing of every record of a full
// database pages in moments.
class ListingPages {
 public:
  ListingPages(QPrinter& printer, const QString& listing);
  int count() const { return static_cast<int>(pages_.size()); }
  // Draws every page; `progress` (when given) hears each page before it is
  // drawn and stops the printing by returning false. False when stopped.
  bool Print(const QString& title, const std::function<bool(int page, int pages)>& progress = {});

 private:
  QPrinter& printer_;
  QStringList lines_;
  std::vector<std::pair<int, int>> pages_;  // first line, line count
};

// Prints through the preview (its printer choice and page setup); a
// listing too long to preview goes to the print dialog and prints with a
// progress window that can stop it. False when nothing was printed.
bool PreviewAndPrint(QWidget* parent, const QString& listing, const QString& title);

// Pages beyond which the preview is skipped: it draws every page at once.
inline constexpr int kMaxPreviewPages = 200;

}  // namespace cx::gui
