#pragma once

#include <tools/storage/Failure.hpp>
#include <tools/storage/Output.hpp>
#include <tools/storage/Progress.hpp>
#include <tools/storage/Stores.hpp>

#include <string>
#include <utility>

namespace foundation::storage::tool {

enum ExitStatus : int
{
    exitFine = 0,
    exitFailed = 1,
    exitMisused = 2,
};

/// What a running command works with: the stores, where results and complaints go, and how it will have ended.
class Session
{
public:
    /// `command` is named in complaints; empty for the tool itself.
    explicit Session(std::string command);

    Stores& stores() { return stores_; }
    Stores const& stores() const { return stores_; }
    Output& output() { return output_; }
    Progress& progress() { return progress_; }

    /// Writes a line of results, which `printable` has not gone over.
    void printName(std::string_view bytes, char terminator = '\n');

    /// Writes a JSON object as a line of results.
    void printJSON(std::string_view object);

    /// Writes "storage: COMMAND: LOCATION: REASON" to standard error; the command has failed.
    void complain(Failure const& failure);

    /// Ends the work: what was changed in archives is written into them, unless the user has asked to stop by then. A
    /// failure is complained about. Throws `Interrupted`.
    void finishWork();

    /// Calls `action`, and complains about a failure so that the rest can be done. Answers whether there was none.
    template <typename Action>
    bool attempt(Action&& action)
    {
        try {
            std::forward<Action>(action)();
            return true;
        } catch (Failure const& failure) {
            complain(failure);
            return false;
        }
    }

    /// Does `action` for the place that each argument names.
    template <typename Arguments, typename Action>
    void forEachPlace(Arguments const& arguments, Action const& action)
    {
        for (std::string const& argument : arguments)
            attempt([&] { action(stores_.open(argument)); });
    }

    ExitStatus status() const { return status_; }

private:
    std::string command_;
    Stores stores_;
    Output output_;
    Progress progress_;
    ExitStatus status_ = exitFine;
};

/// Writes "storage: COMMAND: TEXT" to standard error, without COMMAND when that is empty.
void writeError(std::string_view command, std::string_view text);

} // namespace foundation::storage::tool
