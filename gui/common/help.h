// The program's help: one HTML file bundled with the program, shown in a
// help window at a named section. Every dialog offers F1 for its own
// section:
//
//   InstallHelpShortcut(this, QStringLiteral("Sort_Dialog"));
//
// and a Help button may call ShowHelp(this, anchor) directly. The anchors
// are the `id`s of the sections in gui/help/cardovex.html; a new dialog adds
// its section there.
#pragma once

#include <QString>

class QWidget;

namespace cx::gui {

// The section the main window's F1 opens.
inline constexpr const char* kHelpContents = "Main_Contents";

// Opens (or raises) the help window that belongs to `from`'s window and
// scrolls it to `anchor`. The help window lives as long as that window, so
// it stays usable while a modal dialog is open.
void ShowHelp(QWidget* from, const QString& anchor);

// F1 anywhere in `window` opens its section.
void InstallHelpShortcut(QWidget* window, const QString& anchor);

// The help file's URL in the program's resources, and whether it holds a
// section with this anchor (for tests).
QString HelpSource();
bool HelpHasAnchor(const QString& anchor);

}  // namespace cx::gui
