#include <storage/local/detail/metadata.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <array>
#include <cerrno>
#include <cstring>
#include <memory>
#include <string_view>

namespace foundation::storage::local::detail {

namespace {

constexpr mode_t settableBits = 07777;
constexpr mode_t setIdBits = 06000;
constexpr std::string_view prefixOfUser = "user.";

/// Nobody but the superuser gives files away, and some file systems keep neither owners nor permissions.
bool isNotForUs(int error)
{
    return error == EPERM || error == EINVAL || error == EOPNOTSUPP;
}

int keepOwner(At const& at, int flags, Status const& source, Status const& target)
{
    auto const change = [&](uid_t owner, gid_t group) {
        return errorOf([&] { return systemCalls().fchownat(at.folder, at.path, owner, group, flags); });
    };
    if (target.stx_uid == source.stx_uid && target.stx_gid == source.stx_gid)
        return 0;
    int error = change(source.stx_uid, source.stx_gid);
    if (isNotForUs(error) && target.stx_gid != source.stx_gid)
        error = change(static_cast<uid_t>(-1), source.stx_gid);
    return isNotForUs(error) ? 0 : error;
}

int getStatusOf(int file, Status& status)
{
    return errorOf(
        [&] { return systemCalls().statx(file, "", AT_EMPTY_PATH | AT_NO_AUTOMOUNT, STATX_BASIC_STATS, &status); });
}

std::array<timespec, 2> timesOf(Status const& source)
{
    auto const convert = [](statx_timestamp const& time) {
        return timespec{.tv_sec = time.tv_sec, .tv_nsec = time.tv_nsec};
    };
    return {convert(source.stx_atime), convert(source.stx_mtime)};
}

int setTimes(At const& at, int flags, Status const& source)
{
    std::array<timespec, 2> const times = timesOf(source);
    return errorOf([&] { return systemCalls().utimensat(at.folder, at.path, times.data(), flags); });
}

/// Gone meanwhile, or not for this user.
bool isPassedOver(int error)
{
    return error == ENODATA || error == EACCES || error == EPERM;
}

template <typename Call>
int sizeOf(Call const& call, std::size_t& size)
{
    ssize_t const result = retried(call);
    size = result == -1 ? 0 : static_cast<std::size_t>(result);
    return result == -1 ? errno : 0;
}

CopyResult keepAttribute(int source, int target, char const* name, char* value)
{
    std::size_t size = 0;
    int error = sizeOf([&] { return systemCalls().fgetxattr(source, name, value, maximumAttributeSize); }, size);
    if (isPassedOver(error))
        return {};
    if (error != 0)
        return {CopyOutcome::SourceFailed, error};
    error = errorOf([&] { return systemCalls().fsetxattr(target, name, value, size, 0); });
    return error == 0 ? CopyResult() : CopyResult{CopyOutcome::AttributesFailed, error};
}

CopyResult keepAttributes(int source, int target, char const* names, char const* end)
{
    auto const value = std::make_unique_for_overwrite<char[]>(maximumAttributeSize);
    for (char const* name = names; name < end; name += std::strlen(name) + 1) {
        if (!std::string_view(name).starts_with(prefixOfUser))
            continue;
        CopyResult const result = keepAttribute(source, target, name, value.get());
        if (result.outcome != CopyOutcome::Completed)
            return result;
    }
    return {};
}

/// Who may not write a file may not give it attributes either, however it was opened.
CopyResult keepAttributesOfReadOnly(int source, int target, char const* names, char const* end)
{
    Status status;
    int error = getStatusOf(target, status);
    mode_t const mode = status.stx_mode & settableBits;
    if (error != 0 || (mode & S_IWUSR) != 0)
        return {CopyOutcome::AttributesFailed, error != 0 ? error : EACCES};
    error = errorOf([&] { return systemCalls().fchmod(target, mode | S_IWUSR); });
    if (error != 0)
        return {CopyOutcome::AttributesFailed, error};
    CopyResult const result = keepAttributes(source, target, names, end);
    error = errorOf([&] { return systemCalls().fchmod(target, mode); });
    return error == 0 ? result : CopyResult{CopyOutcome::TargetFailed, error};
}

} // namespace

int keepOwnerAndMode(int file, Status const& source)
{
    Status target;
    int error = getStatusOf(file, target);
    if (error == 0)
        error = keepOwner({file, ""}, AT_EMPTY_PATH, source, target);
    if (error == 0)
        error = getStatusOf(file, target);
    if (error != 0)
        return error;
    bool const isSameOwner = target.stx_uid == source.stx_uid && target.stx_gid == source.stx_gid;
    mode_t const mode = source.stx_mode & (isSameOwner ? settableBits : settableBits & ~setIdBits);
    if ((target.stx_mode & settableBits) == mode)
        return 0;
    error = errorOf([&] { return systemCalls().fchmod(file, mode); });
    return isNotForUs(error) ? 0 : error;
}

int keepOwnerOfLink(At const& link, Status const& source)
{
    Status target;
    int const error = getFullStatus(link, Links::Keep, target);
    return error != 0 ? error : keepOwner(link, AT_SYMLINK_NOFOLLOW, source, target);
}

int keepTimes(int file, Status const& source)
{
    return setTimes({file, ""}, AT_EMPTY_PATH, source);
}

int keepTimesOfLink(At const& link, Status const& source)
{
    return setTimes(link, AT_SYMLINK_NOFOLLOW, source);
}

CopyResult keepUserAttributes(int source, int target)
{
    auto const names = std::make_unique_for_overwrite<char[]>(maximumAttributeSize);
    std::size_t end = 0;
    int const error = sizeOf([&] { return systemCalls().flistxattr(source, names.get(), maximumAttributeSize); }, end);
    if (error == EOPNOTSUPP || (error == 0 && end == 0))
        return {};
    if (error != 0)
        return {CopyOutcome::SourceFailed, error};
    CopyResult const result = keepAttributes(source, target, names.get(), names.get() + end);
    bool const isReadOnly = result.outcome == CopyOutcome::AttributesFailed && result.error == EACCES;
    return isReadOnly ? keepAttributesOfReadOnly(source, target, names.get(), names.get() + end) : result;
}

} // namespace foundation::storage::local::detail
