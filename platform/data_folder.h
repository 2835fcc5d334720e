// Where databases live: the "Cardovex" folder in the user's documents
// folder, or the folder named by CARDOVEX_DATA_DIR.
#pragma once

#include <string>

namespace cx {

// The data folder without a trailing slash. `documentsDir` is what the
// desktop reports as the documents folder (empty: $HOME/Documents).
std::string DataFolder(const std::string& documentsDir = "");

// Splits a path into folder (with its trailing '/') and file name.
std::string FolderPart(const std::string& path);
std::string FileNamePart(const std::string& path);

}  // namespace cx
