// "Author Information": who made the database and a short comment.
#pragma once

#include <QDialog>

#include "engine/record_store.h"

class QLineEdit;
class QPlainTextEdit;

namespace cx::gui {

class AuthorDialog : public QDialog {
  Q_OBJECT
 public:
  AuthorDialog(Database& db, QWidget* parent = nullptr);
  void accept() override;

  QLineEdit* authorEdit() const { return author_; }
  QPlainTextEdit* commentsEdit() const { return comments_; }

 private:
  void LimitComments();
  Database& db_;
  QLineEdit* author_;
  QPlainTextEdit* comments_;
};

}  // namespace cx::gui
