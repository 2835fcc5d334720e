#include "tests/support/test_support.h"

#include <cstdlib>
#include <filesystem>

namespace cx::testing {

TempDir::TempDir() {
  std::string base = std::filesystem::temp_directory_path().string() + "/cardovex-test-XXXXXX";
  if (char* made = ::mkdtemp(base.data())) path_ = made;
}

TempDir::~TempDir() {
  std::error_code ec;
  if (!path_.empty()) std::filesystem::remove_all(path_, ec);
}

}  // namespace cx::testing
