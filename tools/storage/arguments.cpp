#include <tools/storage/arguments.hpp>

#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <algorithm>
#include <charconv>
#include <fmt/format.h>
#include <stdexcept>
#include <string_view>
#include <system_error>

namespace foundation::storage::tool {

namespace {

constexpr char mark = '\1';
constexpr std::string_view anyText = "TEXT:"; ///< what the parser puts before the choices
constexpr int unlimited = CLI::detail::expected_max_vector_size;

/// Where an operand or value begins in an argument; npos where there is none. A value that is an argument by itself
/// looks like an operand.
std::size_t placeOfMark(std::string_view argument, bool isOperand)
{
    if (isOperand || !argument.starts_with('-'))
        return 0;
    std::size_t const equals = argument.find('=');
    return argument.starts_with("--") && equals != std::string_view::npos ? equals + 1 : std::string_view::npos;
}

std::string withoutMark(std::string argument)
{
    return argument.starts_with(mark) ? argument.substr(1) : argument;
}

void restrictTo(CLI::Option* option, std::vector<std::string> const& choices)
{
    option->check(CLI::IsMember(choices))
        ->transform(CLI::Validator([](std::string& text) { return text = withoutMark(text), std::string(); }, ""));
}

/// Shows operands by the name that they were declared with and options with one value, and no more.
class HelpFormatter : public CLI::Formatter
{
public:
    std::string make_option_usage(CLI::Option const* option) const override { return make_option_name(option, true); }
    std::string make_option_opts(CLI::Option const* option) const override
    {
        std::string const value = option->get_positional() ? "" : valueName(*option);
        return value.empty() ? "" : ' ' + value;
    }
};

} // namespace

std::string valueName(CLI::Option const& option)
{
    std::string const name = option.get_type_name();
    if (option.get_items_expected_max() == 0)
        return "";
    return name.starts_with(anyText) ? name.substr(anyText.size()) : name;
}

std::shared_ptr<CLI::FormatterBase> makeHelpFormatter()
{
    auto formatter = std::make_shared<HelpFormatter>();
    formatter->label("SUBCOMMAND", "COMMAND");
    formatter->label("Positionals", "Operands");
    return formatter;
}

std::vector<std::string> markedArguments(int count, char const* const* arguments)
{
    std::vector<std::string> result;
    bool areOperands = false;
    for (int i = 1; i < count; ++i) {
        std::string argument = arguments[i];
        bool const isCommand = i == 1;
        if (!isCommand && !areOperands && argument == "--") {
            areOperands = true; // the marks say the same, and the parser would end the command here
            continue;
        }
        std::size_t const place = isCommand ? std::string::npos : placeOfMark(argument, areOperands);
        if (place != std::string::npos)
            argument.insert(place, 1, mark);
        result.push_back(std::move(argument));
    }
    std::reverse(result.begin(), result.end());
    return result;
}

std::string unmarked(std::string text)
{
    std::erase(text, mark);
    return text;
}

void addFlag(CLI::App& app, std::string const& name, bool& value, std::string const& description)
{
    app.add_flag(name, value, description);
}

void addSyncFlag(CLI::App& app, bool& value)
{
    addFlag(app, "--sync", value, "Go on only when the disk has what was written, so that it survives a power failure");
}

void exclude(CLI::App& app, std::string const& option, std::string const& other)
{
    app.get_option(option)->excludes(app.get_option(other));
}

void addOperands(CLI::App& app, std::string const& name, std::string const& description, std::size_t minimum,
                 std::vector<std::string>& values)
{
    auto const take = [&values](std::vector<std::string> const& arguments) {
        values.clear();
        std::transform(arguments.begin(), arguments.end(), std::back_inserter(values), withoutMark);
    };
    CLI::Option* const option = app.add_option_function<std::vector<std::string>>(name, take, description);
    option->type_name("")->expected(static_cast<int>(minimum), unlimited);
    option->required(minimum > 0);
}

void addOperand(CLI::App& app, std::string const& name, std::string const& description, std::string& value)
{
    auto const take = [&value](std::string const& argument) { value = withoutMark(argument); };
    app.add_option_function<std::string>(name, take, description)->type_name("")->required();
}

void addValues(CLI::App& app, std::string const& name, std::string const& valueName, std::string const& description,
               std::function<void(std::string const&)> const& take)
{
    std::string const shown = name.substr(name.rfind(',') + 1);
    auto const takeAll = [shown, take](std::vector<std::string> const& values) {
        try {
            for (std::string const& value : values)
                take(withoutMark(value));
        } catch (std::invalid_argument const& error) {
            throw CLI::ValidationError(shown, error.what());
        }
    };
    app.add_option_function<std::vector<std::string>>(name, takeAll, description)
        ->type_name(valueName)
        ->allow_extra_args(false);
}

void addHumanReadable(CLI::App& app, bool& value, std::string const& description)
{
    // A copy: the flag that has it goes first.
    std::string const help = app.get_help_ptr()->get_description();
    app.set_help_flag("--help", help);
    addFlag(app, "-h,-H,--human-readable", value, description);
}

void addNumber(CLI::App& app, std::string const& name, std::string const& valueName, std::string const& description,
               std::optional<std::size_t>& value, NumberRange const& range)
{
    addValues(app, name, valueName, description, [&value, range](std::string const& text) {
        std::size_t number = 0;
        auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
        if (error != std::errc() || end != text.data() + text.size())
            throw std::invalid_argument('\'' + text + "' is no whole number");
        if (number < range.least || number > range.most)
            throw std::invalid_argument(fmt::format("{} is not from {} to {}", number, range.least, range.most));
        value = number;
    });
}

void addChoice(CLI::App& app, std::string const& name, std::string const& description,
               std::vector<std::string> const& choices, std::string& value)
{
    restrictTo(app.add_option(name, value, description), choices);
}

void addChoices(CLI::App& app, std::string const& name, std::string const& description,
                std::vector<std::string> const& choices, std::vector<std::string>& values)
{
    auto const take = [&values](std::vector<std::string> const& arguments) { values = arguments; };
    restrictTo(app.add_option_function<std::vector<std::string>>(name, take, description)->allow_extra_args(false),
               choices);
}

void addChoiceOperand(CLI::App& app, std::string const& name, std::string const& description,
                      std::vector<std::string> const& choices, std::string& value)
{
    restrictTo(app.add_option(name, value, description)->required(), choices);
}

} // namespace foundation::storage::tool
