#include "gui/data/data_util.h"

#include <QMessageBox>
#include <QRegularExpression>
#include <QStringList>

#include "gui/common/text.h"
#include "ops/text_sink.h"

namespace cx::gui {

QString DesktopFileFilter(const std::string& handheldFilter) {
  const QStringList parts = QString::fromStdString(handheldFilter).split('|', Qt::SkipEmptyParts);
  QStringList out;
  for (int i = 0; i + 1 < parts.size(); i += 2) {
    QStringList patterns;
    for (const QString& p : parts[i + 1].split(';', Qt::SkipEmptyParts)) {
      if (p == "*.*") {
        patterns << "*";
        continue;
      }
      patterns << p.toLower();
      if (p.toUpper() != p.toLower()) patterns << p.toUpper();
    }
    QString label = parts[i];
    label.replace("(*.*)", "(*)");
    label = label.left(label.indexOf('(')).trimmed();
    out << label + " (" + patterns.join(' ') + ")";
  }
  return out.join(";;");
}

void ShowBox(QWidget* parent, const std::string& text, const std::string& caption, bool error) {
  QMessageBox box(error ? QMessageBox::Warning : QMessageBox::Information, FromDb(caption), FromDb(text),
                  QMessageBox::Ok, parent);
  box.setObjectName("dataMessageBox");
  box.exec();
}

bool ConfirmTextTarget(QWidget* parent, const std::string& path, const std::vector<std::string>& inputs) {
  const Status s = CheckTextTarget(path, inputs);
  if (s) return true;
  QMessageBox box(QMessageBox::Warning, "QUESTION",
                  FromDb(s.message()) + ".\n\nWrite the text there anyway?", QMessageBox::Yes | QMessageBox::No,
                  parent);
  box.setObjectName("textTargetQuestion");
  box.setDefaultButton(QMessageBox::No);
  return box.exec() == QMessageBox::Yes;
}

}  // namespace cx::gui
