#include <storage/local/FolderWalk.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/FolderChain.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/attributes.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>

#include <cerrno>
#include <fcntl.h>
#include <utility>

namespace foundation::storage::local {

using namespace detail;
using provider::ExistenceTypeExtended;
using provider::StorageIRI;

namespace {

/// Several walks go on at once, beside what they are for.
constexpr std::size_t maximumOpen = 24;

FileDescriptor openStart(StorageIRI const& folder, StartLink link)
{
    int const flags = O_RDONLY | O_DIRECTORY | (link == StartLink::Refuse ? O_NOFOLLOW : 0);
    FileDescriptor opened;
    if (int const error = Root().open(Root().pathOf(folder), flags, opened))
        throwError(error, folder);
    return opened;
}

/// What was a folder when its name was read may have gone, or become something else.
bool meansVanished(int error)
{
    return error == ENOENT || error == ENOTDIR || error == ELOOP;
}

ExistenceTypeExtended typeOf(Status const& status)
{
    if (isFolder(status))
        return ExistenceTypeExtended::RegularFolder;
    return S_ISREG(status.stx_mode) ? ExistenceTypeExtended::RegularFile : ExistenceTypeExtended::SpecialFile;
}

ExistenceTypeExtended typeOf(FoundName const& found)
{
    if (found.isFolder())
        return ExistenceTypeExtended::RegularFolder;
    return found.type == DT_REG ? ExistenceTypeExtended::RegularFile : ExistenceTypeExtended::SpecialFile;
}

void describe(Status const& status, WalkedEntry& entry)
{
    if (!isFolder(status))
        entry.size = status.stx_size;
    entry.modified = toPtime(status.stx_mtime);
}

} // namespace

class FolderWalk::Impl
{
public:
    Impl(StorageIRI const& folder, WalkedDetail detail, StartLink link)
        : iri_(folder), chain_(openStart(folder, link), maximumOpen), detail_(detail)
    {}

    std::optional<WalkedEntry> next();
    bool enter(std::string const& name);
    void leave();
    std::size_t depth() const { return chain_.depth(); }

    HeldFolder hold() const
    {
        FileDescriptor held(retried([&] { return systemCalls().dup(chain_.folder()); }));
        if (!held.isOpen())
            fail(errno, chain_.path());
        return HeldFolder(std::move(held));
    }

private:
    int describe(FoundName const& found, WalkedEntry& entry) const;
    int describeLink(At const& link, WalkedEntry& entry) const;
    std::string pathOf(std::string_view name) const;

    [[noreturn]] void fail(int error, std::string const& path) const
    {
        throwError(error, path.empty() ? iri_ : StorageIRI(iri_, fl::filesystem::from_native_bytes(path)));
    }

    StorageIRI iri_;
    FolderChain chain_;
    WalkedDetail detail_;
    bool isThrough_ = false; ///< the innermost folder, because it cannot be read
};

std::string FolderWalk::Impl::pathOf(std::string_view name) const
{
    std::string path = chain_.path();
    return path.append(path.empty() ? "" : "/").append(name);
}

std::optional<WalkedEntry> FolderWalk::Impl::next()
{
    while (!isThrough_) {
        FoundName found;
        if (int const error = chain_.read(found)) {
            isThrough_ = true;
            fail(error, chain_.path());
        }
        if (found.name.empty())
            break;
        WalkedEntry entry{fl::filesystem::from_native_bytes(found.name), typeOf(found)};
        int const error = describe(found, entry);
        if (error == 0)
            return entry;
        if (error != ENOENT)
            fail(error, pathOf(found.name));
    }
    return std::nullopt;
}

int FolderWalk::Impl::describe(FoundName const& found, WalkedEntry& entry) const
{
    At const at{chain_.folder(), found.name.data()};
    if (found.isDecided() && detail_ == WalkedDetail::Names)
        return 0;
    if (found.type == DT_LNK)
        return describeLink(at, entry);
    Status status;
    if (int const error = getStatus(at, Links::Keep, status))
        return error;
    if (isLink(status))
        return describeLink(at, entry);
    entry.type = typeOf(status);
    if (detail_ == WalkedDetail::Attributes)
        local::describe(status, entry);
    return 0;
}

/// A link that leads where this user may not look is as good as broken.
int FolderWalk::Impl::describeLink(At const& link, WalkedEntry& entry) const
{
    Status status;
    int const error = getStatus(link, Links::Follow, status);
    if (error != 0 && !isUnreachable(error))
        return error;
    entry.type = ExistenceTypeExtended::BrokenSymlink;
    if (error != 0)
        return 0;
    entry.type = isFolder(status) ? ExistenceTypeExtended::SymlinkToFolder : ExistenceTypeExtended::SymlinkToFile;
    if (detail_ == WalkedDetail::Attributes)
        local::describe(status, entry);
    return 0;
}

bool FolderWalk::Impl::enter(std::string const& name)
{
    int const error = chain_.enter(name.c_str(), Mounts::Enter);
    if (error != 0 && !meansVanished(error))
        fail(error, pathOf(name));
    if (error == 0)
        isThrough_ = false;
    return error == 0;
}

void FolderWalk::Impl::leave()
{
    isThrough_ = false;
    if (int const error = chain_.leave()) {
        isThrough_ = error != ESTALE;
        fail(error == ESTALE ? ENOENT : error, error == ESTALE ? chain_.lostPath() : chain_.path());
    }
}

FolderWalk::FolderWalk(StorageIRI const& folder, WalkedDetail detail, StartLink link)
    : impl_(std::make_unique<Impl>(folder, detail, link))
{}

FolderWalk::~FolderWalk() = default;

std::optional<WalkedEntry> FolderWalk::next()
{
    return impl_->next();
}

bool FolderWalk::enter(std::u16string const& name)
{
    return impl_->enter(fl::filesystem::to_native_bytes(name));
}

void FolderWalk::leave()
{
    impl_->leave();
}

std::size_t FolderWalk::depth() const
{
    return impl_->depth();
}

HeldFolder FolderWalk::hold() const
{
    return impl_->hold();
}

} // namespace foundation::storage::local
