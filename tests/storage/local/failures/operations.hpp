#pragma once

#include <tests/storage/local/failures/FailingSystemCalls.hpp>
#include <tests/storage/local/failures/Scene.hpp>

#include <cerrno>
#include <functional>
#include <ostream>
#include <string>
#include <vector>

namespace foundation::tests::support {

/// What an operation that failed may leave behind.
enum class Leaves
{
    AllOrNothing,      ///< what was there before, or all that the operation does
    SomeEntries,       ///< each entry as it was before or as the operation makes it
    OneAndPartOfOther, ///< what was there before; or all that the operation makes, and some of what it removes
    PartOfContent,     ///< any content at the target, which is written in place
};

/// Which end an operation names that failed, where a call works on one alone.
enum class Blames
{
    TheRightOne,
    Either,
};

/// Something that a provider does, for which a whole scene is there.
struct Operation
{
    std::string name;
    std::u16string from;
    std::u16string to; ///< empty where there is one location only
    Leaves leaves = Leaves::AllOrNothing;
    Blames blames = Blames::TheRightOne;

    /// What the file system does not know, and what it answers.
    int lacking = EINVAL;
    std::function<bool(SystemCall const&)> lacks = [](SystemCall const&) { return false; };

    /// Answers what it found, if it looks for anything: the same each time.
    std::function<std::string(Scene const&)> run;
};

/// For messages of GoogleTest.
inline void PrintTo(Operation const& operation, std::ostream* stream)
{
    *stream << operation.name;
}

std::vector<Operation> entryOperations();
std::vector<Operation> transferOperations();
std::vector<Operation> streamOperations();
std::vector<Operation> listingOperations();

std::vector<Operation> allOperations();

/// Whether an operation that failed may leave this, given what was there before and what it leaves when it is done.
bool mayLeave(Operation const& operation, Tree tree, Tree before, Tree after);

/// A location of an operation, as in the paths of a tree.
std::string toBytes(std::u16string const& name);

} // namespace foundation::tests::support
