#include <tools/storage/Session.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/definitions.hpp>

#include <CLI/App.hpp>
#include <fmt/format.h>

namespace foundation::storage::tool {

namespace {

constexpr char const* description = R"(.SH SYNOPSIS
.B storage
.I COMMAND
.RI [ OPTION "]... [" OPERAND ]...
.SH DESCRIPTION
.B storage
lists, reads, writes, copies, moves and removes files and folders wherever they are, by the same rules for every store.
Files appear at their targets whole or not at all, and nothing is replaced unless that is asked for.
.PP
An argument that begins with a scheme is an IRI, such as
.BR file:///tmp/a%20b ;
anything else is a local path.
A local file called
.B a:b
is written
.BR ./a:b .
What follows
.B \-\-
is an operand, also when it begins with a dash.
)";

constexpr char const* end = R"(.SH EXIT STATUS
.TP
.B 0
All was done.
.TP
.B 1
Something failed; every failure was reported, the rest was done.
.TP
.B 2
The command line was wrong; nothing was done.
.TP
.BR 130 ", " 143 ", " 129 ", " 131
Interrupted (Ctrl-C, SIGTERM, SIGHUP, SIGQUIT); what was half written was removed.
)";

/// What these characters are to be in the text; roff takes them for something else.
std::string_view escapeOf(char c)
{
    switch (c) {
    case '\\':
        return "\\e";
    case '-':
        return "\\-";
    case '^':
        return "\\(ha";
    case '~':
        return "\\(ti";
    case '`':
        return "\\(ga";
    case '\'':
        return "\\(aq";
    default:
        return {};
    }
}

std::string roff(std::string_view text)
{
    std::string result = text.starts_with('.') ? "\\&" : "";
    for (char const c : text) {
        std::string_view const escape = escapeOf(c);
        result += escape.empty() ? std::string_view(&c, 1) : escape;
    }
    return result;
}

std::string bold(std::string_view text)
{
    return "\\fB" + roff(text) + "\\fR";
}

std::string italic(std::string_view text)
{
    return "\\fI" + roff(text) + "\\fR";
}

std::string sectionOf(OptionDefinition const& option)
{
    std::string names;
    for (std::string const& name : option.names)
        names += (names.empty() ? "" : ", ") + bold(name);
    if (!option.value.empty())
        names += ' ' + italic(option.value);
    return ".TP\n" + names + '\n' + roff(option.description) + '\n';
}

std::string sectionOf(OperandDefinition const& operand)
{
    return ".TP\n" + italic(operand.name) + '\n' + roff(operand.description) + '\n';
}

std::string sectionOf(CommandDefinition const& command)
{
    std::string usage = "storage " + command.name + " [OPTION]...";
    std::string details;
    for (OperandDefinition const& operand : command.operands) {
        usage += ' ' + operand.name;
        details += sectionOf(operand);
    }
    for (OptionDefinition const& option : command.options)
        details += sectionOf(option);
    return ".SS " + roff(usage) + '\n' + roff(command.summary) + ".\n" + details;
}

std::string makeManual(CLI::App const& tool)
{
    std::string text = fmt::format(".TH STORAGE 1 \"\" \"{}\" \"User Commands\"\n"
                                   ".ad l\n.nh\n"
                                   ".SH NAME\nstorage \\- files and folders, wherever they are\n",
                                   roff(tool.version()));
    text += description;
    for (OptionDefinition const& option : definitionOf(tool).options)
        text += sectionOf(option);
    text += ".SH COMMANDS\n";
    for (CommandDefinition const& command : definitionsOfCommands(tool))
        text += sectionOf(command);
    return text + end;
}

} // namespace

Action defineMan(CLI::App& app)
{
    return [&tool = *app.get_parent()](Session& session) { session.output().write(makeManual(tool)); };
}

} // namespace foundation::storage::tool
