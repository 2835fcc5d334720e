#include "gui/common/help.h"

#include <QFile>
#include <QKeySequence>
#include <QShortcut>
#include <QTextBrowser>
#include <QUrl>
#include <QVBoxLayout>
#include <QWidget>

namespace cx::gui {

namespace {

class HelpWindow : public QWidget {
 public:
  explicit HelpWindow(QWidget* owner) : QWidget(owner, Qt::Window) {
    setObjectName(QStringLiteral("helpWindow"));
    setWindowTitle(QStringLiteral("Cardovex Help"));
    browser_ = new QTextBrowser(this);
    browser_->setObjectName(QStringLiteral("helpBrowser"));
    browser_->setOpenExternalLinks(true);
    browser_->setSource(QUrl(HelpSource()));
    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->addWidget(browser_);
    resize(560, 620);
  }
  void Show(const QString& anchor) {
    QUrl url(HelpSource());
    url.setFragment(anchor);
    browser_->setSource(url);
    browser_->scrollToAnchor(anchor);
    show();
    raise();
    activateWindow();
  }

 private:
  QTextBrowser* browser_;
};

}  // namespace

QString HelpSource() { return QStringLiteral("qrc:/help/cardovex.html"); }

bool HelpHasAnchor(const QString& anchor) {
  QFile file(QStringLiteral(":/help/cardovex.html"));
  if (!file.open(QIODevice::ReadOnly)) return false;
  const QString html = QString::fromUtf8(file.readAll());
  return html.contains(QStringLiteral("id=\"%1\"").arg(anchor)) ||
         html.contains(QStringLiteral("name=\"%1\"").arg(anchor));
}

void ShowHelp(QWidget* from, const QString& anchor) {
  QWidget* owner = from ? from->window() : nullptr;
  HelpWindow* help = nullptr;
  if (owner) {
    for (QObject* child : owner->children()) {
      if (auto* h = dynamic_cast<HelpWindow*>(child)) help = h;
    }
  }
  if (!help) {
    help = new HelpWindow(owner);
    if (!owner) help->setAttribute(Qt::WA_DeleteOnClose);
  }
  help->Show(anchor);
}

void InstallHelpShortcut(QWidget* window, const QString& anchor) {
  auto* shortcut = new QShortcut(QKeySequence::HelpContents, window);
  shortcut->setContext(Qt::WindowShortcut);
  QObject::connect(shortcut, &QShortcut::activated, window,
                   [window, anchor] { ShowHelp(window, anchor); });
}

}  // namespace cx::gui
