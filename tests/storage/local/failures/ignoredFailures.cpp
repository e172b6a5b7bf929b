#include <tests/storage/local/failures/ignoredFailures.hpp>

#include <tests/storage/local/failures/Scene.hpp>

#include <algorithm>
#include <array>
#include <cerrno>
#include <iterator>
#include <regex>

namespace foundation::tests::support {

namespace {

struct Case
{
    char const* operation; ///< a regular expression for the whole name
    char const* call;      ///< another one
    char const* path;      ///< a regular expression for what the call works on
    bool (*isMeant)(int error);
    Ignored ignored;
    char const* reason;
};

constexpr char const* anything = ".*";
constexpr char const* scratch = R"(.*\.tmp\.bak( \(deleted\))?)";

bool any(int)
{
    return true;
}

bool isForbidden(int error)
{
    return error == EACCES;
}

bool isNoShortage(int error)
{
    return error != EMFILE && error != ENFILE && error != ENOMEM;
}

constexpr Case cases[] = {
    {anything, "fadvise", anything, any, Ignored::WithSameResult, "it is advice; nothing depends on it"},
    {"commit.*|copy.*Atomic.*|move.*AcrossFileSystems", "close", "(to/(new|existing|#[0-9]+ \\(named\\))|from/link)",
     any, Ignored::WithSameResult, "the content is on the disk before it takes the place of the target"},
    {"copy.*WithoutSync.*", "openat", "to/\\.", any, Ignored::WithSameResult,
     "where no file can be made without a name, one with a name does as well"},
    {"copy.*WithoutNewNames", "close", "to/#[0-9]+ \\(deleted\\)", any, Ignored::WithSameResult,
     "a file that is copied to one with a name is not wanted any more"},
    {anything, "ficlone|copy_file_range", anything, any, Ignored::WithSameResult,
     "the content is read and written instead, which tells the end that fails"},
    {"(copy|move).*", "lseek", "from/(sparse|long)|to/#[0-9]+ \\(deleted\\)", any, Ignored::WithSameResult,
     "where nobody knows the holes or the end, all is copied"},
    {"moveScratchFile", "openat2?", scratch, isForbidden, Ignored::WithSameResult,
     "a file that may not be read is synced by whoever may write it"},
    {"(examine|removeAbandoned)ScratchF.*", "openat", ".*/(file|7e9f4b5e.*)", isForbidden, Ignored::WithSameResult,
     "a file that may not be read can be asked about by whoever may write it"},
    {"copyFileOntoItself", "close", "from/second name", any, Ignored::WithSameResult, "nothing was written"},
    {"abort|drop", "close", scratch, any, Ignored::WithSameResult, "the content is not wanted"},
    {"drop", "unlinkat", scratch, any, Ignored::WithSameResult, "a destructor has nobody to tell"},
    {anything, "openat2?", R"(.*/\.?)", isForbidden, Ignored::WithSameResult,
     "a folder that may not be read is synced with its whole file system"},
    {"moveFileOntoItself", "statx|openat2", "from/?", any, Ignored::WithSameResult,
     "not known to be onto itself, the file moves away and back"},
    {"(moveFileOnto|commitReplacing|copyFileAtomicReplacing)Link", "statx|openat2", "from/(link|file)", isForbidden,
     Ignored::WithSameResult, "a link that leads where this user may not look is replaced like a broken one"},
    {"list.*", "statx|openat2", "from/.+", isNoShortage, Ignored::WithOtherResult,
     "an entry is asked about a second time without following it: a link is listed wherever it leads"},
    {"getFileAttributes|getFolderAttributes", "faccessat|openat2", "from/.+", isForbidden, Ignored::WithOtherResult,
     "what may not be written is not writable"},
};

bool matches(std::string const& text, char const* pattern)
{
    return std::regex_match(text, std::regex(pattern));
}

bool applies(Case const& each, std::string const& operation, SystemCall const& call, int error)
{
    auto const isMeant = [&](std::string const& path) { return matches(path, each.path); };
    return each.isMeant(error) && matches(operation, each.operation) && matches(std::string(call.name), each.call) &&
           std::all_of(call.paths.begin(), call.paths.end(), isMeant);
}

} // namespace

Ignored isIgnored(std::string const& operation, SystemCall const& call, int error)
{
    // Nothing is written back when what was only read is closed.
    if (call.name == "close" && !call.mayWrite)
        return Ignored::WithSameResult;
    auto const found = std::find_if(std::begin(cases), std::end(cases),
                                    [&](Case const& each) { return applies(each, operation, call, error); });
    return found == std::end(cases) ? Ignored::No : found->ignored;
}

} // namespace foundation::tests::support
