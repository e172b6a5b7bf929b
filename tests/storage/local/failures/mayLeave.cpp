#include <tests/storage/local/failures/operations.hpp>

namespace foundation::tests::support {

namespace {

bool isEntry(Tree const& tree, std::string const& path, std::string const& content)
{
    auto const entry = tree.find(path);
    return entry != tree.end() && entry->second == content;
}

/// Whether each entry is as before or as after, and none is missing that is the same in both.
bool isMixture(Tree const& tree, Tree const& before, Tree const& after)
{
    for (auto const& [path, content] : tree)
        if (!isEntry(before, path, content) && !isEntry(after, path, content))
            return false;
    for (auto const& [path, content] : before)
        if (isEntry(after, path, content) && !isEntry(tree, path, content))
            return false;
    return true;
}

/// Whether what is after is there, and more of what was before than is left in the end.
bool isOnTheWay(Tree const& tree, Tree const& before, Tree const& after)
{
    for (auto const& [path, content] : after)
        if (!isEntry(tree, path, content))
            return false;
    return isMixture(tree, before, after);
}

} // namespace

std::string toBytes(std::u16string const& name)
{
    return {name.begin(), name.end()};
}

bool mayLeave(Operation const& operation, Tree tree, Tree before, Tree after)
{
    if (tree == before || tree == after)
        return true;
    if (operation.leaves == Leaves::SomeEntries)
        return isMixture(tree, before, after);
    if (operation.leaves == Leaves::OneAndPartOfOther)
        return isOnTheWay(tree, before, after);
    if (operation.leaves != Leaves::PartOfContent)
        return false;
    std::string const written = toBytes(operation.to.empty() ? operation.from : operation.to);
    for (Tree* const each : {&tree, &before, &after})
        each->erase(written);
    return tree == before || tree == after;
}

} // namespace foundation::tests::support
