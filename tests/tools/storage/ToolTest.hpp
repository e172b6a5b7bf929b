#pragma once

#include <tests/support/Process.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <filesystem>
#include <gtest/gtest.h>
#include <string>
#include <vector>

/// Runs the tool from end to end, in a temporary folder that is its working folder.
class ToolTest : public testing::Test
{
protected:
    using ProgramResult = foundation::tests::support::ProgramResult;
    using Process = foundation::tests::support::Process;
    using ProcessOptions = foundation::tests::support::ProcessOptions;
    using Arguments = std::vector<std::string>;

    /// The command line of the tool with these arguments.
    static Arguments command(Arguments const& arguments);

    ProcessOptions inFolder() const;
    ProgramResult run(Arguments const& arguments) const;

    /// Fails the test unless the tool ends well and says nothing on standard error; answers what it wrote.
    std::string runWell(Arguments const& arguments) const;

    /// Fails the test unless the tool exits with 1 and says exactly this on standard error; answers what it wrote.
    std::string runFailing(Arguments const& arguments, std::string const& errors) const;

    /// Runs the tool as a user whom permissions concern, which root is not.
    ProgramResult runUnprivileged(Arguments const& arguments) const;

    /// False where the tool lies in a folder that other users cannot enter.
    bool canRunUnprivileged() const { return runUnprivileged({"--version"}).status == 0; }

    /// Runs the tool with too few descriptors for an open listing on each of hundreds of levels.
    ProgramResult runWithFewDescriptors(Arguments const& arguments) const;

    void makeFolder(std::string const& name) const;
    void makeLink(std::string const& target, std::string const& name) const;
    void makePipe(std::string const& name) const;

    /// A folder of this name, and below it 400 levels with a file on each.
    void makeDeepFolder(std::string const& name) const;

    /// Sets the time of the last change, in seconds since 1970.
    void setTime(std::string const& name, long seconds, long nanoseconds = 0) const;

    bool exists(std::string const& name) const;

    /// Whether it is a file, and not a link to one.
    bool isFile(std::string const& name) const;
    bool isFolder(std::string const& name) const;
    std::size_t countEntries(std::string const& name = ".") const;

    /// Whether `diff -r` sees no difference.
    bool areEqual(std::string const& left, std::string const& right) const;

    /// Mounts a file system on a new folder; answers whether that is permitted. It goes with the test.
    bool mount(std::string const& name, std::string const& size);

    void TearDown() override;

    foundation::tests::support::TemporaryFolder folder{placeForTests()};

private:
    /// In memory where there is such a place: tens of thousands of files take a disk minutes on a bad day.
    static std::filesystem::path placeForTests();

    std::vector<std::filesystem::path> mounts_;
};
