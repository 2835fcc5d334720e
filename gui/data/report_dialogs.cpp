#include "gui/data/report_dialogs.h"

#include <QDialogButtonBox>
#include <QFileDialog>
#include <QFontDatabase>
#include <QLabel>
#include <QListWidget>
#include <QMessageBox>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QVBoxLayout>

#include "gui/common/help.h"
#include "engine/format.h"
#include "gui/common/text.h"
#include "gui/data/data_util.h"
#include "ops/report.h"
#include "ops/text_sink.h"

namespace cx::gui {

ReportChooserDialog::ReportChooserDialog(const Database& db, int preselect, QWidget* parent) : QDialog(parent) {
  setObjectName("reportChooserDialog");
  setWindowTitle("Run Report");
  InstallHelpShortcut(this, QStringLiteral("Report_Dialog"));
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(new QLabel("Select field to report:", this));
  list_ = new QListWidget(this);
  list_->setObjectName("reportFields");
  const Schema& schema = db.schema();
  for (int pos = 0; pos < format::kFieldCount; ++pos) {
    const int slot = schema.fieldOrder[pos];
    if (slot < 0 || slot >= format::kFieldCount) continue;
    const FieldDef& f = schema.field[slot];
    if (!ReportKindFor(f)) continue;  // the list offers only what can be reported
    auto* item = new QListWidgetItem(FromDb(f.name.str()), list_);
    item->setData(Qt::UserRole, slot);
    if (slot == preselect) list_->setCurrentItem(item);
  }
  if (!list_->currentItem() && list_->count() > 0) list_->setCurrentRow(0);
  layout->addWidget(list_);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  buttons->setObjectName("buttons");
  buttons->button(QDialogButtonBox::Ok)->setEnabled(list_->count() > 0);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  connect(list_, &QListWidget::itemDoubleClicked, this, &QDialog::accept);
  layout->addWidget(buttons);
}

int ReportChooserDialog::field() const {
  const QListWidgetItem* item = list_->currentItem();
  return item ? item->data(Qt::UserRole).toInt() : -1;
}

ReportResultsDialog::ReportResultsDialog(std::string report, QWidget* parent)
    : QDialog(parent), report_(std::move(report)) {
  setObjectName("reportResultsDialog");
  setWindowTitle("Report Results");
  InstallHelpShortcut(this, QStringLiteral("Report_Dialog"));
  auto* layout = new QVBoxLayout(this);
  text_ = new QPlainTextEdit(this);
  text_->setObjectName("reportText");
  text_->setReadOnly(true);
  text_->setLineWrapMode(QPlainTextEdit::NoWrap);
  QFont font = QFontDatabase::systemFont(QFontDatabase::FixedFont);
  font.setStyleHint(QFont::TypeWriter);
  text_->setFont(font);
  text_->setTabStopDistance(QFontMetricsF(font).horizontalAdvance(' ') * 8);
  QString shown = FromDb(report_);
  shown.replace("\r\n", "\n");
  text_->setPlainText(shown);
  layout->addWidget(text_);
  auto* buttons = new QDialogButtonBox(this);
  buttons->setObjectName("buttons");
  QPushButton* exportButton = buttons->addButton("Export", QDialogButtonBox::ActionRole);
  exportButton->setObjectName("exportButton");
  QPushButton* again = buttons->addButton("New Report", QDialogButtonBox::ActionRole);
  again->setObjectName("newReportButton");
  buttons->addButton(QDialogButtonBox::Close);
  connect(exportButton, &QPushButton::clicked, this, &ReportResultsDialog::Export);
  connect(again, &QPushButton::clicked, this, [this] { done(kNewReport); });
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  layout->addWidget(buttons);
  resize(460, 320);
}

QString ReportResultsDialog::shownText() const { return text_->toPlainText(); }

bool ReportResultsDialog::ExportTo(const std::string& path) {
  if (!ConfirmTextTarget(this, path, {source_})) return false;
  WaitCursor wait;
  if (Status s = ExportReportText(report_, path); !s) {
    QMessageBox::warning(this, "Error", FromDb(s.message()));
    return false;
  }
  return true;
}

void ReportResultsDialog::Export() {
  QFileDialog dialog(this, "Export", QString(), DesktopFileFilter(kTextFileTypes));
  dialog.setObjectName("reportExportFile");
  dialog.setAcceptMode(QFileDialog::AcceptSave);
  dialog.setDefaultSuffix("txt");
  if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return;
  ExportTo(dialog.selectedFiles().first().toStdString());
}

}  // namespace cx::gui
