#include <tests/storage/local/RecordedSystemCalls.hpp>

#include <storage/local/detail/scratchName.hpp>

#include <filesystem>
#include <stdexcept>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace foundation::tests::support {

namespace {

using storage::local::detail::isScratchName;
using storage::local::detail::realSystemCalls;
using storage::local::detail::SystemCalls;
using Kind = DiskEvent::Kind;

/// Functions of the table carry nothing with them.
RecordedSystemCalls* recorder = nullptr;

/// Records must not change what the caller finds in `errno`.
template <typename Result, typename Record>
Result after(Result result, Record const& record)
{
    int const error = errno;
    if (result != -1)
        record();
    errno = error;
    return result;
}

/// A name and the folder that holds it, whatever path and folder a call was given.
struct Entry
{
    Entry(int at, std::string const& path) : name(path.substr(path.rfind('/') + 1))
    {
        std::string const parent = path.substr(0, path.size() - name.size());
        struct stat status
        {};
        if (::fstatat(at, parent.empty() ? "" : parent.c_str(), &status, AT_EMPTY_PATH) != 0)
            throw std::logic_error("a call recorded in no folder: " + path);
        folder = status.st_ino;
    }

    std::string name;
    ino_t folder = 0;
};

ino_t numberOf(int at, char const* path)
{
    struct stat status
    {};
    return ::fstatat(at, path, &status, AT_SYMLINK_NOFOLLOW | AT_EMPTY_PATH) == 0 ? status.st_ino : 0;
}

ino_t numberOf(int descriptor)
{
    return numberOf(descriptor, "");
}

/// Whether a call is given a file by its descriptor alone.
bool isNameless(std::string_view path)
{
    return path.empty() || path.starts_with("/proc/self/fd/");
}

/// By a descriptor of its own: the one of the provider may not be readable.
std::string contentOf(int descriptor)
{
    int const reading =
        ::open(("/proc/self/fd/" + std::to_string(descriptor)).c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    std::string content(1 << 20, '\0');
    ssize_t const size = ::pread(reading, content.data(), content.size(), 0);
    ::close(reading);
    if (size < 0 || size == static_cast<ssize_t>(content.size()))
        throw std::logic_error("recorded content cannot be read, or is too big");
    content.resize(static_cast<std::size_t>(size));
    return content;
}

void recordContent(int descriptor)
{
    recorder->add({.kind = Kind::Write, .file = numberOf(descriptor), .content = contentOf(descriptor)});
}

void recordOpened(int at, char const* path, int flags, bool existed, int descriptor)
{
    if ((flags & O_TMPFILE) == O_TMPFILE) {
        recorder->add({.kind = Kind::CreateNameless, .file = numberOf(descriptor)});
        return;
    }
    Entry const entry(at, path);
    if (existed && (flags & O_TRUNC) != 0)
        recordContent(descriptor);
    if (existed || (flags & O_CREAT) == 0)
        return;
    recorder->add({.kind = Kind::Create, .folder = entry.folder, .name = entry.name, .file = numberOf(at, path)});
    recorder->keep(::openat(at, path, O_PATH | O_CLOEXEC));
}

template <typename Open>
int recordOpening(char const* call, int at, char const* path, int flags, Open const& open)
{
    recorder->count(call);
    bool const existed = numberOf(at, path) != 0;
    int const descriptor = open();
    return after(descriptor, [&] { recordOpened(at, path, flags, existed, descriptor); });
}

int openat(int at, char const* path, int flags, mode_t mode)
{
    return recordOpening("openat", at, path, flags, [&] { return realSystemCalls.openat(at, path, flags, mode); });
}

int openat2(int at, char const* path, open_how const* how, std::size_t size)
{
    return recordOpening("openat2", at, path, static_cast<int>(how->flags),
                         [&] { return realSystemCalls.openat2(at, path, how, size); });
}

ssize_t write(int descriptor, void const* data, std::size_t count)
{
    recorder->count("write");
    return after(realSystemCalls.write(descriptor, data, count), [&] { recordContent(descriptor); });
}

ssize_t copyFileRange(int from, off64_t* fromOffset, int to, off64_t* toOffset, std::size_t count, unsigned flags)
{
    recorder->count("copy_file_range");
    return after(realSystemCalls.copy_file_range(from, fromOffset, to, toOffset, count, flags),
                 [&] { recordContent(to); });
}

int syncOne(char const* call, int (*sync)(int), int descriptor)
{
    recorder->count(call);
    return after(sync(descriptor), [&] {
        std::string const path = std::filesystem::read_symlink("/proc/self/fd/" + std::to_string(descriptor));
        recorder->add({.kind = Kind::Sync, .name = Entry(AT_FDCWD, path).name, .file = numberOf(descriptor)});
    });
}

int recordRename(Kind kind, int from, char const* name, int to, char const* newName, unsigned flags)
{
    Entry const entry(from, name);
    Entry const target(to, newName);
    bool const isLink = kind == Kind::Link;
    recorder->count(isLink ? "linkat" : "renameat2");
    int const result = isLink ? realSystemCalls.linkat(from, name, to, newName, static_cast<int>(flags))
                              : realSystemCalls.renameat2(from, name, to, newName, flags);
    return after(result, [&] {
        recorder->add({.kind = kind,
                       .folder = entry.folder,
                       .name = isNameless(name) ? "" : entry.name,
                       .file = numberOf(to, newName),
                       .toFolder = target.folder,
                       .toName = target.name});
    });
}

int unlinkat(int at, char const* path, int flags)
{
    Entry const entry(at, path);
    recorder->count("unlinkat");
    return after(realSystemCalls.unlinkat(at, path, flags),
                 [&] { recorder->add({.kind = Kind::Unlink, .folder = entry.folder, .name = entry.name}); });
}

int mkdirat(int at, char const* path, mode_t mode)
{
    Entry const entry(at, path);
    recorder->count("mkdirat");
    return after(realSystemCalls.mkdirat(at, path, mode), [&] {
        recorder->add({.kind = Kind::Create, .folder = entry.folder, .name = entry.name, .file = numberOf(at, path)});
    });
}

void replaceWriting(SystemCalls& calls)
{
    calls.openat = openat;
    calls.openat2 = openat2;
    calls.write = write;
    calls.copy_file_range = copyFileRange;
    calls.ficlone = [](int to, int from) {
        recorder->count("ficlone");
        return after(realSystemCalls.ficlone(to, from), [&] { recordContent(to); });
    };
    calls.ftruncate = [](int descriptor, off_t length) {
        recorder->count("ftruncate");
        return after(realSystemCalls.ftruncate(descriptor, length), [&] { recordContent(descriptor); });
    };
    calls.fsync = [](int descriptor) { return syncOne("fsync", realSystemCalls.fsync, descriptor); };
    calls.fdatasync = [](int descriptor) { return syncOne("fdatasync", realSystemCalls.fdatasync, descriptor); };
    calls.syncfs = [](int descriptor) {
        recorder->count("syncfs");
        return after(realSystemCalls.syncfs(descriptor), [] { recorder->add({.kind = Kind::SyncAll}); });
    };
}

void replaceNaming(SystemCalls& calls)
{
    calls.renameat2 = [](int from, char const* name, int to, char const* newName, unsigned flags) {
        return recordRename(Kind::Rename, from, name, to, newName, flags);
    };
    calls.linkat = [](int from, char const* name, int to, char const* newName, int flags) {
        return recordRename(Kind::Link, from, name, to, newName, static_cast<unsigned>(flags));
    };
    calls.unlinkat = unlinkat;
    calls.mkdirat = mkdirat;
}

void replaceOthers(SystemCalls& calls)
{
    calls.close = [](int descriptor) {
        recorder->count("close");
        return realSystemCalls.close(descriptor);
    };
    calls.dup = [](int descriptor) {
        recorder->count("dup");
        return realSystemCalls.dup(descriptor);
    };
    calls.statx = [](int at, char const* path, int flags, unsigned mask, struct statx* result) {
        recorder->count("statx");
        return realSystemCalls.statx(at, path, flags, mask, result);
    };
    calls.fchmod = [](int descriptor, mode_t mode) {
        recorder->count("fchmod");
        return realSystemCalls.fchmod(descriptor, mode);
    };
}

std::string shown(std::string const& name)
{
    if (name.empty())
        return "nameless";
    return isScratchName(name) ? "scratch" : name;
}

} // namespace

std::string describe(DiskEvent const& event)
{
    switch (event.kind) {
    case Kind::Create:
    case Kind::CreateNameless:
        return "create " + shown(event.name);
    case Kind::Write:
        return "write \"" + event.content + "\"";
    case Kind::Rename:
        return "rename " + shown(event.name) + " to " + shown(event.toName);
    case Kind::Link:
        return "link " + shown(event.name) + " to " + shown(event.toName);
    case Kind::Unlink:
        return "unlink " + shown(event.name);
    case Kind::Sync:
        return "sync " + shown(event.name);
    case Kind::SyncAll:
        return "sync all";
    case Kind::Note:
        return event.content;
    }
    throw std::logic_error("no kind of event");
}

RecordedSystemCalls::RecordedSystemCalls()
{
    recorder = this;
    SystemCalls& calls = *calls_.operator->();
    replaceWriting(calls);
    replaceNaming(calls);
    replaceOthers(calls);
}

RecordedSystemCalls::~RecordedSystemCalls()
{
    recorder = nullptr;
}

void RecordedSystemCalls::note(std::string const& text)
{
    add({.kind = Kind::Note, .content = text});
}

std::vector<std::string> RecordedSystemCalls::told() const
{
    std::vector<std::string> told;
    for (DiskEvent const& event : events_)
        told.push_back(describe(event));
    return told;
}

void RecordedSystemCalls::clear()
{
    events_.clear();
    names_.clear();
}

} // namespace foundation::tests::support
