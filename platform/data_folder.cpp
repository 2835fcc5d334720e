#include "platform/data_folder.h"

#include <cstdlib>

namespace cx {

std::string DataFolder(const std::string& documentsDir) {
  if (const char* env = std::getenv("CARDOVEX_DATA_DIR"); env && *env) {
    std::string dir = env;
    while (dir.size() > 1 && dir.back() == '/') dir.pop_back();
    return dir;
  }
  std::string docs = documentsDir;
  if (docs.empty()) {
    const char* home = std::getenv("HOME");
    docs = std::string(home && *home ? home : ".") + "/Documents";
  }
  while (docs.size() > 1 && docs.back() == '/') docs.pop_back();
  return docs + "/Cardovex";
}

std::string FolderPart(const std::string& path) {
  size_t slash = path.rfind('/');
  return slash == std::string::npos ? std::string() : path.substr(0, slash + 1);
}

std::string FileNamePart(const std::string& path) {
  size_t slash = path.rfind('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

}  // namespace cx
