// Named string values that outlive the program (the preferences and the
// recent-file list). Values keep the string forms the handheld stored.
#pragma once

#include <map>
#include <optional>
#include <string>

namespace cx {

class Settings {
 public:
  virtual ~Settings() = default;
  virtual std::optional<std::string> Get(const std::string& name) const = 0;
  virtual void Set(const std::string& name, const std::string& value) = 0;
  virtual void Remove(const std::string& name) = 0;
};

class MemorySettings : public Settings {
 public:
  std::optional<std::string> Get(const std::string& name) const override {
    auto it = values_.find(name);
    if (it == values_.end()) return std::nullopt;
    return it->second;
  }
  void Set(const std::string& name, const std::string& value) override { values_[name] = value; }
  void Remove(const std::string& name) override { values_.erase(name); }

 private:
  std::map<std::string, std::string> values_;
};

}  // namespace cx
