#include <storage/memory/detail/Folder.hpp>

#include <utility>

namespace foundation::storage::memory::detail {

/// A folder that goes takes its subfolders along. Were each destroyed within the other, a deep tree would not fit on
/// the stack; so those that go meanwhile wait in a list that the first of them works off.
struct Folder::Deleter
{
    void operator()(Folder* folder) const noexcept
    {
        thread_local Folder* doomed = nullptr;
        thread_local bool working = false;

        folder->nextDoomed_ = std::exchange(doomed, folder);
        if (working)
            return;
        working = true;
        while (doomed != nullptr)
            delete std::exchange(doomed, doomed->nextDoomed_);
        working = false;
    }
};

FolderPtr Folder::create()
{
    return FolderPtr(new Folder, Deleter());
}

Node const* Folder::find(std::u16string_view name) const
{
    auto const found = children_.find(name);
    return found == children_.end() ? nullptr : &found->second;
}

Node Folder::put(std::u16string_view name, Node node)
{
    auto const found = children_.find(name);
    if (found == children_.end())
        children_.emplace(name, std::move(node));
    else
        std::swap(found->second, node);
    noteChange();
    return found == children_.end() ? Node() : std::move(node);
}

Node Folder::take(std::u16string_view name)
{
    auto const found = children_.find(name);
    Node node = std::move(found->second);
    children_.erase(found);
    noteChange();
    return node;
}

void Folder::noteChange()
{
    ++version_;
    lastModified_ = now();
}

} // namespace foundation::storage::memory::detail
