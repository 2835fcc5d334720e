#include "gui/data/csv_dialogs.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QFileDialog>
#include <QFileInfo>
#include <QFormLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QRadioButton>
#include <QVBoxLayout>

#include "gui/common/help.h"

namespace cx::gui {

class FileChooser : public QWidget {
 public:
  FileChooser(bool save, const QString& name, QWidget* parent) : QWidget(parent), save_(save) {
    auto* row = new QHBoxLayout(this);
    row->setContentsMargins(0, 0, 0, 0);
    edit_ = new QLineEdit(this);
    edit_->setObjectName(name);
    edit_->setMinimumWidth(280);
    auto* browse = new QPushButton("Browse...", this);
    browse->setObjectName(name + "Browse");
    row->addWidget(edit_, 1);
    row->addWidget(browse);
    connect(browse, &QPushButton::clicked, this, [this] { Browse(); });
  }
  QString path() const { return edit_->text().trimmed(); }
  void setPath(const QString& p) { edit_->setText(p); }

 private:
  void Browse() {
    const QString filter = "CSV Files (*.csv *.CSV);;Text Files (*.txt *.TXT);;All Files (*)";
    QFileDialog dialog(this, save_ ? "Export Records" : "Import Records", QFileInfo(path()).path(), filter);
    dialog.setAcceptMode(save_ ? QFileDialog::AcceptSave : QFileDialog::AcceptOpen);
    dialog.setFileMode(save_ ? QFileDialog::AnyFile : QFileDialog::ExistingFile);
    dialog.setDefaultSuffix("csv");
    if (!path().isEmpty()) dialog.selectFile(path());
    if (dialog.exec() == QDialog::Accepted && !dialog.selectedFiles().isEmpty()) {
      edit_->setText(dialog.selectedFiles().first());
    }
  }
  bool save_;
  QLineEdit* edit_;
};

namespace {

QComboBox* EncodingBox(QWidget* parent) {
  auto* box = new QComboBox(parent);
  box->setObjectName("csvEncoding");
  box->addItem("UTF-8", static_cast<int>(CsvEncoding::kUtf8));
  box->addItem("Windows-1252 (as stored in the database)", static_cast<int>(CsvEncoding::kWindows1252));
  return box;
}

}  // namespace

CsvExportDialog::CsvExportDialog(const QString& suggestedPath, QWidget* parent) : QDialog(parent) {
  setObjectName("csvExportDialog");
  setWindowTitle("Export Records");
  InstallHelpShortcut(this, QStringLiteral("Csv_Export"));
  auto* layout = new QVBoxLayout(this);
  auto* form = new QFormLayout;
  file_ = new FileChooser(true, "csvExportPath", this);
  file_->setPath(suggestedPath);
  form->addRow("File:", file_);
  encoding_ = EncodingBox(this);
  form->addRow("Encoding:", encoding_);
  layout->addLayout(form);
  auto* box = new QGroupBox("Options", this);
  auto* v = new QVBoxLayout(box);
  header_ = new QCheckBox("First line holds the field names", box);
  header_->setObjectName("csvHeader");
  header_->setChecked(true);
  quoteAll_ = new QCheckBox("Quote every value", box);
  quoteAll_->setObjectName("csvQuoteAll");
  filtered_ = new QCheckBox("Only the records within the filter range", box);
  filtered_->setObjectName("csvFiltered");
  filtered_->setChecked(true);
  slotOrder_ = new QCheckBox("Columns in field-number order (instead of display order)", box);
  slotOrder_->setObjectName("csvSlotOrder");
  for (QCheckBox* c : {header_, quoteAll_, filtered_, slotOrder_}) v->addWidget(c);
  layout->addWidget(box);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  buttons->setObjectName("buttons");
  buttons->button(QDialogButtonBox::Ok)->setText("Export");
  connect(buttons, &QDialogButtonBox::accepted, this, &CsvExportDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  layout->addWidget(buttons);
}

CsvExportOptions CsvExportDialog::options() const {
  CsvExportOptions o;
  o.withHeader = header_->isChecked();
  o.quoteAll = quoteAll_->isChecked();
  o.filteredOnly = filtered_->isChecked();
  o.fieldNumberOrder = slotOrder_->isChecked();
  return o;
}

CsvEncoding CsvExportDialog::encoding() const { return static_cast<CsvEncoding>(encoding_->currentData().toInt()); }
QString CsvExportDialog::path() const { return file_->path(); }
void CsvExportDialog::setPath(const QString& p) { file_->setPath(p); }

void CsvExportDialog::accept() {
  if (path().isEmpty()) {
    QMessageBox::warning(this, windowTitle(), "Name the file to export to.");
    return;
  }
  if (QFileInfo(path()).isDir()) {
    QMessageBox::warning(this, windowTitle(), "\"" + path() + "\" is a folder. Name a file.");
    return;
  }
  QDialog::accept();
}

CsvImportDialog::CsvImportDialog(const QString& folder, QWidget* parent) : QDialog(parent) {
  setObjectName("csvImportDialog");
  setWindowTitle("Import Records");
  InstallHelpShortcut(this, QStringLiteral("Csv_Export"));
  auto* layout = new QVBoxLayout(this);
  auto* form = new QFormLayout;
  file_ = new FileChooser(false, "csvImportPath", this);
  file_->setPath(folder.isEmpty() ? QString() : folder + "/");
  form->addRow("File:", file_);
  encoding_ = EncodingBox(this);
  form->addRow("Encoding:", encoding_);
  layout->addLayout(form);
  auto* box = new QGroupBox("Columns", this);
  auto* v = new QVBoxLayout(box);
  byOrder_ = new QRadioButton("In the order the fields are shown (unused fields skipped)", box);
  byOrder_->setObjectName("csvByDisplayOrder");
  bySlot_ = new QRadioButton("By field number (column 1 is field 1, and so on)", box);
  bySlot_->setObjectName("csvBySlot");
  byOrder_->setChecked(true);
  v->addWidget(byOrder_);
  v->addWidget(bySlot_);
  layout->addWidget(box);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  buttons->setObjectName("buttons");
  buttons->button(QDialogButtonBox::Ok)->setText("Import");
  connect(buttons, &QDialogButtonBox::accepted, this, &CsvImportDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  layout->addWidget(buttons);
}

int CsvImportDialog::mode() const { return bySlot_->isChecked() ? kCsvColumnsBySlot : kCsvColumnsByDisplayOrder; }
CsvEncoding CsvImportDialog::encoding() const { return static_cast<CsvEncoding>(encoding_->currentData().toInt()); }
QString CsvImportDialog::path() const { return file_->path(); }
void CsvImportDialog::setPath(const QString& p) { file_->setPath(p); }

void CsvImportDialog::accept() {
  if (!QFileInfo(path()).isFile()) {
    QMessageBox::warning(this, windowTitle(), "Choose an existing file to import.");
    return;
  }
  QDialog::accept();
}

}  // namespace cx::gui
