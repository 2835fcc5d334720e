// "Export Records..." (the CSV choices and the file) and "Import
// Records..." (the file, how columns map to fields, the encoding).
#pragma once

#include <QDialog>

#include "app/data_csv.h"

class QCheckBox;
class QComboBox;
class QLineEdit;
class QRadioButton;

namespace cx::gui {

// A path box with a "Browse..." button.
class FileChooser;

class CsvExportDialog : public QDialog {
  Q_OBJECT
 public:
  CsvExportDialog(const QString& suggestedPath, QWidget* parent = nullptr);
  CsvExportOptions options() const;
  CsvEncoding encoding() const;
  QString path() const;
  void setPath(const QString& path);

 public slots:
  void accept() override;

 private:
  QCheckBox* header_;
  QCheckBox* quoteAll_;
  QCheckBox* filtered_;
  QCheckBox* slotOrder_;
  QComboBox* encoding_;
  FileChooser* file_;
};

class CsvImportDialog : public QDialog {
  Q_OBJECT
 public:
  CsvImportDialog(const QString& folder, QWidget* parent = nullptr);
  int mode() const;  // kCsvColumnsByDisplayOrder or kCsvColumnsBySlot
  CsvEncoding encoding() const;
  QString path() const;
  void setPath(const QString& path);

 public slots:
  void accept() override;

 private:
  QRadioButton* byOrder_;
  QRadioButton* bySlot_;
  QComboBox* encoding_;
  FileChooser* file_;
};

}  // namespace cx::gui
