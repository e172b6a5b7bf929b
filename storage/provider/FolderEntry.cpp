#include <storage/provider/FolderEntry.hpp>

#include <utility>

namespace foundation::storage::provider {

FolderEntry::FolderEntry(std::u16string name, EntryType type) : name_(std::move(name)), type_(type) {}

FolderEntry::FolderEntry(std::u16string name, FileAttributes attributes)
    : name_(std::move(name)), type_(EntryType::File), fileAttributes_(std::move(attributes))
{}

FolderEntry::FolderEntry(std::u16string name, FolderAttributes attributes)
    : name_(std::move(name)), type_(EntryType::Folder), folderAttributes_(std::move(attributes))
{}

} // namespace foundation::storage::provider
