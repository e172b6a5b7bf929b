#include <tools/storage/completion.hpp>

#include <fmt/format.h>
#include <fmt/ranges.h>

namespace foundation::storage::tool {

namespace {

constexpr char const* beginning = R"(# Completion of storage for bash. Loaded by hand: source <(storage completion bash)

_storage_words()
{
    mapfile -t COMPREPLY < <(compgen -W "$1" -- "$current")
}

_storage()
{
    local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]}
    local word options operands=locations only_operands=
    COMPREPLY=()
    # --option=value comes in three words.
    if [[ $current == '=' ]]; then
        current=
    elif [[ $previous == '=' ]]; then
        previous=${COMP_WORDS[COMP_CWORD - 2]}
    fi
    for word in "${COMP_WORDS[@]:2:COMP_CWORD > 1 ? COMP_CWORD - 2 : 0}"; do
        [[ $word != -- ]] || only_operands=--
    done

)";

constexpr char const* end = R"(    *)
        return
        ;;
    esac
    if [[ -z $only_operands && $current == -* ]]; then
        _storage_words "$options"
    elif [[ $operands == locations ]]; then
        compopt -o default
    else
        _storage_words "$operands"
    fi
}

complete -F _storage storage
)";

std::vector<std::string> namesOf(std::vector<OptionDefinition> const& options)
{
    std::vector<std::string> names;
    for (OptionDefinition const& option : options)
        names.insert(names.end(), option.names.begin(), option.names.end());
    return names;
}

std::string firstWord(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands)
{
    std::vector<std::string> words = namesOf(tool.options);
    for (CommandDefinition const& command : commands)
        words.push_back(command.name);
    return fmt::format("    if ((COMP_CWORD == 1)); then\n        _storage_words '{}'\n        return\n    fi\n",
                       fmt::join(words, " "));
}

std::string operandsOf(CommandDefinition const& command)
{
    if (command.operands.empty())
        return "        operands=\n";
    auto const& choices = command.operands.front().choices;
    return choices.empty() ? "" : fmt::format("        operands='{}'\n", fmt::join(choices, " "));
}

/// Where a value is expected, nothing else is offered, and nothing at all for one that may be anything.
std::string valuesOf(CommandDefinition const& command)
{
    std::string cases;
    for (OptionDefinition const& option : command.options) {
        if (!option.value.empty())
            cases += fmt::format("        {}) _storage_words '{}'; return ;;\n", fmt::join(option.names, " | "),
                                 fmt::join(option.choices, " "));
    }
    return cases.empty() ? "" : "        case ${only_operands:-$previous} in\n" + cases + "        esac\n";
}

std::string caseOf(CommandDefinition const& command)
{
    return fmt::format("    {})\n        options='{}'\n{}{}        ;;\n", command.name,
                       fmt::join(namesOf(command.options), " "), operandsOf(command), valuesOf(command));
}

} // namespace

std::string makeBashCompletion(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands)
{
    std::string cases;
    for (CommandDefinition const& command : commands)
        cases += caseOf(command);
    return beginning + firstWord(tool, commands) + "    case ${COMP_WORDS[1]} in\n" + cases + end;
}

} // namespace foundation::storage::tool
