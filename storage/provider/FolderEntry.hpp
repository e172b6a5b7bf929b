#pragma once

#include <storage/provider/FileAttributes.hpp>
#include <storage/provider/FolderAttributes.hpp>

#include <boost/optional.hpp>

#include <cstdint>
#include <string>

namespace foundation::storage::provider {

/// One name in a folder listing, with the attributes of what it names where the listing supplies them.
class FOUNDATION_API FolderEntry
{
public:
    enum class EntryType : std::int32_t
    {
        File,
        Folder,
    };

    /// An entry without attributes. `name` is one path component, in UTF-16 and not escaped.
    FolderEntry(std::u16string name, EntryType type);
    FolderEntry(std::u16string name, FileAttributes attributes);
    FolderEntry(std::u16string name, FolderAttributes attributes);

    std::u16string const& getName() const { return name_; }
    bool isFile() const { return type_ == EntryType::File; }

    /// Empty unless the entry was made from file attributes.
    boost::optional<FileAttributes> const& getFileAttributes() const { return fileAttributes_; }

    /// Empty unless the entry was made from folder attributes.
    boost::optional<FolderAttributes> const& getFolderAttributes() const { return folderAttributes_; }

private:
    std::u16string name_;
    EntryType type_;
    boost::optional<FileAttributes> fileAttributes_;
    boost::optional<FolderAttributes> folderAttributes_;
};

} // namespace foundation::storage::provider
