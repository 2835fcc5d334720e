#include "gui/data/print_listing.h"

#include <QFontDatabase>
#include <QPrintPreviewDialog>
#include <QPrinter>
#include <QTextDocument>
#include <QTextOption>

#include "gui/common/help.h"
#include "gui/common/text.h"
#include "ops/text_sink.h"

namespace cx::gui {

QString ListingText(const DataSession& session, bool all, size_t current, LinkedListing* linked) {
  StringSink out;
  ListingContext ctx{session.locale, linked};
  WriteListing(session.db, all, current, out, ctx, session.Link());
  return FromDb(out.text);
}

void PrintListing(QPrinter& printer, const QString& listing, const QString& title) {
  QTextDocument doc;
  QFont font = QFontDatabase::systemFont(QFontDatabase::FixedFont);
  font.setStyleHint(QFont::TypeWriter);
  font.setPointSize(10);
  doc.setDefaultFont(font);
  QTextOption option = doc.defaultTextOption();
  option.setWrapMode(QTextOption::WrapAtWordBoundaryOrAnywhere);
  doc.setDefaultTextOption(option);
  doc.setPlainText(listing);
  doc.setMetaInformation(QTextDocument::DocumentTitle, title);
  printer.setDocName(title);
  doc.print(&printer);
}

bool PreviewAndPrint(QWidget* parent, const QString& listing, const QString& title) {
  QPrinter printer(QPrinter::HighResolution);
  QPrintPreviewDialog preview(&printer, parent);
  preview.setObjectName("printPreview");
  preview.setWindowTitle(title);
  InstallHelpShortcut(&preview, QStringLiteral("Print_Records"));
  QObject::connect(&preview, &QPrintPreviewDialog::paintRequested, &preview,
                   [&](QPrinter* p) { PrintListing(*p, listing, title); });
  return preview.exec() == QDialog::Accepted;
}

}  // namespace cx::gui
