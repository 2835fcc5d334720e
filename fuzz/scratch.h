// Scratch files for the fuzz targets: a private folder (in memory when the
// system offers /dev/shm) made once per process and removed at its end.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace cx::fuzz {

// The path of `name` inside the process's scratch folder.
std::string ScratchPath(const std::string& name);

// Writes the bytes to the scratch file `name` and returns its path.
std::string WriteScratch(const std::string& name, const uint8_t* data, size_t size);

}  // namespace cx::fuzz
