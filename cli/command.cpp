#include "cli/command.h"

#include <algorithm>
#include <ostream>

#include "platform/text_codec.h"

namespace cx::cli {

Registry& Registry::Instance() {
  static Registry registry;
  return registry;
}

void Registry::Add(CommandFactory factory) { factories_.push_back(std::move(factory)); }

std::unique_ptr<Command> Registry::Find(const std::string& name) const {
  for (const auto& f : factories_) {
    auto c = f();
    if (c->name() == name) return c;
  }
  return nullptr;
}

std::vector<std::unique_ptr<Command>> Registry::All() const {
  std::vector<std::unique_ptr<Command>> all;
  for (const auto& f : factories_) all.push_back(f());
  std::sort(all.begin(), all.end(), [](const auto& a, const auto& b) { return a->name() < b->name(); });
  return all;
}

std::string Command::help() const {
  Syntax syntax(name());
  Declare(syntax);
  Syntax globals;
  DeclareGlobalOptions(globals);
  return syntax.Help(&globals);
}

int UsageError(Context& ctx, const Command& command, const std::string& message) {
  ctx.err << "cardovex-cli: " << command.name() << ": " << message << "\n";
  // An error object for a script carries the message, not the usage text.
  if (!ctx.json) ctx.err << "\n" << command.help();
  return kExitUsage;
}

int Failure(Context& ctx, const std::string& message) {
  std::string text = MessageToUtf8(message);
  while (!text.empty() && text.back() == '\n') text.pop_back();
  ctx.err << "cardovex-cli: " << (ctx.command.empty() ? "" : ctx.command + ": ") << text << "\n";
  return kExitFailed;
}

}  // namespace cx::cli
