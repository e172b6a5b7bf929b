#pragma once

#include <tests/support/TemporaryFolder.hpp>

#include <cstdint>
#include <filesystem>
#include <string>

namespace foundation::tests::support {

/// A small file system of its own, in a file in memory, which can lose its power.
///
/// It is mounted where only this process and its children see it, so that nothing is left of it however they end.
class MountedFileSystem
{
public:
    /// Why there can be none here: who is not root cannot mount; empty where there can.
    ///
    /// `type` is "ext4" or "xfs", which need their `mkfs`, or "tmpfs".
    static std::string objection(std::string const& type);

    /// Throws `std::runtime_error` when it cannot be made. `size` is in bytes.
    MountedFileSystem(std::string type, std::uintmax_t size);
    ~MountedFileSystem();
    MountedFileSystem(MountedFileSystem const&) = delete;
    MountedFileSystem& operator=(MountedFileSystem const&) = delete;

    std::filesystem::path path() const { return folder_ / "mounted"; }

    /// From now on nothing gets to the disk, not even what its journal still holds in memory, and every call fails.
    void cutPower() const;

    /// Makes it usable again, as after the power came back. No process may have anything open in it.
    void restart();

private:
    void mount();
    void unmount() noexcept;

    TemporaryFolder const folder_;
    std::string const type_;
    std::uintmax_t const size_;
};

} // namespace foundation::tests::support
