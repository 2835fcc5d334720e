// The program's images, drawn rather than loaded so that they stay sharp at
// every screen scale.
#pragma once

#include <QIcon>
#include <QImage>

namespace cx::gui {

// The application's icon: a stack of index cards.
QImage AppIconImage(int size);
QIcon AppIcon();

// Tool buttons of the list: a new record, and back to the parent database.
QIcon NewRecordIcon();
QIcon BackIcon();

// The 13 x 13 images of a Check-Box cell in the list, at `scale` device
// pixels per pixel.
QImage CheckBoxImage(bool checked, qreal scale = 1.0);

}  // namespace cx::gui
