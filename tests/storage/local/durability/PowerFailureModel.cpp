#include <tests/storage/local/durability/PowerFailureModel.hpp>

#include <fcntl.h>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <sys/stat.h>
#include <utility>

namespace foundation::tests::support {

namespace {

namespace fs = std::filesystem;
using Kind = DiskEvent::Kind;

ino_t numberOf(fs::path const& path)
{
    struct stat status
    {};
    if (::lstat(path.c_str(), &status) != 0)
        throw std::runtime_error("nothing at " + path.string());
    return status.st_ino;
}

std::string contentOf(fs::path const& path)
{
    std::ostringstream content;
    content << std::ifstream(path, std::ios::binary).rdbuf();
    return content.str();
}

} // namespace

/// A name that comes to mean a file, or 0 for nothing.
struct PowerFailureModel::Change
{
    ino_t folder;
    std::string name;
    ino_t file;
    std::size_t event; ///< changes of one event happen together while neither is on the disk
    bool isOnDisk = false;
};

struct PowerFailureModel::Disk
{
    std::vector<Change> changes;
    std::map<ino_t, std::string> synced;
    std::map<ino_t, std::string> written; ///< content that differs, or may differ, from what is synced

    void play(DiskEvent const& event, std::size_t number);
    void sync(ino_t what);
    std::vector<std::size_t> openEvents() const;
    void apply(std::set<std::size_t> const& happened, std::map<ino_t, std::map<std::string, ino_t>>& names) const;
};

void PowerFailureModel::Disk::sync(ino_t what)
{
    for (Change& change : changes)
        change.isOnDisk = change.isOnDisk || change.folder == what;
    if (auto const content = written.find(what); content != written.end()) {
        synced[what] = content->second;
        written.erase(content);
    }
}

void PowerFailureModel::Disk::play(DiskEvent const& event, std::size_t number)
{
    switch (event.kind) {
    case Kind::Create:
        changes.push_back({event.folder, event.name, event.file, number});
        break;
    case Kind::Write:
        written[event.file] = event.content;
        break;
    case Kind::Rename:
        changes.push_back({event.folder, event.name, 0, number});
        changes.push_back({event.toFolder, event.toName, event.file, number});
        break;
    case Kind::Link:
        changes.push_back({event.toFolder, event.toName, event.file, number});
        break;
    case Kind::Unlink:
        changes.push_back({event.folder, event.name, 0, number});
        break;
    case Kind::Sync:
        sync(event.file);
        break;
    case Kind::SyncAll:
        for (Change& change : changes)
            change.isOnDisk = true;
        while (!written.empty())
            sync(written.begin()->first);
        break;
    case Kind::CreateNameless:
    case Kind::Note:
        break;
    }
}

PowerFailureModel::PowerFailureModel(std::vector<fs::path> folders)
{
    for (fs::path const& folder : folders) {
        ino_t const number = numberOf(folder);
        folders_[number] = folder.filename();
        names_[number];
        for (fs::directory_entry const& entry : fs::directory_iterator(folder)) {
            ino_t const file = numberOf(entry.path());
            names_[number][entry.path().filename()] = file;
            contents_[file] = entry.is_regular_file() ? contentOf(entry.path()) : "";
            kept_.emplace_back(::open(entry.path().c_str(), O_PATH | O_CLOEXEC | O_NOFOLLOW));
        }
    }
}

namespace {

using Names = std::map<ino_t, std::map<std::string, ino_t>>;
using Contents = std::map<ino_t, std::string>;

/// What a file may hold: one thing where it is synced, else whatever a disk can make of it.
std::vector<std::string> contentsOf(ino_t file, Contents const& synced, Contents const& written)
{
    auto const before = synced.find(file);
    std::string const old = before == synced.end() ? "" : before->second;
    auto const after = written.find(file);
    if (after == written.end())
        return {old};
    return {old, "", PowerFailureModel::rubbish, after->second};
}

} // namespace

/// The events of which a part is not on the disk.
std::vector<std::size_t> PowerFailureModel::Disk::openEvents() const
{
    std::set<std::size_t> open;
    for (Change const& change : changes)
        if (!change.isOnDisk)
            open.insert(change.event);
    if (open.size() > 16)
        throw std::logic_error("too many changes without a sync for all of their outcomes");
    return {open.begin(), open.end()};
}

/// Applies what is on the disk and those open events that happened, in their order.
void PowerFailureModel::Disk::apply(std::set<std::size_t> const& happened, Names& names) const
{
    for (Change const& change : changes) {
        if (!change.isOnDisk && happened.count(change.event) == 0)
            continue;
        if (change.file == 0)
            names[change.folder].erase(change.name);
        else
            names[change.folder][change.name] = change.file;
    }
}

/// One file after the other takes each of its contents, and the others their first: outcomes are judged by name.
void PowerFailureModel::checkContents(Disk const& disk, Names const& names, Check const& check) const
{
    std::set<std::pair<ino_t, std::string>> variants{{0, ""}};
    for (auto const& [folder, entries] : names)
        for (auto const& [name, file] : entries)
            for (std::string const& content : contentsOf(file, disk.synced, disk.written))
                variants.emplace(file, content);
    for (auto const& [varied, content] : variants) {
        Outcome outcome;
        for (auto const& [number, path] : folders_)
            for (auto const& [name, file] : names.at(number))
                outcome[path][name] = file == varied ? content : contentsOf(file, disk.synced, disk.written).front();
        check(outcome);
    }
}

void PowerFailureModel::forEachOutcome(std::vector<DiskEvent> const& events, std::size_t count,
                                       Check const& check) const
{
    Disk disk{.changes = {}, .synced = contents_, .written = {}};
    for (std::size_t i = 0; i < count; ++i)
        disk.play(events.at(i), i);
    std::vector<std::size_t> const open = disk.openEvents();
    for (unsigned chosen = 0; chosen < 1u << open.size(); ++chosen) {
        std::set<std::size_t> happened;
        for (std::size_t i = 0; i < open.size(); ++i)
            if ((chosen >> i & 1u) != 0)
                happened.insert(open[i]);
        Names names = names_;
        disk.apply(happened, names);
        checkContents(disk, names, check);
    }
}

} // namespace foundation::tests::support
