#include <tests/tools/storage/ToolTest.hpp>

#include <fcntl.h>
#include <filesystem>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

namespace fs = std::filesystem;
using foundation::tests::support::ProcessOptions;

namespace {

constexpr int cannotPrepare = 126;

void becomeNobody()
{
    constexpr id_t nobody = 65534;
    if (::geteuid() == 0 && (::setgid(nobody) != 0 || ::setuid(nobody) != 0))
        ::_exit(cannotPrepare);
}

void limitDescriptors()
{
    rlimit const few{150, 150};
    if (::setrlimit(RLIMIT_NOFILE, &few) != 0)
        ::_exit(cannotPrepare);
}

} // namespace

fs::path ToolTest::placeForTests()
{
    fs::path const memory = "/dev/shm";
    return ::access(memory.c_str(), W_OK | X_OK) == 0 ? memory : fs::temp_directory_path();
}

ToolTest::Arguments ToolTest::command(Arguments const& arguments)
{
    Arguments result{STORAGE_TOOL};
    result.insert(result.end(), arguments.begin(), arguments.end());
    return result;
}

ProcessOptions ToolTest::inFolder() const
{
    ProcessOptions options;
    options.workingFolder = folder.path();
    return options;
}

ToolTest::ProgramResult ToolTest::run(Arguments const& arguments) const
{
    return runProgram(command(arguments), inFolder());
}

std::string ToolTest::runWell(Arguments const& arguments) const
{
    ProgramResult const result = run(arguments);
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.errors, "");
    return result.output;
}

std::string ToolTest::runFailing(Arguments const& arguments, std::string const& errors) const
{
    ProgramResult const result = run(arguments);
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, errors);
    return result.output;
}

ToolTest::ProgramResult ToolTest::runUnprivileged(Arguments const& arguments) const
{
    fs::permissions(folder.path(), fs::perms::all);
    ProcessOptions options = inFolder();
    options.prepare = &becomeNobody;
    return runProgram(command(arguments), options);
}

ToolTest::ProgramResult ToolTest::runWithFewDescriptors(Arguments const& arguments) const
{
    ProcessOptions options = inFolder();
    options.prepare = &limitDescriptors;
    return runProgram(command(arguments), options);
}

void ToolTest::makeFolder(std::string const& name) const
{
    fs::create_directories(folder / name);
}

void ToolTest::makeLink(std::string const& target, std::string const& name) const
{
    fs::create_symlink(target, folder / name);
}

void ToolTest::makePipe(std::string const& name) const
{
    ASSERT_EQ(::mkfifo((folder / name).c_str(), 0600), 0);
}

void ToolTest::makeDeepFolder(std::string const& name) const
{
    makeFolder(name);
    std::string path = name;
    for (int level = 0; level < 400; ++level) {
        path += "/d";
        makeFolder(path);
        folder.write(path + "/f", "content");
    }
}

void ToolTest::setTime(std::string const& name, long seconds, long nanoseconds) const
{
    timespec const times[2]{{seconds, nanoseconds}, {seconds, nanoseconds}};
    ASSERT_EQ(::utimensat(AT_FDCWD, (folder / name).c_str(), times, AT_SYMLINK_NOFOLLOW), 0);
}

bool ToolTest::exists(std::string const& name) const
{
    return fs::exists(fs::symlink_status(folder / name));
}

bool ToolTest::isFile(std::string const& name) const
{
    return fs::is_regular_file(fs::symlink_status(folder / name));
}

bool ToolTest::isFolder(std::string const& name) const
{
    return fs::is_directory(fs::symlink_status(folder / name));
}

std::size_t ToolTest::countEntries(std::string const& name) const
{
    fs::directory_iterator const entries(folder / name);
    return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
}

bool ToolTest::areEqual(std::string const& left, std::string const& right) const
{
    return runProgram({"/usr/bin/diff", "-r", left, right}, inFolder()).status == 0;
}

bool ToolTest::mount(std::string const& name, std::string const& size)
{
    makeFolder(name);
    if (::mount("tmpfs", (folder / name).c_str(), "tmpfs", 0, ("size=" + size).c_str()) != 0)
        return false;
    mounts_.push_back(folder / name);
    return true;
}

void ToolTest::TearDown()
{
    for (fs::path const& mount : mounts_)
        EXPECT_EQ(::umount2(mount.c_str(), MNT_DETACH), 0);
}
