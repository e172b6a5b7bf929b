#include <tests/storage/local/durability/MountedFileSystem.hpp>

#include <tests/support/Process.hpp>

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <linux/ioctl.h>
#include <sched.h>
#include <stdexcept>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <system_error>
#include <unistd.h>
#include <utility>
#include <vector>

namespace foundation::tests::support {

namespace {

namespace fs = std::filesystem;

/// Of ext4 as well as of XFS; `linux/fs.h` of Debian 12 does not name it.
constexpr unsigned long shutdownRequest = _IOR('X', 125, std::uint32_t);
constexpr std::uint32_t withoutFlushingTheLog = 2;

void run(std::vector<std::string> const& command)
{
    ProgramResult const result = runProgram(command);
    if (result.status != 0)
        throw std::runtime_error(command.front() + " failed: " + result.errors);
}

fs::path findProgram(std::string const& name)
{
    for (char const* const folder : {"/usr/sbin", "/sbin", "/usr/bin", "/bin"})
        if (fs::exists(fs::path(folder) / name))
            return fs::path(folder) / name;
    return {};
}

/// A name space of mounts that ends with this process.
bool keepMountsToOurselves()
{
    static bool const kept =
        ::unshare(CLONE_NEWNS) == 0 && ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
    return kept;
}

fs::path placeForImages()
{
    return fs::is_directory("/dev/shm") ? "/dev/shm" : fs::temp_directory_path();
}

} // namespace

std::string MountedFileSystem::objection(std::string const& type)
{
    if (::geteuid() != 0)
        return "only root can mount file systems";
    if (!keepMountsToOurselves())
        return "this system lets not even root mount file systems: " + std::generic_category().message(errno);
    if (type == "tmpfs")
        return "";
    if (findProgram("mkfs." + type).empty())
        return "no mkfs." + type;
    try {
        MountedFileSystem const probe(type, 512u << 20);
        return "";
    } catch (std::runtime_error const& error) {
        return "cannot mount " + type + " from an image: " + error.what();
    }
}

MountedFileSystem::MountedFileSystem(std::string type, std::uintmax_t size)
    : folder_(placeForImages()), type_(std::move(type)), size_(size)
{
    if (!keepMountsToOurselves())
        throw std::runtime_error("mounts cannot be kept from other processes");
    fs::create_directory(path());
    if (type_ != "tmpfs") {
        std::string const image = folder_.write("image", "");
        fs::resize_file(image, size_);
        run({findProgram("mkfs." + type_), "-q", image});
    }
    mount();
}

MountedFileSystem::~MountedFileSystem()
{
    unmount();
}

void MountedFileSystem::mount()
{
    if (type_ == "tmpfs")
        run({findProgram("mount"), "-t", type_, "-o", "size=" + std::to_string(size_), type_, path()});
    else
        run({findProgram("mount"), "-t", type_, "-o", "loop,nodiscard", folder_ / "image", path()});
}

void MountedFileSystem::unmount() noexcept
{
    if (::umount2(path().c_str(), 0) != 0)
        ::umount2(path().c_str(), MNT_DETACH);
}

void MountedFileSystem::cutPower() const
{
    int const root = ::open(path().c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    std::uint32_t how = withoutFlushingTheLog;
    int const result = ::ioctl(root, shutdownRequest, &how);
    ::close(root);
    if (result != 0)
        throw std::runtime_error("cannot cut the power of " + type_);
}

void MountedFileSystem::restart()
{
    if (::umount2(path().c_str(), 0) != 0)
        throw std::runtime_error("cannot unmount " + type_ + ": " + std::generic_category().message(errno));
    mount();
}

} // namespace foundation::tests::support
