#include "gui/data/print_listing.h"

#include <QFontDatabase>
#include <QFontMetricsF>
#include <QPainter>
#include <QPrintDialog>
#include <QPrintPreviewDialog>
#include <QPrinter>
#include <QProgressDialog>
#include <algorithm>

#include "gui/common/help.h"
#include "gui/common/text.h"
#include "ops/text_sink.h"

namespace cx::gui {
namespace {

QFont ListingFont() {
  QFont font = QFontDatabase::systemFont(QFontDatabase::FixedFont);
  font.setStyleHint(QFont::TypeWriter);
  font.setPointSize(10);
  return font;
}

struct PageGeometry {
  QRectF area;
  double lineHeight = 1;
  int linesPerPage = 1;
  int charsPerLine = 1;
};

PageGeometry GeometryOf(QPrinter& printer) {
  PageGeometry g;
  const QFontMetricsF fm(ListingFont(), &printer);
  g.area = QRectF(QPointF(0, 0), printer.pageLayout().paintRectPixels(printer.resolution()).size());
  g.lineHeight = std::max(1.0, fm.lineSpacing());
  // One line at the foot of each page holds its number.
  g.linesPerPage = std::max(1, static_cast<int>(g.area.height() / g.lineHeight) - 2);
  g.charsPerLine = std::max(8, static_cast<int>(g.area.width() / std::max(1.0, fm.horizontalAdvance(QLatin1Char('M')))));
  return g;
}

}  // namespace

QString ListingText(const DataSession& session, bool all, size_t current, LinkedListing* linked) {
  StringSink out;
  ListingContext ctx{session.locale, linked};
  WriteListing(session.db, all, current, out, ctx, session.Link());
  return FromDb(out.text);
}

ListingPages::ListingPages(QPrinter& printer, const QString& listing) : printer_(printer) {
  const PageGeometry g = GeometryOf(printer);
  QStringList raw = listing.split('\n');
  if (!raw.isEmpty() && raw.back().isEmpty()) raw.removeLast();
  lines_.reserve(raw.size());
  for (const QString& line : raw) {
    // A wide value goes on below, indented as its line began.
    int at = 0;
    do {
      lines_ << line.mid(at, g.charsPerLine);
      at += g.charsPerLine;
    } while (at < line.size());
  }
  for (int first = 0; first < lines_.size(); first += g.linesPerPage) {
    pages_.emplace_back(first, std::min<int>(g.linesPerPage, static_cast<int>(lines_.size()) - first));
  }
}

bool ListingPages::Print(const QString& title, const std::function<bool(int, int)>& progress) {
  printer_.setDocName(title);
  QPainter painter;
  if (!painter.begin(&printer_)) return false;
  const PageGeometry g = GeometryOf(printer_);
  painter.setFont(ListingFont());
  const QFontMetricsF fm(ListingFont(), &printer_);
  for (int p = 0; p < count(); ++p) {
    if (progress && !progress(p, count())) {
      printer_.abort();
      return false;
    }
    if (p > 0) printer_.newPage();
    const auto [first, n] = pages_[p];
    for (int i = 0; i < n; ++i) {
      painter.drawText(QPointF(0, fm.ascent() + i * g.lineHeight), lines_[first + i]);
    }
    painter.drawText(QRectF(0, g.area.height() - g.lineHeight, g.area.width(), g.lineHeight), Qt::AlignHCenter,
                     QString::number(p + 1));
  }
  return painter.end();
}

bool PreviewAndPrint(QWidget* parent, const QString& listing, const QString& title) {
  QPrinter printer(QPrinter::HighResolution);
  if (ListingPages(printer, listing).count() <= kMaxPreviewPages) {
    QPrintPreviewDialog preview(&printer, parent);
    preview.setObjectName("printPreview");
    preview.setWindowTitle(title);
    InstallHelpShortcut(&preview, QStringLiteral("Print_Records"));
    QObject::connect(&preview, &QPrintPreviewDialog::paintRequested, &preview,
                     [&](QPrinter* p) { ListingPages(*p, listing).Print(title); });
    return preview.exec() == QDialog::Accepted;
  }
  QPrintDialog dialog(&printer, parent);
  dialog.setObjectName("printDialog");
  dialog.setWindowTitle(title);
  if (dialog.exec() != QDialog::Accepted) return false;
  ListingPages pages(printer, listing);
  QProgressDialog progress("Printing...", "Stop", 0, pages.count(), parent);
  progress.setObjectName("printProgress");
  progress.setWindowModality(Qt::WindowModal);
  progress.setMinimumDuration(500);
  return pages.Print(title, [&](int page, int) {
    progress.setValue(page);
    return !progress.wasCanceled();
  });
}

}  // namespace cx::gui
