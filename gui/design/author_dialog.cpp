#include "gui/design/author_dialog.h"

#include <QDialogButtonBox>
#include <QFontMetrics>
#include <QFormLayout>
#include <QLineEdit>
#include <QPlainTextEdit>
#include <QSignalBlocker>
#include <QVBoxLayout>

#include "design/properties.h"
#include "gui/common/text.h"
#include "gui/design/design_widgets.h"

namespace cx::gui {
namespace {
constexpr int kAuthorChars = 39;
constexpr int kCommentChars = 69;
}  // namespace

AuthorDialog::AuthorDialog(Database& db, QWidget* parent)
    : QDialog(parent), db_(db), author_(new QLineEdit(this)), comments_(new QPlainTextEdit(this)) {
  setObjectName(QStringLiteral("authorDialog"));
  setWindowTitle(QStringLiteral("Author Information"));
  const AuthorInfo info = LoadAuthorInfo(db.schema());
  author_->setObjectName(QStringLiteral("author"));
  author_->setMaxLength(kAuthorChars);
  author_->setText(FromDb(info.author));
  comments_->setObjectName(QStringLiteral("comments"));
  QString loaded = FromDb(info.comments);
  comments_->setPlainText(loaded.replace(QStringLiteral("\r\n"), QStringLiteral("\n")));
  comments_->setTabChangesFocus(true);
  comments_->setFixedHeight(comments_->fontMetrics().lineSpacing() * 4 + 12);
  connect(comments_, &QPlainTextEdit::textChanged, this, &AuthorDialog::LimitComments);

  auto* form = new QFormLayout;
  form->addRow(QStringLiteral("Author:"), author_);
  form->addRow(QStringLiteral("Comments:"), comments_);
  auto* buttons = new QDialogButtonBox(
      QDialogButtonBox::Ok | QDialogButtonBox::Cancel | QDialogButtonBox::Help, this);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  ConnectHelp(this, buttons, QStringLiteral("Author_Information"));
  auto* layout = new QVBoxLayout(this);
  layout->addLayout(form);
  layout->addWidget(buttons);
  setMinimumWidth(380);
}

void AuthorDialog::LimitComments() {
  // A plain-text edit has no length limit of its own; typing or pasting past
  // the limit is cut back at once so that what shows is what is kept. A line
  // break is stored as two characters.
  const QString text = comments_->toPlainText();
  const int room = kCommentChars - static_cast<int>(text.count(QLatin1Char('\n')));
  if (text.size() <= room) return;
  const QSignalBlocker block(comments_);
  QTextCursor cursor = comments_->textCursor();
  const int position = std::min<int>(cursor.position(), room);
  comments_->setPlainText(text.left(room));
  cursor = comments_->textCursor();
  cursor.setPosition(position);
  comments_->setTextCursor(cursor);
}

void AuthorDialog::accept() {
  auto author = StorableText(this, author_->text(), QStringLiteral("Author"), kAuthorChars);
  if (!author) return;
  // The file keeps line ends as CR LF, as a handheld's multi-line edit does.
  QString commentText = comments_->toPlainText();
  commentText.replace(QStringLiteral("\r\n"), QStringLiteral("\n"))
      .replace(QLatin1Char('\n'), QStringLiteral("\r\n"));
  auto comments = StorableText(this, commentText, QStringLiteral("Comments"), kCommentChars);
  if (!comments) return;
  ApplyAuthorInfo(db_, AuthorInfo{*author, *comments});
  QDialog::accept();
}

}  // namespace cx::gui
