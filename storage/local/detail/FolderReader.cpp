#include <storage/local/detail/FolderReader.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <cerrno>
#include <utility>

namespace foundation::storage::local::detail {

FolderReader::FolderReader(FileDescriptor folder) : folder_(std::move(folder)) {}

int FolderReader::next(FoundName& found)
{
    return names_.next(folder_.get(), found);
}

int FolderReader::restart()
{
    names_.clear();
    return systemCalls().lseek(folder_.get(), 0, SEEK_SET) == -1 ? errno : 0;
}

} // namespace foundation::storage::local::detail
