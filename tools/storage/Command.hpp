#pragma once

#include <functional>

namespace CLI {
class App;
} // namespace CLI

namespace foundation::storage::tool {

class Session;

/// What a command does, once its options are parsed.
using Action = std::function<void(Session&)>;

/// A command: its name, one line about it, and the function that declares its options and operands.
struct Command
{
    char const* name;
    char const* summary;
    Action (*define)(CLI::App& app);
};

} // namespace foundation::storage::tool
