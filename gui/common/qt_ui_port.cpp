#include "gui/common/qt_ui_port.h"

#include <QApplication>
#include <QDialog>
#include <QDialogButtonBox>
#include <QFileDialog>
#include <QFileInfo>
#include <QFormLayout>
#include <QGuiApplication>
#include <QLabel>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QRegularExpression>
#include <QThread>
#include <QVBoxLayout>

#include "gui/common/text.h"

namespace cx::gui {

namespace {

// The handheld's password slot holds 19 characters and a terminator.
constexpr int kPasswordLength = 19;

QMessageBox::Icon IconFor(MessageIcon icon, const QString& caption) {
  switch (icon) {
    case MessageIcon::Information: return QMessageBox::Information;
    case MessageIcon::Warning: return QMessageBox::Warning;
    case MessageIcon::Error: return QMessageBox::Critical;
    case MessageIcon::Question: return QMessageBox::Question;
    case MessageIcon::None: break;
  }
  // Most callers leave the icon to the caption, which already says what
  // kind of message it is.
  if (caption == QLatin1String("QUESTION")) return QMessageBox::Question;
  if (caption == QLatin1String("Update")) return QMessageBox::Information;
  if (caption == QLatin1String("ACCESS DENIED")) return QMessageBox::Warning;
  if (caption.startsWith(QLatin1String("ERROR"), Qt::CaseInsensitive)) return QMessageBox::Critical;
  return QMessageBox::NoIcon;
}

class PasswordDialog : public QDialog {
 public:
  explicit PasswordDialog(QWidget* parent) : QDialog(parent) {
    setObjectName(QStringLiteral("passwordDialog"));
    setWindowTitle(QStringLiteral("Get Password"));
    edit_ = new QLineEdit(this);
    edit_->setObjectName(QStringLiteral("passwordEdit"));
    edit_->setEchoMode(QLineEdit::Password);
    edit_->setMaxLength(kPasswordLength);
    edit_->setMinimumWidth(220);
    auto* form = new QFormLayout;
    form->addRow(QStringLiteral("Password:"), edit_);
    auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
    connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    auto* layout = new QVBoxLayout(this);
    layout->addLayout(form);
    layout->addWidget(buttons);
    setLayout(layout);
  }
  QString text() const { return edit_->text(); }

