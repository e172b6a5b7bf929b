#include <storage/local/detail/checkedRemoval.hpp>

#include <storage/local/detail/move.hpp>
#include <storage/local/detail/scratchName.hpp>

#include <cerrno>
#include <string>

namespace foundation::storage::local::detail {

namespace {

int check(At const& entry, MayRemove const& mayRemove, Status& status)
{
    int const error = getFullStatus(entry, Links::Keep, status);
    return error != 0 ? error : mayRemove(status);
}

template <typename Remove>
int removeChecked(At const& entry, MayRemove const& mayRemove, Remove const& remove)
{
    std::string const name = scratchName();
    At const taken{entry.folder, name.c_str()};
    if (int const error = renameEntry(entry, taken, 0))
        return error;
    Status status = {};
    int error = check(taken, mayRemove, status);
    if (error == 0)
        error = remove(taken);
    if (error != 0)
        static_cast<void>(isFolder(status) ? moveFolderWithoutReplacing(taken, entry)
                                           : moveFileWithoutReplacing(taken, entry));
    return error;
}

} // namespace

int removeNameChecked(At const& entry, MayRemove const& mayRemove)
{
    // Others would miss a folder for as long as it has another name.
    Status status;
    int const error = check(entry, mayRemove, status);
    if (error != 0 || isFolder(status))
        return error != 0 ? error : EISDIR;
    return removeChecked(entry, mayRemove, [](At const& taken) { return removeName(taken); });
}

int removeEmptyFolderChecked(At const& entry, MayRemove const& mayRemove)
{
    Status status;
    if (int const error = check(entry, mayRemove, status))
        return error;
    return removeChecked(entry, mayRemove, [](At const& taken) { return removeEmptyFolder(taken); });
}

} // namespace foundation::storage::local::detail
