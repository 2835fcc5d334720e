#include "platform/qt/qt_platform.h"

#include <QLocale>
#include <QSettings>
#include <QStandardPaths>

namespace cx {

std::string HandheldPatternFromQt(const std::string& qt) {
  std::string out;
  for (size_t i = 0; i < qt.size();) {
    char c = qt[i];
    if (c == '\'') {  // quoted literal: copy without quotes
      size_t end = qt.find('\'', i + 1);
      if (end == std::string::npos) end = qt.size();
      out += qt.substr(i + 1, end - i - 1);
      i = end + 1;
      continue;
    }
    if (c == 'A' || c == 'a') {
      size_t j = i;
      while (j < qt.size() && (qt[j] == 'A' || qt[j] == 'a' || qt[j] == 'P' || qt[j] == 'p')) ++j;
      out += "tt";
      i = j;
      continue;
    }
    if (c == 't') {  // time zone
      while (i < qt.size() && qt[i] == 't') ++i;
      while (!out.empty() && out.back() == ' ') out.pop_back();
      continue;
    }
    out.push_back(c);
    ++i;
  }
  while (!out.empty() && out.back() == ' ') out.pop_back();
  return out;
}

LocaleInfo LocaleInfoFromQt(const QLocale& locale) {
  LocaleInfo info;
  info.shortDate = HandheldPatternFromQt(locale.dateFormat(QLocale::ShortFormat).toStdString());
  info.dateSeparator = FirstSeparator(info.shortDate, '/');
  info.timeFormat = HandheldPatternFromQt(locale.timeFormat(QLocale::LongFormat).toStdString());
  info.timeSeparator = FirstSeparator(info.timeFormat, ':');
  info.am = locale.amText().toStdString();
  info.pm = locale.pmText().toStdString();
  QString dec = locale.decimalPoint();
  info.decimalSeparator = dec.isEmpty() ? '.' : static_cast<char>(dec.at(0).toLatin1());
  if (info.decimalSeparator == 0) info.decimalSeparator = ',';
  return info;
}

LocaleInfo SystemLocaleInfo() { return LocaleInfoFromQt(QLocale::system()); }

namespace {

class QtSettings : public Settings {
 public:
  QtSettings() : settings_("Cardovex", "Cardovex") {}
  std::optional<std::string> Get(const std::string& name) const override {
    QVariant v = settings_.value(QString::fromStdString(name));
    if (!v.isValid()) return std::nullopt;
    return v.toString().toStdString();
  }
  void Set(const std::string& name, const std::string& value) override {
    settings_.setValue(QString::fromStdString(name), QString::fromStdString(value));
  }
  void Remove(const std::string& name) override { settings_.remove(QString::fromStdString(name)); }

 private:
  mutable QSettings settings_;
};

}  // namespace

std::unique_ptr<Settings> OpenDesktopSettings() { return std::make_unique<QtSettings>(); }

std::string DesktopDocumentsFolder() {
  return QStandardPaths::writableLocation(QStandardPaths::DocumentsLocation).toStdString();
}

}  // namespace cx