 private:
  QLineEdit* edit_;
};

}  // namespace

WaitCursor::WaitCursor() { QGuiApplication::setOverrideCursor(Qt::WaitCursor); }
WaitCursor::~WaitCursor() { QGuiApplication::restoreOverrideCursor(); }

QStringList QtNameFilters(const std::string& handheldFilter) {
  const QStringList parts = QString::fromStdString(handheldFilter).split(QLatin1Char('|'));
  QStringList filters;
  for (qsizetype i = 0; i + 1 < parts.size(); i += 2) {
    const QString description = parts[i].trimmed();
    if (description.isEmpty()) break;
    QStringList patterns;
    for (const QString& p : parts[i + 1].split(QLatin1Char(';'), Qt::SkipEmptyParts)) {
      if (p == QLatin1String("*.*")) {
        patterns << QStringLiteral("*");
        continue;
      }
      for (const QString& v : {p.toLower(), p.toUpper()}) {
        if (!patterns.contains(v)) patterns << v;
      }
    }
    // Qt reads the patterns from the parentheses, so the description's own
    // list is replaced by the full one.
    QString label = description;
    label.remove(QRegularExpression(QStringLiteral("\\s*\\([^)]*\\)\\s*$")));
    filters << QStringLiteral("%1 (%2)").arg(label, patterns.join(QLatin1Char(' ')));
  }
  return filters;
}

QString DefaultSuffix(const std::string& handheldFilter) {
  const QStringList parts = QString::fromStdString(handheldFilter).split(QLatin1Char('|'));
  if (parts.size() < 2) return QString();
  const QString first = parts[1].split(QLatin1Char(';')).value(0);
  const qsizetype dot = first.lastIndexOf(QLatin1Char('.'));
  if (dot < 0 || first.mid(dot + 1).contains(QLatin1Char('*'))) return QString();
  return first.mid(dot + 1).toUpper();
}

void RunOnGuiThread(const std::function<void()>& work) {
  QCoreApplication* app = QCoreApplication::instance();
  if (!app || QThread::currentThread() == app->thread()) {
    work();
    return;
  }
  QMetaObject::invokeMethod(app, work, Qt::BlockingQueuedConnection);
}

QtUiPort::QtUiPort(QWidget* parent) : parent_(parent) {}

bool QtUiPort::UseNativeDialogs() const {
  return native_ && QGuiApplication::platformName() != QLatin1String("offscreen");
}

void QtUiPort::ShowMessage(const std::string& text, const std::string& caption, MessageIcon icon) {
  RunOnGuiThread([&] {
    const QString title = FromDb(caption);
    QMessageBox box(IconFor(icon, title), title, FromMessage(text), QMessageBox::Ok, parent_);
    box.setObjectName(QStringLiteral("messageBox"));
    box.exec();
  });
}

bool QtUiPort::AskYesNo(const std::string& text, const std::string& caption) {
  bool yes = false;
  RunOnGuiThread([&] {
    const QString title = FromDb(caption);
    QMessageBox box(IconFor(MessageIcon::None, title), title, FromMessage(text),
                    QMessageBox::Yes | QMessageBox::No, parent_);
    box.setObjectName(QStringLiteral("questionBox"));
    box.setDefaultButton(QMessageBox::Yes);
    yes = box.exec() == QMessageBox::Yes;
  });
  return yes;
}

Answer QtUiPort::AskYesNoCancel(const std::string& text, const std::string& caption) {
  Answer answer = Answer::Cancel;
  RunOnGuiThread([&] {
    const QString title = FromDb(caption);
    QMessageBox box(IconFor(MessageIcon::None, title), title, FromMessage(text),
                    QMessageBox::Yes | QMessageBox::No | QMessageBox::Cancel, parent_);
    box.setObjectName(QStringLiteral("questionBox"));
    box.setDefaultButton(QMessageBox::Yes);
    box.setEscapeButton(QMessageBox::Cancel);
    const int result = box.exec();
    answer = result == QMessageBox::Yes ? Answer::Yes
             : result == QMessageBox::No ? Answer::No
                                         : Answer::Cancel;
  });
  return answer;
}

std::optional<QString> QtUiPort::PromptPasswordText() {
  std::optional<QString> typed;
  RunOnGuiThread([&] {
    // A busy cursor would hide that the program now waits for the user.
    QGuiApplication::setOverrideCursor(Qt::ArrowCursor);
    PasswordDialog dialog(parent_);
    if (dialog.exec() == QDialog::Accepted) typed = dialog.text();
    QGuiApplication::restoreOverrideCursor();
  });
  return typed;
}

std::optional<std::string> QtUiPort::PromptPassword(int) {
  std::optional<QString> typed = PromptPasswordText();
  if (!typed) return std::nullopt;
  if (std::optional<std::string> bytes = ToDb(*typed)) return bytes;
  // A character the file's code page cannot hold is in no stored password.
  // An embedded NUL keeps the answer from matching any of them (a stored
  // password ends at its first NUL) without changing what was typed into
  // something that might.
  return std::string(1, '\0') + typed->toStdString();
}

std::optional<QString> QtUiPort::OpenFileDialog(const FileDialogRequest& request) {
  std::optional<QString> chosen;
  RunOnGuiThread([&] {
    const QString folder = request.folder.empty() ? startFolder_ : QString::fromStdString(request.folder);
    QFileDialog dialog(parent_, FromDb(request.title), folder);
    dialog.setObjectName(QStringLiteral("openFileDialog"));
    dialog.setOption(QFileDialog::DontUseNativeDialog, !UseNativeDialogs());
    dialog.setAcceptMode(QFileDialog::AcceptOpen);
    dialog.setFileMode(QFileDialog::ExistingFile);
    dialog.setNameFilters(QtNameFilters(request.filter));
    if (dialog.exec() == QDialog::Accepted && !dialog.selectedFiles().isEmpty()) {
      chosen = dialog.selectedFiles().first();
    }
  });
  return chosen;
}

std::optional<QString> QtUiPort::SaveFileDialog(const FileDialogRequest& request) {
  std::optional<QString> chosen;
  RunOnGuiThread([&] {
    const QString proposed = QString::fromStdString(request.fileName);
    QString folder = request.folder.empty() ? startFolder_ : QString::fromStdString(request.folder);
    if (proposed.contains(QLatin1Char('/'))) folder = QFileInfo(proposed).absolutePath();
    QFileDialog dialog(parent_, FromDb(request.title), folder);
    dialog.setObjectName(QStringLiteral("saveFileDialog"));
    dialog.setOption(QFileDialog::DontUseNativeDialog, !UseNativeDialogs());
    dialog.setAcceptMode(QFileDialog::AcceptSave);
    dialog.setFileMode(QFileDialog::AnyFile);
    dialog.setNameFilters(QtNameFilters(request.filter));
    const QString suffix = request.defaultSuffix.empty() ? DefaultSuffix(request.filter)
                                                         : QString::fromStdString(request.defaultSuffix);
    dialog.setDefaultSuffix(suffix);
    if (!proposed.isEmpty()) dialog.selectFile(QFileInfo(proposed).fileName());
    if (dialog.exec() == QDialog::Accepted && !dialog.selectedFiles().isEmpty()) {
      chosen = dialog.selectedFiles().first();
    }
  });
  return chosen;
}

std::optional<std::string> QtUiPort::ChooseOpenFile(const FileDialogRequest& request) {
  auto chosen = OpenFileDialog(request);
  if (!chosen) return std::nullopt;
  return chosen->toStdString();
}

std::optional<std::string> QtUiPort::ChooseSaveFile(const FileDialogRequest& request) {
  auto chosen = SaveFileDialog(request);
  if (!chosen) return std::nullopt;
  return chosen->toStdString();
}

std::optional<std::string> QtUiPort::AskOpenFile(const std::string& title, const std::string& filter) {
  return ChooseOpenFile(FileDialogRequest{title, filter, "", "", ""});
}

std::optional<std::string> QtUiPort::AskSaveFile(const std::string& title, const std::string& filter,
                                                 const std::string& suggested) {
  return ChooseSaveFile(FileDialogRequest{title, filter, "", suggested, ""});
}

void QtUiPort::SetBusy(bool busy) {
  RunOnGuiThread([&] {
    // Unbalanced calls must not leave the cursor stuck or pop a cursor that
    // somebody else pushed.
    if (busy) {
      ++busyDepth_;
      QGuiApplication::setOverrideCursor(Qt::WaitCursor);
    } else if (busyDepth_ > 0) {
      --busyDepth_;
      QGuiApplication::restoreOverrideCursor();
    }
  });
}

}  // namespace cx::gui
