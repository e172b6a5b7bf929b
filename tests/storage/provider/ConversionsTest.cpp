#include <storage/provider/Conversions.hpp>

#include <gtest/gtest.h>

#include <filesystem>
#include <functional>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>

#include <boost/exception/diagnostic_information.hpp>
#include <boost/exception/info.hpp>

#include <fl/filesystem/exceptions.hpp>
#include <fl/filesystem/native_name.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/detail/canonicalize.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/thrown.hpp>

namespace foundation::storage::provider {
namespace {

using fl::filesystem::upath;
using tests::support::textOf;
namespace fs = fl::filesystem;

TEST(Conversions, FilePathBecomesALocation)
{
    StorageIRI const location = toStorageIRI(u"file", upath(u"/tmp/a b!"));
    EXPECT_EQ(location.toString(), u"file:///tmp/a%20b%21");
    EXPECT_EQ(location.toUPath(), upath(u"/tmp/a b!"));
}

TEST(Conversions, FilePathIsTakenAsItIs)
{
    EXPECT_EQ(toStorageIRI(u"file", upath(u"/a/../b//c/", false)).getPath(), u"/a/../b//c/");
}

TEST(Conversions, EmptyFilePathBecomesALocation)
{
    EXPECT_EQ(toStorageIRI(u"file", upath()).toString(), u"file://");
}

TEST(Conversions, RelativeFilePathIsRefused)
{
    EXPECT_EQ(textOf<std::runtime_error>([] { static_cast<void>(toStorageIRI(u"file", upath(u"a/\u00E9"))); }),
              "File path a/\xC3\xA9 is not absolute.");
}

TEST(Conversions, LocationBecomesAFilePath)
{
    EXPECT_EQ(fromStorageIRI(StorageIRI(u"file:///tmp/a%20b")), upath(u"/tmp/a b"));
    EXPECT_EQ(fromStorageIRI(toStorageIRI(u"s", upath(u"/x"))), upath(u"/x"));
    EXPECT_EQ(textOf<std::logic_error>([] { static_cast<void>(fromStorageIRI(StorageIRI(u"zip:f:/x!/d"))); }),
              "Can not extract a file system path from StorageIRI zip:f:/x!/d as it represents a location inside a "
              "container.");
}

/// What canonicalisation that fails with `failure` is reported as.
template <class Failure>
std::optional<ErrorCode> codeFor(Failure const& failure)
{
    upath const given(u"/given/../path");
    try {
        static_cast<void>(
            detail::toCanonicalizedStorageIRI(u"file", given, [&](upath const&) -> upath { throw failure; }));
    } catch (Exception const& exception) {
        EXPECT_EQ(exception.getStorageIRI().toString(), u"file:///given/../path");
        return exception.getErrorCode();
    }
    return std::nullopt;
}

template <class First, class Second>
struct Both : First, Second
{
    Both() : fs::FsysExceptionBase("both"), First("first"), Second("second") {}
};

TEST(Conversions, FailureOfTheFileSystemBecomesItsCode)
{
    EXPECT_EQ(codeFor(fs::AccessDenied("x")), ErrorCode::PermissionDenied);
    EXPECT_EQ(codeFor(fs::SystemError("x")), ErrorCode::IOError);
    EXPECT_EQ(codeFor(fs::PathNotFound("x")), ErrorCode::ResourceNotFound);
    EXPECT_EQ(codeFor(fs::InvalidArgument("x")), ErrorCode::InvalidLocation);
    EXPECT_EQ(codeFor(fs::FsysExceptionBase("x")), ErrorCode::Unknown);
}

TEST(Conversions, FailureOfTwoKindsTakesTheFirstCode)
{
    EXPECT_EQ(codeFor(Both<fs::SystemError, fs::AccessDenied>()), ErrorCode::PermissionDenied);
    EXPECT_EQ(codeFor(Both<fs::PathNotFound, fs::SystemError>()), ErrorCode::IOError);
    EXPECT_EQ(codeFor(Both<fs::InvalidArgument, fs::PathNotFound>()), ErrorCode::ResourceNotFound);
    EXPECT_EQ(codeFor(Both<fs::InvalidArgument, fs::AccessDenied>()), ErrorCode::PermissionDenied);
}

std::string otherFailure(std::function<upath(upath const&)> const& canonicalize)
{
    return textOf<std::runtime_error>(
        [&] { static_cast<void>(detail::toCanonicalizedStorageIRI(u"file", upath(u"/given"), canonicalize)); });
}

struct Described : virtual std::exception, virtual boost::exception
{
    char const* what() const noexcept override { return "described"; }
};

struct TagNote;

TEST(Conversions, AnyOtherFailureIsDescribed)
{
    EXPECT_EQ(otherFailure([](upath const&) -> upath { throw std::invalid_argument("odd cause"); }),
              boost::diagnostic_information(std::invalid_argument("odd cause"), true));

    std::string const both = otherFailure(
        [](upath const&) -> upath { throw Described() << boost::error_info<TagNote, std::string>("a note"); });
    EXPECT_NE(both.find("described"), std::string::npos);
    EXPECT_NE(both.find("a note"), std::string::npos);
    EXPECT_NE(both.find("Throw location unknown"), std::string::npos);
}

struct Unnamed : virtual boost::exception
{};

TEST(Conversions, FailureThatOnlyBoostKnowsIsDescribed)
{
    std::string const text = otherFailure(
        [](upath const&) -> upath { throw Unnamed() << boost::error_info<TagNote, std::string>("a note"); });
    EXPECT_NE(text.find("Throw location unknown"), std::string::npos);
    EXPECT_NE(text.find("a note"), std::string::npos);
    EXPECT_EQ(text.find("what"), std::string::npos);
}

TEST(Conversions, FailureThatIsNoExceptionHasNoDescription)
{
    EXPECT_EQ(otherFailure([](upath const&) -> upath { throw 7; }), "No diagnostic information available.");
}

TEST(Conversions, RelativeResultOfCanonicalisationIsDescribed)
{
    std::string const text = otherFailure([](upath const&) { return upath(u"relative"); });
    EXPECT_NE(text.find("File path relative is not absolute."), std::string::npos);
}

TEST(Conversions, RelativePathThatCannotBeCanonicalisedIsRefusedUnchanged)
{
    EXPECT_EQ(
        textOf<std::runtime_error>([] { static_cast<void>(toCanonicalizedStorageIRI(u"file", upath(u"rel/a"))); }),
        "File path rel/a is not absolute.");
}

/// What `toCanonicalizedStorageIRI` reports for a path of this machine.
std::pair<ErrorCode, std::u16string> reported(upath const& path)
{
    try {
        static_cast<void>(toCanonicalizedStorageIRI(u"file", path));
    } catch (Exception const& exception) {
        return {exception.getErrorCode(), exception.getStorageIRI().toString()};
    }
    return {};
}

upath pathOf(std::filesystem::path const& path)
{
    return upath(fl::filesystem::from_native_bytes(path.native()));
}

TEST(Conversions, CanonicalPathHasNoLinksAndNoDots)
{
    tests::support::TemporaryFolder const folder;
    std::filesystem::path const real = std::filesystem::canonical(folder.path());
    std::filesystem::create_directory(folder / "a b");
    std::filesystem::create_symlink("a b", folder / "link");
    folder.write("a b/file", "");
    StorageIRI const location = toCanonicalizedStorageIRI(u"file", pathOf(folder / "link/../link/./file"));
    EXPECT_EQ(location.toUPath(), pathOf(real / "a b/file"));
    EXPECT_EQ(location, toStorageIRI(u"file", pathOf(real / "a b/file")));
}

TEST(Conversions, WhatIsNotThereIsReportedWithThePathAsGiven)
{
    tests::support::TemporaryFolder const folder;
    upath const missing = pathOf(folder / "x/../missing!");
    EXPECT_EQ(reported(missing), std::pair(ErrorCode::ResourceNotFound, toStorageIRI(u"file", missing).toString()));
    folder.write("file", "");
    EXPECT_EQ(reported(pathOf(folder / "file/below")).first, ErrorCode::ResourceNotFound);
}

TEST(Conversions, PathThatCannotBeOneIsAnInvalidLocation)
{
    tests::support::TemporaryFolder const folder;
    std::filesystem::create_symlink("loop", folder / "loop");
    EXPECT_EQ(reported(pathOf(folder / "loop")).first, ErrorCode::InvalidLocation);
    EXPECT_EQ(reported(pathOf(folder / std::string(256, 'x'))).first, ErrorCode::InvalidLocation);
    EXPECT_EQ(reported(upath()), std::pair(ErrorCode::InvalidLocation, std::u16string(u"file://")));
}

} // namespace
} // namespace foundation::storage::provider
