#include "app/preferences.h"

#include <cctype>
#include <cstdlib>
#include <filesystem>

#include "engine/container.h"

#ifndef CARDOVEX_VERSION
#define CARDOVEX_VERSION "0.0.0"
#endif

namespace cx {

namespace {

// Numbers were read into a 20-character buffer: a longer value could not
// be read at all and leaves the default. Otherwise it converts as a
// decimal text-to-long conversion does (leading digits, 0 when there are
// none).
std::optional<long> ReadNumber(const Settings& settings, const char* name) {
  std::optional<std::string> text = settings.Get(name);
  if (!text || text->size() >= 20) return std::nullopt;
  return std::strtol(text->c_str(), nullptr, 10);
}

bool EqualIgnoringCase(const std::string& a, const std::string& b) {
  if (a.size() != b.size()) return false;
  for (size_t i = 0; i < a.size(); ++i) {
    if (std::tolower(static_cast<unsigned char>(a[i])) != std::tolower(static_cast<unsigned char>(b[i])))
      return false;
  }
  return true;
}

}  // namespace

const std::vector<PreferenceItem>& PreferenceItems() {
  using namespace preference_names;
  static const std::vector<PreferenceItem> items = {
      {kAutoSave, "Auto save databases when closed", &PreferenceFlags::autoSave},
      {kAutoSip, "Auto show input panel as needed", &PreferenceFlags::autoSip},
      {kAllowChecks, "Allow Checkbox selection in List View", &PreferenceFlags::allowChecks},
      {kAllowPopups, "Allow Popup selection in List View", &PreferenceFlags::allowPopups},
      {kAllowDateTime, "Allow Date/Time selection in List View", &PreferenceFlags::allowDateTime},
  };
  return items;
}

const char* ProgramVersion() { return CARDOVEX_VERSION; }

void Preferences::Read() {
  for (const PreferenceItem& item : PreferenceItems()) {
    if (std::optional<long> n = ReadNumber(settings_, item.valueName)) flags.*item.flag = *n != 0;
  }
  lastFileUsed_ = settings_.Get(preference_names::kLastFileUsed);
  if (lastFileUsed_ && lastFileUsed_->size() >= 1024) lastFileUsed_.reset();
}

void Preferences::Write() const {
  for (const PreferenceItem& item : PreferenceItems()) {
    settings_.Set(item.valueName, std::to_string(flags.*item.flag ? 1 : 0));
  }
}

std::optional<std::string> Preferences::lastFileUsed() const {
  if (!lastFileUsed_ || lastFileUsed_->empty() || *lastFileUsed_ == preference_names::kNoLastFile)
    return std::nullopt;
  return lastFileUsed_;
}

void Preferences::WriteLastFileUsed(const std::string& path) {
  lastFileUsed_ = path.empty() ? std::string(preference_names::kNoLastFile) : path;
  settings_.Set(preference_names::kLastFileUsed, *lastFileUsed_);
}

void Preferences::WriteVersion(const std::string& version) {
  settings_.Set(preference_names::kVersion, version);
}

std::string RecentFiles::ValueName(int n) { return "LastFile" + std::to_string(n); }

std::string RecentFiles::Entry(int n) const {
  if (n < 0 || n >= kCount) return {};
  std::optional<std::string> value = settings_.Get(ValueName(n));
  if (!value || value->size() >= 1023) return {};
  return *value;
}

void RecentFiles::Add(const std::string& path) {
  std::vector<std::string> slots(kCount);
  for (int n = 0; n < kCount; ++n) slots[n] = Entry(n);
  int found = kCount - 1;
  for (int n = 0; n < kCount; ++n) {
    if (EqualIgnoringCase(slots[n], path)) {
      found = n;
      break;
    }
  }
  // The new spelling wins: a path reopened under other letter case is
  // listed as it was last used.
  slots[found] = path;
  for (int n = found; n > 0; --n) std::swap(slots[n], slots[n - 1]);
  for (int n = 0; n < kCount; ++n) settings_.Set(ValueName(n), slots[n]);
}

std::vector<RecentFiles::ReopenEntry> RecentFiles::ReopenEntries() const {
  std::vector<ReopenEntry> entries;
  for (int n = 0; n < kCount; ++n) {
    std::string path = Entry(n);
    if (path.empty()) continue;
    if (std::optional<std::string> name = DatabaseNameOfFile(path)) entries.push_back({n, *name, path});
  }
  return entries;
}

std::vector<std::string> RecentFiles::StartList() const {
  std::vector<std::string> list{kMoreFilesEntry};
  for (int n = 0; n < kCount; ++n) {
    std::optional<std::string> value = settings_.Get(ValueName(n));
    if (!value || value->size() >= 1023) break;
    std::error_code ec;
    if (value->empty() || !std::filesystem::is_regular_file(*value, ec)) continue;
    std::optional<std::string> name = DatabaseNameOfFile(*value);
    list.push_back(name ? *name : std::filesystem::path(*value).stem().string());
  }
  return list;
}

std::optional<std::string> RecentFiles::StartChoice(int index) const {
  if (index < 1 || index > kCount) return std::nullopt;
  return Entry(index - 1);
}

std::optional<std::string> DatabaseNameOfFile(const std::string& path) {
  Header header;
  if (ReadHeader(path, header) != 1) return std::nullopt;
  return header.Name();
}

}  // namespace cx
