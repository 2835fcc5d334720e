// Names that arrive from a peer are only suggestions: these decide what a
// received object may be stored as, and never let it leave the data folder.
#pragma once

#include <string>

namespace cx::obex {

// The file name a received object may be stored under, or empty when none
// can be had: only the part after the last '/' or '\\' counts; it must not
// be empty, begin with '.', hold control characters, or exceed 255 bytes.
std::string SafeFileName(const std::string& name);

// True when `name` ends in `extension` (".PDB"), ignoring ASCII case.
bool HasExtension(const std::string& name, const std::string& extension);

// `name` without its last extension ("Parts.cxr" -> "Parts").
std::string StemOf(const std::string& name);

}  // namespace cx::obex
