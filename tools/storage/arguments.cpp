#include <tools/storage/arguments.hpp>

#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <algorithm>

namespace foundation::storage::tool {

namespace {

constexpr char mark = '\1';
constexpr int unlimited = CLI::detail::expected_max_vector_size;

std::string withoutMark(std::string argument)
{
    return argument.starts_with(mark) ? argument.substr(1) : argument;
}

/// Shows operands by the name that they were declared with, and no more.
class HelpFormatter : public CLI::Formatter
{
public:
    std::string make_option_usage(CLI::Option const* option) const override { return make_option_name(option, true); }
    std::string make_option_opts(CLI::Option const* option) const override
    {
        return option->get_positional() ? "" : Formatter::make_option_opts(option);
    }
};

} // namespace

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
        if (!isCommand && (areOperands || !argument.starts_with('-')))
            argument.insert(argument.begin(), mark);
        areOperands |= argument == "--";
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

void addChoice(CLI::App& app, std::string const& name, std::string const& description,
               std::vector<std::string> const& choices, std::string& value)
{
    app.add_option(name, value, description)
        ->check(CLI::IsMember(choices))
        ->transform(CLI::Validator([](std::string& text) { return text = withoutMark(text), std::string(); }, ""));
}

} // namespace foundation::storage::tool
