#include "gui/design/design_widgets.h"

#include <QApplication>
#include <QDialog>
#include <QDialogButtonBox>
#include <QLineEdit>
#include <QMessageBox>
#include <QProgressDialog>
#include <QPushButton>
#include <QRegularExpressionValidator>

#include "gui/common/help.h"
#include "gui/common/text.h"

namespace cx::gui {

std::optional<std::string> StorableText(QWidget* parent, const QString& text, const QString& what,
                                        size_t maxChars) {
  auto bytes = ToDb(text);
  if (!bytes) {
    QMessageBox::warning(parent, QStringLiteral("Error"),
                         QStringLiteral("\"%1\" cannot hold the character \"%2\": a database "
                                        "stores only Western European (Windows-1252) letters.")
                             .arg(what, FirstUnstorableCharacter(text)));
    return std::nullopt;
  }
  if (bytes->size() > maxChars) bytes->resize(maxChars);
  return bytes;
}

void MakeDigitEdit(QLineEdit* edit, int digits) {
  edit->setMaxLength(digits);
  edit->setValidator(new QRegularExpressionValidator(
      QRegularExpression(QStringLiteral("\\d{0,%1}").arg(digits)), edit));
}

void ConnectHelp(QDialog* dialog, QDialogButtonBox* buttons, const QString& anchor) {
  if (buttons) {
    if (QPushButton* help = buttons->button(QDialogButtonBox::Help)) {
      help->setAutoDefault(false);
      QObject::connect(help, &QPushButton::clicked, dialog,
                       [dialog, anchor] { ShowHelp(dialog, anchor); });
    }
  }
  InstallHelpShortcut(dialog, anchor);
}

BusyFeedbackPort::BusyFeedbackPort(UiPort& inner, QWidget* parent, size_t records,
                                   size_t progressFrom)
    : ForwardingUi(inner), parent_(parent), records_(records), progressFrom_(progressFrom) {}

BusyFeedbackPort::~BusyFeedbackPort() {
  if (busy_) SetBusy(false);
}

void BusyFeedbackPort::SetBusy(bool busy) {
  if (busy == busy_) return;
  busy_ = busy;
  ForwardingUi::SetBusy(busy);
  if (busy) {
    QApplication::setOverrideCursor(Qt::WaitCursor);
    if (records_ >= progressFrom_) {
      // The rewrite runs on this thread and reports no steps: a busy
      // indicator painted once before it starts tells the user why the
      // window does not answer.
      progress_ = std::make_unique<QProgressDialog>(
          QStringLiteral("Converting %1 records...").arg(records_), QString(), 0, 0, parent_);
      progress_->setObjectName(QStringLiteral("conversionProgress"));
      progress_->setWindowTitle(QStringLiteral("Edit Field"));
      progress_->setCancelButton(nullptr);
      progress_->setMinimumDuration(0);
      progress_->setWindowModality(Qt::WindowModal);
      progress_->show();
      QApplication::processEvents(QEventLoop::ExcludeUserInputEvents);
      showedProgress_ = true;
    }
  } else {
    progress_.reset();
    QApplication::restoreOverrideCursor();
  }
}

}  // namespace cx::gui
