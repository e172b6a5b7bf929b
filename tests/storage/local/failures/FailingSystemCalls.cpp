#include <tests/storage/local/failures/FailingSystemCalls.hpp>

#include <algorithm>
#include <array>
#include <climits>
#include <fcntl.h>
#include <sys/stat.h>
#include <tuple>
#include <type_traits>
#include <unistd.h>
#include <utility>

namespace foundation::tests::support {

using storage::local::detail::realSystemCalls;
using storage::local::detail::SystemCalls;

namespace {

FailingSystemCalls* inUse = nullptr;

constexpr std::size_t shortSize = 97;

/// The longest record of `getdents64` fits, and little more.
constexpr std::size_t sizeOfOneEntry = 288;

std::string linkTarget(std::string const& link)
{
    std::array<char, PATH_MAX> target;
    ssize_t const size = ::readlink(link.c_str(), target.data(), target.size());
    return size == -1 ? std::string() : std::string(target.data(), static_cast<std::size_t>(size));
}

/// A file that was made without a name is shown as deleted even when it has got one: then it is called named.
std::string pathOf(int descriptor)
{
    std::string path = linkTarget("/proc/self/fd/" + std::to_string(descriptor));
    constexpr std::string_view deleted = " (deleted)";
    struct stat status
    {};
    if (path.ends_with(deleted) && ::fstat(descriptor, &status) == 0 && status.st_nlink > 0)
        path.replace(path.size() - deleted.size(), deleted.size(), " (named)");
    return path;
}

std::string pathOf(int folder, char const* path)
{
    if (path == nullptr || *path == '\0')
        return pathOf(folder);
    if (std::string_view(path).starts_with("/proc/self/fd/"))
        return linkTarget(path);
    return *path == '/' ? path : pathOf(folder) + '/' + path;
}

/// Finds what a call works on by the types of its arguments: a path follows the folder from which it starts; without a
/// path, the first descriptor is meant.
class Subjects
{
public:
    explicit Subjects(SystemCall& call) : call_(call) {}

    void add(int number)
    {
        if (isFirst_ && number >= 0) {
            descriptor_ = number;
            int const flags = ::fcntl(number, F_GETFL);
            call_.mayWrite = flags != -1 && (flags & O_PATH) == 0 && (flags & O_ACCMODE) != O_RDONLY;
        }
        folder_ = number;
        isFirst_ = false;
    }

    void add(char const* path)
    {
        call_.paths.push_back(pathOf(folder_, path));
        isFirst_ = false;
    }

    template <typename Other>
    void add(Other const&)
    {
        isFirst_ = false;
    }

    void finish()
    {
        if (call_.paths.empty() && descriptor_ != -1)
            call_.paths.push_back(pathOf(descriptor_));
    }

private:
    SystemCall& call_;
    bool isFirst_ = true;
    int descriptor_ = -1;
    int folder_ = AT_FDCWD;
};

template <auto>
struct Tag
{};

template <auto Member, auto... Others>
constexpr bool isOneOf = (std::is_same_v<Tag<Member>, Tag<Others>> || ...);

template <auto Member, typename Arguments>
void shorten(Arguments& arguments)
{
    auto const limit = [](auto& size, std::size_t most) { size = std::min(size, most); };
    if constexpr (isOneOf<Member, &SystemCalls::read, &SystemCalls::write>)
        limit(std::get<2>(arguments), shortSize);
    else if constexpr (isOneOf<Member, &SystemCalls::copy_file_range>)
        limit(std::get<4>(arguments), shortSize);
    else if constexpr (isOneOf<Member, &SystemCalls::getdents64>)
        limit(std::get<2>(arguments), sizeOfOneEntry);
}

template <auto Member>
struct Intercepted;

template <typename Result, typename... Arguments, Result (*SystemCalls::*Member)(Arguments...)>
struct Intercepted<Member>
{
    static inline std::string_view name;

    static void putInto(SystemCalls& table, std::string_view itsName)
    {
        name = itsName;
        table.*Member = &call;
    }

