#pragma once

#include <filesystem>
#include <sched.h>
#include <sys/mount.h>

namespace foundation::tests::support {

/// Something mounted on a folder, for this process alone, as long as this lives. Needs the rights to mount.
class ScopedMount
{
public:
    /// Shows the folder `source` at `target`.
    static ScopedMount bind(std::filesystem::path const& source, std::filesystem::path const& target)
    {
        return ScopedMount(source, target, "none", MS_BIND);
    }

    /// Puts a file system of its own at `target`.
    static ScopedMount fileSystem(std::filesystem::path const& target)
    {
        return ScopedMount("tmpfs", target, "tmpfs", 0);
    }

    ~ScopedMount()
    {
        if (isMounted_)
            ::umount2(target_.c_str(), MNT_DETACH);
    }

    ScopedMount(ScopedMount const&) = delete;
    ScopedMount& operator=(ScopedMount const&) = delete;

    /// Whether this user may mount.
    explicit operator bool() const { return isMounted_; }

private:
    ScopedMount(std::filesystem::path const& source, std::filesystem::path target, char const* type,
                unsigned long flags)
        : target_(std::move(target)),
          isMounted_(hasOwnMounts() && ::mount(source.c_str(), target_.c_str(), type, flags, nullptr) == 0)
    {}

    static bool hasOwnMounts()
    {
        static bool const answer =
            ::unshare(CLONE_NEWNS) == 0 && ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
        return answer;
    }

    std::filesystem::path target_;
    bool isMounted_;
};

} // namespace foundation::tests::support
