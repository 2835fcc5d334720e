#include "gui/data/data_util.h"

#include <QMessageBox>
#include <QRegularExpression>
#include <QStringList>

#include "gui/common/text.h"

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

}  // namespace cx::gui
