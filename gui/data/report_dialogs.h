// Reports: the field chooser ("Run Report") and "Report Results" with its
// "Export" and "New Report" buttons.
#pragma once

#include <QDialog>
#include <string>

#include "engine/record_store.h"

class QListWidget;
class QPlainTextEdit;

namespace cx::gui {

class ReportChooserDialog : public QDialog {
  Q_OBJECT
 public:
  // Lists the used fields in display order; `preselect` is a slot or -1.
  ReportChooserDialog(const Database& db, int preselect, QWidget* parent = nullptr);
  // The chosen slot, -1 when none.
  int field() const;

 private:
  QListWidget* list_;
};

class ReportResultsDialog : public QDialog {
  Q_OBJECT
 public:
  // The result codes besides Accepted/Rejected.
  static constexpr int kNewReport = 2;

  // `report` is the 8-bit text with its "\r\n" line ends, kept as it is
  // for "Export".
  ReportResultsDialog(std::string report, QWidget* parent = nullptr);
  QString shownText() const;

  // Writes the report to `path` as the export does; false after telling
  // the user why not.
  bool ExportTo(const std::string& path);
  // The database the report was made from: "Export" asks before writing
  // over it (or over any other database).
  void setSourcePath(std::string path) { source_ = std::move(path); }

 private:
  void Export();

  std::string report_;
  std::string source_;
  QPlainTextEdit* text_;
};

}  // namespace cx::gui
