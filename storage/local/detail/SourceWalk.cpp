#include <storage/local/detail/SourceWalk.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/moveContent.hpp>

#include <cerrno>
#include <cstddef>

namespace foundation::storage::local::detail {

using provider::StorageIRI;

void SourceWalk::run(SourceVisitor& visitor)
{
    enter(tree_.name.c_str(), visitor);
    while (chain_.depth() > 0)
        step(visitor);
}

void SourceWalk::enter(char const* name, SourceVisitor& visitor)
{
    if (int const error = chain_.enter(name, Mounts::Refuse)) {
        if (error == EXDEV)
            throwError(EBUSY, locationOf(name), u"something is mounted on it");
        fail(error, name);
    }
    Status status;
    if (int const error = getFullStatus({folder(), "."}, Links::Keep, status))
        fail(error);
    visitor.enter(status);
}

void SourceWalk::step(SourceVisitor& visitor)
{
    watch_.check();
    FoundName found;
    if (int const error = chain_.read(found))
        fail(error);
    std::string const name(found.name);
    if (name.empty()) {
        visitor.leave();
        if (int const error = chain_.leave())
            fail(error);
        return;
    }
    Status status;
    if (int const error = getFullStatus({folder(), name.c_str()}, Links::Keep, status))
        fail(error == ENOENT ? EBUSY : error, name);
    if (isFolder(status))
        enter(name.c_str(), visitor);
    else
        visitor.visit(name.c_str(), status);
}

void SourceWalk::fail(int error, std::string const& entry) const
{
    throwAtSource(error, locationOf(entry));
}

/// The path of the chain begins with the name of the tree.
StorageIRI SourceWalk::locationOf(std::string const& entry) const
{
    std::string path = chain_.path();
    if (!entry.empty())
        path.append(path.empty() ? "" : "/").append(entry);
    std::size_t const slash = path.find('/');
    if (slash == std::string::npos)
        return tree_.iri;
    return StorageIRI(tree_.iri, fl::filesystem::from_native_bytes(path.substr(slash + 1)));
}

} // namespace foundation::storage::local::detail
