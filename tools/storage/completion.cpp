#include <tools/storage/completion.hpp>

#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>

#include <CLI/App.hpp>
#include <memory>

namespace foundation::storage::tool {

namespace {

std::string makeCompletion(std::string const& shell, CLI::App const& tool)
{
    auto const make = shell == "bash" ? &makeBashCompletion : shell == "zsh" ? &makeZshCompletion : &makeFishCompletion;
    return make(definitionOf(tool), definitionsOfCommands(tool));
}

} // namespace

Action defineCompletion(CLI::App& app)
{
    auto const shell = std::make_shared<std::string>();
    addChoiceOperand(app, "SHELL", "The shell that is to complete commands: bash, fish or zsh", {"bash", "fish", "zsh"},
                     *shell);
    return
        [shell, &tool = *app.get_parent()](Session& session) { session.output().write(makeCompletion(*shell, tool)); };
}

} // namespace foundation::storage::tool
