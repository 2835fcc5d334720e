// Text crosses between the 8-bit Windows-1252 of the database files and the
// Unicode of the widgets only here.
#pragma once

#include <QString>
#include <optional>
#include <string>
#include <string_view>

namespace cx::gui {

// Every byte shows as its Windows-1252 character; none is ever lost.
QString FromDb(std::string_view bytes);

// A message box's text: the system's and the database's Windows-1252 with
// file names in UTF-8 put in (see MessageToUtf8).
QString FromMessage(std::string_view bytes);

// The 8-bit text of `text`, or nothing when a character cannot be held in
// Windows-1252 (the caller refuses the input; nothing is stored as "?").
std::optional<std::string> ToDb(const QString& text);

// The first character of `text` that Windows-1252 cannot hold, or a null
// QChar-free empty string when there is none: for messages that name it.
QString FirstUnstorableCharacter(const QString& text);

// Names from the user go into menus and buttons: "&" must stay a letter.
QString EscapeMnemonic(const QString& text);

}  // namespace cx::gui
