#include "gui/common/text.h"

#include "platform/text_codec.h"

namespace cx::gui {

QString FromDb(std::string_view bytes) {
  const std::string utf8 = Cp1252ToUtf8(bytes);
  return QString::fromUtf8(utf8.data(), static_cast<qsizetype>(utf8.size()));
}

QString FromMessage(std::string_view bytes) {
  const std::string utf8 = MessageToUtf8(bytes);
  return QString::fromUtf8(utf8.data(), static_cast<qsizetype>(utf8.size()));
}

std::optional<std::string> ToDb(const QString& text) {
  bool lossless = true;
  std::string bytes = Utf8ToCp1252(text.toStdString(), &lossless);
  if (!lossless) return std::nullopt;
  return bytes;
}

QString FirstUnstorableCharacter(const QString& text) {
  for (qsizetype i = 0; i < text.size(); ++i) {
    const qsizetype len = text.at(i).isHighSurrogate() && i + 1 < text.size() ? 2 : 1;
    const QString ch = text.mid(i, len);
    if (!ToDb(ch)) return ch;
    i += len - 1;
  }
  return QString();
}

QString EscapeMnemonic(const QString& text) {
  QString out = text;
  return out.replace(QLatin1Char('&'), QLatin1String("&&"));
}

}  // namespace cx::gui
