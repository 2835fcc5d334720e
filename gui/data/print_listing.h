// Printing the "NAME: VALUE" listing through the desktop's print dialog
// and preview.
#pragma once

#include <QString>
#include <cstddef>

#include "ops/listing.h"
#include "ops/session.h"

class QPrinter;
class QWidget;

namespace cx::gui {

// The listing of every record in view (`all`) or of record `current`,
// linked records indented beneath their Link field when `linked` is given.
QString ListingText(const DataSession& session, bool all, size_t current, LinkedListing* linked);

// Lays the listing out in a fixed-pitch face (the indents line up) and
// sends it to `printer`.
void PrintListing(QPrinter& printer, const QString& listing, const QString& title);

// The print preview with its printer choice and page setup; false when
// the user closed it without printing.
bool PreviewAndPrint(QWidget* parent, const QString& listing, const QString& title);

}  // namespace cx::gui