    static Result call(Arguments... arguments)
    {
        SystemCall about{.name = name};
        Subjects subjects(about);
        (subjects.add(arguments), ...);
        subjects.finish();
        std::tuple<Arguments...> given(arguments...);
        if constexpr (isOneOf<Member, &SystemCalls::copy_file_range>)
            about.paths.push_back(pathOf(std::get<2>(given)));
        else if constexpr (isOneOf<Member, &SystemCalls::ficlone>)
            about.paths.push_back(pathOf(std::get<1>(given)));
        Fate const fate = FailingSystemCalls::decide(std::move(about));
        if (fate.error != 0) {
            if constexpr (isOneOf<Member, &SystemCalls::close>)
                std::apply(realSystemCalls.*Member, given);
            errno = fate.error;
            return -1;
        }
        if (fate.isShort)
            shorten<Member>(given);
        return std::apply(realSystemCalls.*Member, given);
    }
};

struct Entry
{
    std::string_view name;
    void (*putInto)(SystemCalls& table, std::string_view name);
};

constexpr std::array entries{
    Entry{"openat", &Intercepted<&SystemCalls::openat>::putInto},
    Entry{"openat2", &Intercepted<&SystemCalls::openat2>::putInto},
    Entry{"close", &Intercepted<&SystemCalls::close>::putInto},
    Entry{"dup", &Intercepted<&SystemCalls::dup>::putInto},
    Entry{"fcntl", &Intercepted<&SystemCalls::fcntl>::putInto},
    Entry{"read", &Intercepted<&SystemCalls::read>::putInto},
    Entry{"write", &Intercepted<&SystemCalls::write>::putInto},
    Entry{"lseek", &Intercepted<&SystemCalls::lseek>::putInto},
    Entry{"fadvise", &Intercepted<&SystemCalls::fadvise>::putInto},
    Entry{"ftruncate", &Intercepted<&SystemCalls::ftruncate>::putInto},
    Entry{"fallocate", &Intercepted<&SystemCalls::fallocate>::putInto},
    Entry{"copy_file_range", &Intercepted<&SystemCalls::copy_file_range>::putInto},
    Entry{"ficlone", &Intercepted<&SystemCalls::ficlone>::putInto},
    Entry{"fsync", &Intercepted<&SystemCalls::fsync>::putInto},
    Entry{"fdatasync", &Intercepted<&SystemCalls::fdatasync>::putInto},
    Entry{"syncfs", &Intercepted<&SystemCalls::syncfs>::putInto},
    Entry{"getdents64", &Intercepted<&SystemCalls::getdents64>::putInto},
    Entry{"statx", &Intercepted<&SystemCalls::statx>::putInto},
    Entry{"faccessat", &Intercepted<&SystemCalls::faccessat>::putInto},
    Entry{"fchmod", &Intercepted<&SystemCalls::fchmod>::putInto},
    Entry{"fchmodat", &Intercepted<&SystemCalls::fchmodat>::putInto},
    Entry{"fchownat", &Intercepted<&SystemCalls::fchownat>::putInto},
    Entry{"utimensat", &Intercepted<&SystemCalls::utimensat>::putInto},
    Entry{"readlinkat", &Intercepted<&SystemCalls::readlinkat>::putInto},
    Entry{"listxattr", &Intercepted<&SystemCalls::listxattr>::putInto},
    Entry{"getxattr", &Intercepted<&SystemCalls::getxattr>::putInto},
    Entry{"flistxattr", &Intercepted<&SystemCalls::flistxattr>::putInto},
    Entry{"fgetxattr", &Intercepted<&SystemCalls::fgetxattr>::putInto},
    Entry{"fsetxattr", &Intercepted<&SystemCalls::fsetxattr>::putInto},
    Entry{"mkdirat", &Intercepted<&SystemCalls::mkdirat>::putInto},
    Entry{"unlinkat", &Intercepted<&SystemCalls::unlinkat>::putInto},
    Entry{"linkat", &Intercepted<&SystemCalls::linkat>::putInto},
    Entry{"symlinkat", &Intercepted<&SystemCalls::symlinkat>::putInto},
    Entry{"renameat2", &Intercepted<&SystemCalls::renameat2>::putInto},
    Entry{"inotify_init1", &Intercepted<&SystemCalls::inotify_init1>::putInto},
    Entry{"inotify_add_watch", &Intercepted<&SystemCalls::inotify_add_watch>::putInto},
    Entry{"inotify_rm_watch", &Intercepted<&SystemCalls::inotify_rm_watch>::putInto},
    Entry{"eventfd", &Intercepted<&SystemCalls::eventfd>::putInto},
    Entry{"poll", &Intercepted<&SystemCalls::poll>::putInto},
};

static_assert(entries.size() * sizeof(void (*)()) == sizeof(SystemCalls),
              "every member of the table has to stand here");

} // namespace

FailingSystemCalls::FailingSystemCalls(Plan plan) : plan_(std::move(plan))
{
    for (Entry const& entry : entries)
        entry.putInto(*replaced_.operator->(), entry.name);
    inUse = this;
}

FailingSystemCalls::~FailingSystemCalls()
{
    inUse = nullptr;
}

Fate FailingSystemCalls::decide(SystemCall call)
{
    if (inUse == nullptr || std::this_thread::get_id() != inUse->thread_)
        return Fate::asAlways();
    auto& calls = inUse->calls_;
    call.number = calls.size() + 1;
    call.numberOfKind = ++inUse->countOfKind_[call.name];
    calls.push_back(std::move(call));
    return inUse->plan_(calls.back());
}

FailingSystemCalls::Plan onlyCall(std::size_t number, Fate fate)
{
    return [=](SystemCall const& call) { return call.number == number ? fate : Fate::asAlways(); };
}

FailingSystemCalls::Plan everyCall(Fate fate)
{
    return [=](SystemCall const&) { return fate; };
}

bool isInterruptible(std::string_view name)
{
    constexpr std::array never{"lseek", "fadvise", "inotify_init1", "inotify_rm_watch", "eventfd"};
    return std::find(never.begin(), never.end(), name) == never.end();
}

} // namespace foundation::tests::support
