#pragma once

#include <foundation/export.hpp>
#include <storage/memory/detail/File.hpp>

#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <variant>

namespace foundation::storage::memory::detail {

class Folder;
using FilePtr = std::shared_ptr<File>;
using FolderPtr = std::shared_ptr<Folder>;

/// What a name in a folder stands for.
using Node = std::variant<FilePtr, FolderPtr>;

/// A folder: what it holds by name, in the order of UTF-16 code units, and what is known of it.
///
/// Threads: one at a time; the tree sees to it.
class FOUNDATION_API Folder
{
public:
    using Children = std::map<std::u16string, Node, std::less<>>;

    /// Folders that go together go one after the other, however deep they lie.
    static FolderPtr create();

    Folder(Folder const&) = delete;
    Folder& operator=(Folder const&) = delete;

    Children const& children() const noexcept { return children_; }

    /// Null where there is nothing of that name.
    Node const* find(std::u16string_view name) const;

    /// Gives a name to a node; answers what the name stood for before, a null file if nothing.
    Node put(std::u16string_view name, Node node);

    /// Takes a name away, which must stand for something; answers what it stood for.
    Node take(std::u16string_view name);

    /// Another value after each change of what it holds, so that iterators are known to be valid.
    std::uint64_t version() const noexcept { return version_; }

    /// A folder that was removed together with what it holds, and which only listings still know.
    bool isRemoved() const noexcept { return removed_; }
    void noteRemoval() noexcept { removed_ = true; }

    Status status() const { return {0, lastModified_, writable_}; }
    void setLastModified(boost::posix_time::ptime const& time) { lastModified_ = time; }
    bool isWritable() const noexcept { return writable_; }
    void setWritable(bool writable) noexcept { writable_ = writable; }

private:
    struct Deleter;

    Folder() : lastModified_(now()) {}
    ~Folder() = default;

    void noteChange();

    Children children_;
    std::uint64_t version_ = 0;
    boost::posix_time::ptime lastModified_;
    Folder* nextDoomed_ = nullptr;
    bool writable_ = true;
    bool removed_ = false;
};

/// Null where the node is none of that kind.
inline FilePtr const* asFile(Node const* node) noexcept
{
    return std::get_if<FilePtr>(node);
}
inline FolderPtr const* asFolder(Node const* node) noexcept
{
    return std::get_if<FolderPtr>(node);
}

} // namespace foundation::storage::memory::detail
