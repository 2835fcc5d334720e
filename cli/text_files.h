// The text files that commands read and write (CSV, listings, reports):
// UTF-8 unless --encoding asks for the databases' own Windows-1252 bytes,
// and "-" for standard input or output wherever a file is named.
#pragma once

#include <functional>
#include <string>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/syntax.h"
#include "ops/text_encoding.h"
#include "ops/text_sink.h"
#include "platform/status.h"

namespace cx::cli {

// Declares --encoding.
void DeclareEncoding(Syntax& syntax);

// Reads --encoding. False after a usage error (exit 2 in `code`) for a name
// that is neither.
bool EncodingOption(Context& ctx, const Command& command, const Arguments& args, TextEncoding& encoding,
                    int& code);

// Writes what `produce` puts into its sink to `path` ("-": standard output)
// in `encoding`. A file is replaced only once the whole text is written.
// The status says whether every byte arrived.
Status WriteTextTo(Context& ctx, const std::string& path, TextEncoding encoding,
                   const std::function<void(TextSink&)>& produce);

// Every byte of `path` ("-": standard input).
Status ReadTextFrom(const std::string& path, std::string& bytes);

// How a text file is named in messages.
std::string TextFileName(const std::string& path);

}  // namespace cx::cli
