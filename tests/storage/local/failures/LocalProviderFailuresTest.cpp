#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/errorCode.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/storage/local/failures/FailingSystemCalls.hpp>
#include <tests/storage/local/failures/ignoredFailures.hpp>
#include <tests/storage/local/failures/operations.hpp>

#include <algorithm>
#include <array>
#include <fl/filesystem/native_name.hpp>
#include <optional>
#include <set>
#include <string.h>
#include <string>
#include <tuple>

// Every operation of the provider, with each of its calls to the operating system failing in turn.

namespace foundation::storage::local {
namespace {

using namespace provider;
using namespace tests::support;

/// How an operation ended.
struct Ending
{
    std::string found;
    std::optional<ErrorCode> code = {};
    std::string place = {}; ///< what the failure names: the path of a location, or the text of a stream's failure
    Tree tree = {};
    std::size_t leakedDescriptors = 0;
    std::vector<SystemCall> calls = {};
};

void runInto(Ending& ending, Operation const& operation, Scene const& scene, FailingSystemCalls::Plan const& plan)
{
    FailingSystemCalls const failing([&](SystemCall const& call) {
        Fate const fate = plan(call);
        return fate.error == 0 && operation.lacks(call) ? Fate::fails(operation.lacking) : fate;
    });
    try {
        ending.found = operation.run(scene);
    } catch (Exception const& error) {
        ending.code = error.getErrorCode();
        ending.place = fl::filesystem::to_native_bytes(error.getStorageIRI().getPath());
    } catch (ByteStreamFailure const& error) {
        ending.code = error.getErrorCode();
        ending.place = error.what();
    }
    ending.calls = failing.calls();
}

class LocalProviderFailures : public testing::TestWithParam<std::tuple<Operation, bool>>
{
protected:
    Operation const& operation() const { return std::get<0>(GetParam()); }
    bool isConfined() const { return std::get<1>(GetParam()); }

    Ending run(FailingSystemCalls::Plan const& plan) const
    {
        Scene const scene(isConfined());
        Ending ending;
        std::size_t const before = openDescriptors();
        runInto(ending, operation(), scene, plan);
        ending.leakedDescriptors = openDescriptors() - before;
        ending.tree = scene.tree();
        withoutPrefix(ending, scene.folder().path().native() + '/');
        return ending;
    }

    Ending runWell() const
    {
        return run([](SystemCall const&) { return Fate::asAlways(); });
    }

