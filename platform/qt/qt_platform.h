// Qt-based implementations of the platform interfaces (desktop locale,
// persistent settings, documents folder). Only the GUI and the CLI use them.
#pragma once

#include <memory>
#include <string>

#include "platform/locale_info.h"
#include "platform/settings.h"

class QLocale;

namespace cx {

// Translates a Qt date/time pattern into the handheld's token form: Qt's
// AM/PM markers become "tt", the time-zone token is dropped.
std::string HandheldPatternFromQt(const std::string& qtPattern);

// The regional settings of `locale` (the system locale by default).
LocaleInfo LocaleInfoFromQt(const QLocale& locale);
LocaleInfo SystemLocaleInfo();

// QSettings under organisation/application "Cardovex".
std::unique_ptr<Settings> OpenDesktopSettings();

// The desktop's documents folder.
std::string DesktopDocumentsFolder();

}  // namespace cx
