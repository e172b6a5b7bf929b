#pragma once

#include <functional>
#include <limits>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace CLI {
class App;
class FormatterBase;
class Option;
} // namespace CLI

namespace foundation::storage::tool {

/// The arguments of the program as the parser gets them, in reverse order as it wants them. Operands and values are
/// marked, because the parser would take some for something else: it splits "[a,b]" and swallows "{}" and "%%", which
/// are names like any other.
std::vector<std::string> markedArguments(int count, char const* const* arguments);

/// The text without marks: an argument that the parser hands back, or a message of the parser about one.
std::string unmarked(std::string text);

/// How the help calls the value of an option; empty for a flag.
std::string valueName(CLI::Option const& option);

/// Lays out the help.
std::shared_ptr<CLI::FormatterBase> makeHelpFormatter();

/// Declares a flag, which sets `value`. What these functions fill must live until the command line is parsed.
void addFlag(CLI::App& app, std::string const& name, bool& value, std::string const& description);

/// `--sync`, of the commands that write.
void addSyncFlag(CLI::App& app, bool& value);

/// Makes it a mistake to give both options.
void exclude(CLI::App& app, std::string const& option, std::string const& other);

/// Declares the operands of a command, which go to `values`. `name` is how the usage line shows them all.
void addOperands(CLI::App& app, std::string const& name, std::string const& description, std::size_t minimum,
                 std::vector<std::string>& values);

/// Declares the only operand of a command.
void addOperand(CLI::App& app, std::string const& name, std::string const& description, std::string& value);

/// Declares the only operand of a command, which is one of a few words.
void addChoiceOperand(CLI::App& app, std::string const& name, std::string const& description,
                      std::vector<std::string> const& choices, std::string& value);

/// Declares an option that may be given several times, each time with one value, which goes to `take`. What that throws
/// as `std::invalid_argument` is misuse of the option. `valueName` is how the help shows the value.
void addValues(CLI::App& app, std::string const& name, std::string const& valueName, std::string const& description,
               std::function<void(std::string const&)> const& take);

/// The same, for values that are each one of a few words.
void addChoices(CLI::App& app, std::string const& name, std::string const& description,
                std::vector<std::string> const& choices, std::vector<std::string>& values);

/// Declares the flag that prints sizes for people. With it `-h` means what it means to `ls` and `du` everywhere, and
/// help is `--help` alone.
void addHumanReadable(CLI::App& app, bool& value, std::string const& description);

struct NumberRange
{
    std::size_t least = 0;
    std::size_t most = std::numeric_limits<std::size_t>::max();
};

/// Declares an option whose value is a whole number within a range.
void addNumber(CLI::App& app, std::string const& name, std::string const& valueName, std::string const& description,
               std::optional<std::size_t>& value, NumberRange const& range = {});

/// Declares an option whose value is one of a few words.
void addChoice(CLI::App& app, std::string const& name, std::string const& description,
               std::vector<std::string> const& choices, std::string& value);

} // namespace foundation::storage::tool