    /// Paths from the scene's folder, which has another name each time.
    static void withoutPrefix(Ending& ending, std::string const& prefix)
    {
        auto const strip = [&](std::string& text) {
            if (std::size_t const at = text.find(prefix); at != std::string::npos)
                text.erase(at, prefix.size());
        };
        strip(ending.place);
        for (SystemCall& call : ending.calls)
            std::for_each(call.paths.begin(), call.paths.end(), strip);
    }
};

std::string describe(SystemCall const& call, int error)
{
    std::string text =
        std::string(call.name) + " (call " + std::to_string(call.number) + ", " + strerrorname_np(error) + ")";
    for (std::string const& path : call.paths)
        text += ' ' + path;
    return text;
}

std::string folderOf(std::string const& path)
{
    return path.substr(0, path.find('/'));
}

/// Whether a failure names an end of an operation, or the scratch file beside it, or an entry below or above it where
/// the operation works on those too.
bool names(Operation const& operation, std::string const& place, std::string const& end)
{
    if (place.find(end) != std::string::npos)
        return true;
    if (operation.leaves == Leaves::SomeEntries && end.starts_with(place))
        return true;
    return place.find(folderOf(end) + '/') != std::string::npos && place.find(".tmp.bak") != std::string::npos;
}

/// Whether a failure names the end at which the call works, if that is one alone: the ends lie in different folders.
bool blames(Operation const& operation, SystemCall const& call, std::string const& place, bool isDone)
{
    std::string const from = toBytes(operation.from);
    std::string const to = toBytes(operation.to);
    bool const namesFrom = names(operation, place, from);
    bool const namesTo = !to.empty() && names(operation, place, to);
    if (isDone || operation.blames == Blames::Either || to.empty() || folderOf(from) == folderOf(to))
        return namesFrom || namesTo;
    std::set<std::string> folders;
    for (std::string const& path : call.paths)
        folders.insert(folderOf(path));
    bool const mayBeFrom = folders.contains(folderOf(from)) || !folders.contains(folderOf(to));
    bool const mayBeTo = folders.contains(folderOf(to)) || !folders.contains(folderOf(from));
    return (mayBeFrom && namesFrom) || (mayBeTo && namesTo);
}

/// What a failed removal of a scratch file leaves is no fault of the operation.
Tree withoutScratchOf(SystemCall const& call, Tree tree)
{
    if (call.name == "unlinkat")
        std::erase_if(tree, [&](auto const& entry) {
            return isScratch(entry.first) && std::count(call.paths.begin(), call.paths.end(), entry.first) != 0;
        });
    return tree;
}

std::string textOf(Tree const& tree)
{
    std::string text;
    for (auto const& [path, content] : tree)
        text += path + ": " + content.substr(0, 20) + '\n';
    return text;
}

TEST_P(LocalProviderFailures, AreReportedAndLeaveNothingBehind)
{
    Tree const before = Scene(isConfined()).tree();
    Ending const well = runWell();
    ASSERT_EQ(well.code, std::nullopt) << well.place;
    ASSERT_FALSE(well.calls.empty());
    // What was done, but may not outlive a power failure, names either end.
    auto const isDone = [&](Tree const& tree) { return tree == well.tree && tree != before; };
    for (SystemCall const& planned : well.calls)
        for (int const error : {EIO, ENOSPC, EACCES, EMFILE, ENOMEM}) {
            Ending const ending = run(onlyCall(planned.number, Fate::fails(error)));
            ASSERT_GE(ending.calls.size(), planned.number);
            SystemCall const& call = ending.calls[planned.number - 1];
            SCOPED_TRACE(describe(call, error));
            EXPECT_EQ(ending.leakedDescriptors, 0u);
            Tree const tree = withoutScratchOf(call, ending.tree);
            if (!ending.code) {
                Ignored const ignored = isIgnored(operation().name, call, error);
                EXPECT_TRUE(ignored != Ignored::No) << "nothing was reported";
                EXPECT_TRUE(ending.found == well.found || ignored == Ignored::WithOtherResult) << ending.found;
                EXPECT_EQ(tree, well.tree);
                continue;
            }
            EXPECT_EQ(ending.code, detail::toErrorCode(error)) << ending.place;
            EXPECT_TRUE(blames(operation(), call, ending.place, isDone(tree))) << ending.place;
            EXPECT_TRUE(mayLeave(operation(), tree, before, well.tree)) << textOf(tree);
        }
}

TEST_P(LocalProviderFailures, AreNoneWhenSignalsInterrupt)
{
    Ending const well = runWell();
    for (SystemCall const& call : well.calls) {
        if (!isInterruptible(call.name))
            continue;
        SCOPED_TRACE(describe(call, EINTR));
        Ending const ending = run(onlyCall(call.number, Fate::fails(EINTR)));
        EXPECT_EQ(ending.code, std::nullopt) << ending.place;
        EXPECT_EQ(ending.leakedDescriptors, 0u);
        EXPECT_EQ(ending.found, well.found);
        EXPECT_EQ(ending.tree, well.tree);
    }
}

TEST_P(LocalProviderFailures, AreNoneWhenCallsDoLessThanTheyCould)
{
    Ending const well = runWell();
    Ending const ending = run(everyCall(Fate::short_()));
    EXPECT_EQ(ending.code, std::nullopt) << ending.place;
    EXPECT_EQ(ending.leakedDescriptors, 0u);
    EXPECT_EQ(ending.found, well.found);
    EXPECT_EQ(ending.tree, well.tree);
}

TEST_P(LocalProviderFailures, AreNoneWhenOneCallDoesLessThanItCould)
{
    Ending const well = runWell();
    for (SystemCall const& call : well.calls) {
        constexpr std::array shortened{"read", "write", "copy_file_range", "getdents64"};
        if (std::find(shortened.begin(), shortened.end(), call.name) == shortened.end())
            continue;
        SCOPED_TRACE(describe(call, 0));
        Ending const ending = run(onlyCall(call.number, Fate::short_()));
        EXPECT_EQ(ending.code, std::nullopt) << ending.place;
        EXPECT_EQ(ending.leakedDescriptors, 0u);
        EXPECT_EQ(ending.found, well.found);
        EXPECT_EQ(ending.tree, well.tree);
    }
}

INSTANTIATE_TEST_SUITE_P(Of, LocalProviderFailures,
                         testing::Combine(testing::ValuesIn(allOperations()), testing::Bool()), [](auto const& given) {
                             return std::get<0>(given.param).name + (std::get<1>(given.param) ? "Confined" : "");
                         });

} // namespace
} // namespace foundation::storage::local
