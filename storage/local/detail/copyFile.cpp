#include <storage/local/detail/copyFile.hpp>

#include <storage/local/detail/ScratchFile.hpp>
#include <storage/local/detail/copyContent.hpp>
#include <storage/local/detail/copyFailure.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/metadata.hpp>
#include <storage/local/detail/move.hpp>
#include <storage/local/detail/openRegularFile.hpp>
#include <storage/provider/Exception.hpp>

#include <optional>

namespace foundation::storage::local::detail {

using provider::ErrorCode;
using provider::Exception;
using provider::IProvider;
using provider::ReplacementPolicy;
using provider::StorageIRI;
using provider::TransactionStatus;

namespace {

constexpr mode_t permissionBits = 0777;

/// To copy this much in vain, because the target turns out to be taken, costs less than to look at each target before.
constexpr std::uint64_t lookSize = 16384;

/// Both ends of a copy, as the client named them and as the system calls do.
struct Copy
{
    Root const& root;
    StorageIRI const& from;
    StorageIRI const& to;
    ReplacementPolicy policy;
    std::string fromPath = root.pathOf(from);
    std::string toPath = root.pathOf(to);
};

/// What stands at the target and may be replaced, or what a link there leads to; nothing where nothing is.
std::optional<Status> requireReplaceable(Copy const& copy)
{
    Status status;
    int const error = copy.root.getStatus(copy.toPath, Links::Follow, status);
    if (meansMissing(error))
        return std::nullopt;
    if (error != 0)
        throwError(error, copy.to);
    if (isFolder(status) || !replaces(copy.policy))
        throwError(ErrorCode::ResourceAlreadyExists, copy.to);
    return status;
}

OpenedFile openSource(Copy const& copy)
{
    return openRegularFile(copy.root, copy.fromPath, O_RDONLY, copy.from);
}

/// Looks at the target first where the source cannot be opened.
OpenedFile openSourceBeforeLooking(Copy const& copy)
{
    try {
        return openSource(copy);
    } catch (Exception const&) {
        requireReplaceable(copy);
        throw;
    }
}

mode_t modeOfCopy(OpenedFile const& source)
{
    return source.status.stx_mode & permissionBits;
}

/// Where nothing was found, what others have made since is not replaced, unless a link leads to it.
int exclusion(Copy const& copy)
{
    if (replaces(copy.policy))
        return 0;
    Status status;
    int const error = copy.root.getStatus(copy.toPath, Links::Keep, status);
    if (error != 0 && !meansMissing(error))
        throwError(error, copy.to);
    return error == 0 && isLink(status) ? 0 : O_EXCL;
}

/// Is not truncated as it is opened: ext4 writes a file that was to the disk when it is closed.
OpenedFile openTarget(Copy const& copy, OpenedFile const& source)
{
    int const flags = O_WRONLY | O_CREAT | exclusion(copy);
    OpenedFile target = openRegularFile(copy.root, copy.toPath, flags, copy.to, modeOfCopy(source));
    if (target.status.stx_size == 0 || isSameFile(source.status, target.status))
        return target;
    if (int const error = errorOf([&] { return systemCalls().ftruncate(target.file.get(), 0); }))
        throwError(error, copy.to);
    return target;
}

/// What a replacing policy finds.
bool leadsToSource(Copy const& copy, OpenedFile const& source)
{
    std::optional<Status> const target = requireReplaceable(copy);
    return target && isSameFile(source.status, *target);
}

CopyResult preserve(Preserved const& preserved, OpenedFile const& source, FileDescriptor const& target)
{
    CopyResult result;
    if (preserved.extendedAttributes)
        result = keepUserAttributes(source.file.get(), target.get());
    if (!preserved.times || result.outcome != CopyOutcome::Completed)
        return result;
    statx_timestamp const& time = source.status.stx_mtime;
    int const error = setModified(target, {.tv_sec = time.tv_sec, .tv_nsec = time.tv_nsec});
    return error == 0 ? result : CopyResult{CopyOutcome::TargetFailed, error};
}

} // namespace

void copyFile(Settings const& settings, StorageIRI const& from, StorageIRI const& to, ReplacementPolicy policy)
{
    Copy const copy{settings.root, from, to, policy};
    std::optional<Status> const replaced = requireReplaceable(copy);
    OpenedFile const source = openSource(copy);
    // One that may not be written is not changed, either.
    if (replaced && isSameFile(source.status, *replaced))
        return;
    OpenedFile target = openTarget(copy, source);
    if (isSameFile(source.status, target.status))
        return;
    CopyResult const result = copyContent(source.file, source.status, target.file, {});
    if (result.error != 0)
        throwError(result.error, from);
    requireCopied(preserve(settings.preserved, source, target.file), from, to);
    if (int const error = target.file.close())
        throwError(error, from);
}

TransactionStatus copyFileAtomic(Settings const& settings, StorageIRI const& from, StorageIRI const& to,
                                 ReplacementPolicy policy, IProvider::Interrupt const& interrupt)
{
    Copy const copy{settings.root, from, to, policy};
    OpenedFile const source = openSourceBeforeLooking(copy);
    bool const looks = replaces(policy) || source.status.stx_size > lookSize;
    if (looks && leadsToSource(copy, source))
        return TransactionStatus::Completed;
    ScratchFile scratch(settings.root, to, settings.durability, O_WRONLY, modeOfCopy(source),
                        replaces(policy) ? Permissions::OfTarget : Permissions::Own);
    CopyResult const result = copyContent(source.file, source.status, scratch.file(), interrupt);
    if (result.outcome == CopyOutcome::Aborted)
        return TransactionStatus::Aborted;
    requireCopied(result, from, to);
    requireCopied(preserve(settings.preserved, source, scratch.file()), from, to);
    scratch.commit(policy);
    return TransactionStatus::Completed;
}

} // namespace foundation::storage::local::detail
