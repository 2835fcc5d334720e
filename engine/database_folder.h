// Where databases are and how they are named.
#pragma once

#include <string>

namespace cx {

// NewDatabaseName: the first free "<folder>/Untitled<n>.PDB", n = 1, 2, ...
// (free: no file of that name can be opened for reading).
std::string NewDatabaseName(const std::string& folder);

// FindDatabaseBeside: looks for "<name>.PDB" in the folder of
// `referencePath` (never anywhere else). On success `name` becomes that
// file's full path and the result is true.
bool FindDatabaseBeside(std::string& name, const std::string& referencePath);

// The path of database file `fileName` in `folder`.
std::string DatabasePath(const std::string& folder, const std::string& fileName);

}  // namespace cx
