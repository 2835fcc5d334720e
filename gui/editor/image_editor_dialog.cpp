#include "gui/editor/image_editor_dialog.h"

#include <QButtonGroup>
#include <QDialogButtonBox>
#include <QHBoxLayout>
#include <QMouseEvent>
#include <QPainter>
#include <QPushButton>
#include <QRadioButton>
#include <QVBoxLayout>

#include "gui/common/help.h"

namespace cx::gui {

PictureCanvas::PictureCanvas(Bytes picture, QWidget* parent)
    : QWidget(parent), picture_(picture.size() >= kPictureBytes ? std::move(picture) : NewPicture()) {
  setObjectName(QStringLiteral("pictureCanvas"));
  setFixedSize(sizeHint());
  setCursor(Qt::CrossCursor);
}

QSize PictureCanvas::sizeHint() const {
  return QSize(kPictureWidth * kScale + 2, kPictureHeight * kScale + 2);
}

void PictureCanvas::Clear() {
  if (PictureIsBlank(picture_)) return;
  std::fill(picture_.begin() + 1, picture_.end(), uint8_t{0});
  edited_ = true;
  update();
}

void PictureCanvas::paintEvent(QPaintEvent*) {
  QPainter p(this);
  p.fillRect(rect(), palette().color(QPalette::Mid));
  p.fillRect(1, 1, kPictureWidth * kScale, kPictureHeight * kScale, Qt::white);
  for (int y = 0; y < kPictureHeight; ++y) {
    for (int x = 0; x < kPictureWidth; ++x) {
      if (PictureInk(picture_, x, y)) p.fillRect(1 + x * kScale, 1 + y * kScale, kScale, kScale, Qt::black);
    }
  }
}

QPoint PictureCanvas::PixelAt(const QPoint& pos) const {
  return QPoint((pos.x() - 1) / kScale, (pos.y() - 1) / kScale);
}

void PictureCanvas::mousePressEvent(QMouseEvent* event) {
  if (event->button() != Qt::LeftButton || !isEnabled()) return;
  drawing_ = true;
  last_ = PixelAt(event->position().toPoint());
  DrawPictureLine(picture_, last_.x(), last_.y(), last_.x(), last_.y(), !erasing_);
  edited_ = true;
  update();
}

void PictureCanvas::mouseMoveEvent(QMouseEvent* event) {
  if (!drawing_) return;
  const QPoint now = PixelAt(event->position().toPoint());
  DrawPictureLine(picture_, last_.x(), last_.y(), now.x(), now.y(), !erasing_);
  last_ = now;
  update();
}

void PictureCanvas::mouseReleaseEvent(QMouseEvent*) { drawing_ = false; }

ImageEditorDialog::ImageEditorDialog(const Bytes& picture, bool readOnly, QWidget* parent)
    : QDialog(parent) {
  setWindowTitle(QStringLiteral("Edit Image"));
  setObjectName(QStringLiteral("imageEditorDialog"));
  auto* layout = new QVBoxLayout(this);
  auto* tools = new QHBoxLayout;
  auto* draw = new QRadioButton(QStringLiteral("Draw"), this);
  draw->setObjectName(QStringLiteral("drawButton"));
  auto* erase = new QRadioButton(QStringLiteral("Erase"), this);
  erase->setObjectName(QStringLiteral("eraseButton"));
  auto* clear = new QPushButton(QStringLiteral("Clear"), this);
  clear->setObjectName(QStringLiteral("clearButton"));
  clear->setAutoDefault(false);
  draw->setChecked(true);
  tools->addWidget(draw);
  tools->addWidget(erase);
  tools->addStretch();
  tools->addWidget(clear);
  layout->addLayout(tools);
  canvas_ = new PictureCanvas(picture, this);
  layout->addWidget(canvas_, 0, Qt::AlignHCenter);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
  layout->addWidget(buttons);
  layout->setSizeConstraint(QLayout::SetFixedSize);

  connect(erase, &QRadioButton::toggled, canvas_, &PictureCanvas::SetErasing);
  connect(clear, &QPushButton::clicked, canvas_, &PictureCanvas::Clear);
  connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
  connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
  if (readOnly) {
    for (QWidget* w : {static_cast<QWidget*>(draw), static_cast<QWidget*>(erase),
                       static_cast<QWidget*>(clear), static_cast<QWidget*>(canvas_)}) {
      w->setEnabled(false);
    }
    buttons->button(QDialogButtonBox::Ok)->setEnabled(false);
  }
  InstallHelpShortcut(this, QStringLiteral("Edit_Image"));
}

bool ImageEditorDialog::edited() const { return canvas_->edited(); }

Bytes ImageEditorDialog::result() const {
  if (PictureIsBlank(canvas_->picture())) return {};
  return canvas_->picture();
}

}  // namespace cx::gui
