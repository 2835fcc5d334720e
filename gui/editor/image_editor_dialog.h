// "Edit Image": a pen on the field's 160 x 100 picture, with "Draw",
// "Erase" and "Clear". A picture is only rewritten when the user changed a
// pixel, so pictures other programs wrote stay as they were.
#pragma once

#include <QDialog>
#include <QWidget>

#include "app/image_picture.h"

class QRadioButton;

namespace cx::gui {

// The drawing surface: the picture scaled up, drawn on with the mouse.
class PictureCanvas : public QWidget {
  Q_OBJECT

 public:
  static constexpr int kScale = 3;

  explicit PictureCanvas(Bytes picture, QWidget* parent = nullptr);
  const Bytes& picture() const { return picture_; }
  bool edited() const { return edited_; }
  void SetErasing(bool erasing) { erasing_ = erasing; }
  void Clear();
  QSize sizeHint() const override;

 protected:
  void paintEvent(QPaintEvent* event) override;
  void mousePressEvent(QMouseEvent* event) override;
  void mouseMoveEvent(QMouseEvent* event) override;
  void mouseReleaseEvent(QMouseEvent* event) override;

 private:
  QPoint PixelAt(const QPoint& widgetPos) const;

  Bytes picture_;
  bool erasing_ = false;
  bool drawing_ = false;
  bool edited_ = false;
  QPoint last_;
};

class ImageEditorDialog : public QDialog {
  Q_OBJECT

 public:
  // `picture` is the field's 2001 bytes, or empty when it holds none.
  ImageEditorDialog(const Bytes& picture, bool readOnly, QWidget* parent = nullptr);
  bool edited() const;
  // The picture to store: empty when it was cleared to nothing.
  Bytes result() const;
  PictureCanvas* canvas() const { return canvas_; }

 private:
  PictureCanvas* canvas_ = nullptr;
};

}  // namespace cx::gui
