#include "engine/database_folder.h"

#include <fcntl.h>
#include <unistd.h>

#include "platform/data_folder.h"
#include "platform/file_io.h"

namespace cx {
namespace {

bool CanOpenForReading(const std::string& path) {
  // Without O_NONBLOCK a FIFO of that name would stop the search for good.
  int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (fd < 0) return false;
  ::close(fd);
  return true;
}

}  // namespace

std::string DatabasePath(const std::string& folder, const std::string& fileName) {
  if (folder.empty()) return fileName;
  return folder.back() == '/' ? folder + fileName : folder + "/" + fileName;
}

std::string NewDatabaseName(const std::string& folder) {
  // Bounded by the format: no folder can hold more databases than this is
  // ever going to try.
  for (int n = 1; n < 1000000; ++n) {
    std::string path = DatabasePath(folder, "Untitled" + std::to_string(n) + ".PDB");
    if (!CanOpenForReading(path)) return path;
  }
  return DatabasePath(folder, "Untitled.PDB");
}

bool FindDatabaseBeside(std::string& name, const std::string& referencePath) {
  std::string candidate = FolderPart(referencePath) + name + ".PDB";
  if (!FileExists(candidate)) return false;
  name = candidate;
  return true;
}

}  // namespace cx
