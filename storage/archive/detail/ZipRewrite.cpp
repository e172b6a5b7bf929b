#include <storage/archive/detail/ZipRewrite.hpp>

#include <storage/archive/detail/ZipHandle.hpp>
#include <storage/archive/detail/packedSource.hpp>
#include <storage/archive/detail/zipTimes.hpp>

#include <fl/filesystem/native_name.hpp>

#include <new>
#include <sys/stat.h>
#include <zip.h>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::uint32_t modeOfFiles = S_IFREG | 0644;
constexpr std::uint32_t modeOfFolders = S_IFDIR | 0755;

/// What DOS calls a folder.
constexpr zip_uint32_t folderFlag = 0x10;

constexpr std::size_t longestName = 0xFFFF;

/// The end of a directory, which is all of a zip that holds nothing. libzip makes no such thing.
constexpr char emptyZip[22] = {'P', 'K', '\x05', '\x06'};

/// A zip with wrong entries is read in another way, in which nothing can be copied as it is packed.
ZipArchive const* requireZip(Archive const* archive)
{
    auto const* const zip = dynamic_cast<ZipArchive const*>(archive);
    if (archive != nullptr && zip == nullptr)
        throw Fault(ArchiveException::Reason::Damaged);
    return zip;
}

} // namespace

ZipRewrite::ZipRewrite(PendingTree const& tree, RewriteTarget& target)
    : tree_(tree), target_(target), old_(requireZip(tree.base().get())), error_(std::make_unique<::zip_error>())
{
    zip_error_init(error_.get());
    if (old_ != nullptr)
        reader_.emplace(old_->source());
}

ZipRewrite::~ZipRewrite()
{
    if (zip_ != nullptr)
        zip_discard(zip_);
    zip_error_fini(error_.get());
}

void ZipRewrite::run()
{
    if (tree_.isEmpty(Index::root)) {
        writeEmpty();
        return;
    }
    open();
    if (old_ != nullptr) {
        findOwners();
        removeEntries();
        renameEntries();
        changeEntries();
    }
    addEntries();
    close();
}

void ZipRewrite::writeEmpty()
{
    std::string const comment = commentOfOld();
    std::string end(emptyZip, sizeof emptyZip);
    end[end.size() - 2] = static_cast<char>(comment.size() & 0xFF);
    end[end.size() - 1] = static_cast<char>(comment.size() >> 8);
    end += comment;
    target_.write(end.data(), end.size());
    target_.commit();
}

std::string ZipRewrite::commentOfOld()
{
    if (old_ == nullptr)
        return {};
    open();
    int size = 0;
    char const* const comment = zip_get_archive_comment(zip_, &size, ZIP_FL_ENC_RAW);
    return comment == nullptr ? std::string() : std::string(comment, static_cast<std::size_t>(size));
}

void ZipRewrite::open()
{
    auto const callback = [](void* self, void* data, zip_uint64_t length, zip_source_cmd_t command) {
        return static_cast<zip_int64_t>(serve(self, data, length, command));
    };
    zip_source_t* const stream = zip_source_function_create(callback, this, error_.get());
    if (stream == nullptr)
        throw std::bad_alloc();
    ::zip_error error;
    zip_error_init(&error);
    zip_ = zip_open_from_source(stream, old_ != nullptr ? 0 : ZIP_CREATE | ZIP_TRUNCATE, &error);
    if (zip_ == nullptr) {
        zip_source_free(stream);
        throwFault(error);
    }
    if (old_ != nullptr && static_cast<std::uint64_t>(zip_get_num_entries(zip_, ZIP_FL_UNCHANGED)) != old_->size())
        throw Fault(Reason::Changed);
}

/// All reading and writing happens here, the commit included.
void ZipRewrite::close()
{
    require(zip_close(zip_) == 0);
    zip_ = nullptr;
}

void ZipRewrite::findOwners()
{
    owners_.assign(old_->size(), Node::none);
    for (Id id = 1; id < tree_.index().size() && tree_.isOfBase(id); ++id) {
        Node const& node = tree_.index().at(id);
        if (node.locator != Node::noLocator && tree_.isAlive(id) && isNamedAsItIs(node))
            owners_[ZipArchive::numberOf(node)] = id;
    }
}

/// libzip makes no folder of what is named like a file, nor the reverse; that is added anew.
bool ZipRewrite::isNamedAsItIs(Node const& node) const
{
    bool const isNamedFolder = nameOfEntry(zip_, ZipArchive::numberOf(node)).ends_with(u'/');
    return isNamedFolder == (node.kind == EntryKind::Folder);
}

void ZipRewrite::removeEntries()
{
    for (Number number = 0; number != owners_.size(); ++number) {
        if (owners_[number] == Node::none)
            removeEntry(number);
    }
}

/// libzip does not find an entry that shares its name with another one, unless it gets a name of its own first.
void ZipRewrite::removeEntry(Number number)
{
    if (zip_delete(zip_, number) == 0)
        return;
    bool const isFolder = nameOfEntry(zip_, number).ends_with(u'/');
    require(zip_file_rename(zip_, number, (freeName() + (isFolder ? "/" : "")).c_str(), ZIP_FL_ENC_GUESS) == 0);
    require(zip_delete(zip_, number) == 0);
}

/// By way of names that nobody has, since names may be exchanged.
void ZipRewrite::renameEntries()
{
    std::vector<std::pair<Number, std::string>> renamed;
    for (Number number = 0; number != owners_.size(); ++number) {
        if (owners_[number] == Node::none)
            continue;
        std::string name = nameOf(owners_[number]);
        if (nameOfEntry(zip_, number) == fl::filesystem::from_native_bytes(name))
            continue;
        std::string const temporary = freeName() + (name.ends_with('/') ? "/" : "");
        require(zip_file_rename(zip_, number, temporary.c_str(), ZIP_FL_ENC_GUESS) == 0);
        renamed.emplace_back(number, std::move(name));
    }
    for (auto const& [number, name] : renamed)
        require(zip_file_rename(zip_, number, name.c_str(), ZIP_FL_ENC_GUESS) == 0);
}

void ZipRewrite::changeEntries()
{
    for (Number number = 0; number != owners_.size(); ++number) {
        Id const id = owners_[number];
        if (id == Node::none)
            continue;
        PendingNode const& node = tree_.node(id);
        if (node.packed != nullptr || node.origin != id)
            replaceContent(id, number);
        if (node.isDated)
            setTime(number, tree_.index().at(id).modified);
    }
}

void ZipRewrite::replaceContent(Id id, Number number)
{
    zip_source_t* const source = makeSource(id);
    if (zip_file_replace(zip_, number, source, 0) != 0) {
        zip_source_free(source);
        throwFault(*zip_get_error(zip_));
    }
    require(zip_file_set_encryption(zip_, number, ZIP_EM_NONE, nullptr) == 0);
    setMethod(id, number);
}

void ZipRewrite::addEntries()
{
    for (Id id = 1; id != tree_.index().size(); ++id) {
        if (!tree_.isAlive(id) || !needsEntry(id))
            continue;
        if (tree_.index().at(id).kind == EntryKind::Folder)
            addFolder(id);
        else
            addFile(id);
    }
}

/// Folders that only paths name stay so, as long as there is such a path.
bool ZipRewrite::needsEntry(Id id) const
{
    if (!tree_.isOfBase(id))
        return true;
    Node const& node = tree_.index().at(id);
    if (node.locator == Node::noLocator)
        return tree_.isEmpty(id) || tree_.node(id).isDated;
    return owners_[ZipArchive::numberOf(node)] != id;
}

void ZipRewrite::addFolder(Id id)
{
    zip_int64_t const added = zip_dir_add(zip_, nameOf(id).c_str(), ZIP_FL_ENC_GUESS);
    require(added >= 0);
    Number const number = static_cast<Number>(added);
    Node const& node = tree_.index().at(id);
    if (node.locator == Node::noLocator)
        setMode(number, modeOfFolders);
    else
        copyMode(ZipArchive::numberOf(node), number);
    setTime(number, node.modified);
}

void ZipRewrite::addFile(Id id)
{
    zip_source_t* const source = makeSource(id);
    zip_int64_t const added = zip_file_add(zip_, nameOf(id).c_str(), source, ZIP_FL_ENC_GUESS);
    if (added < 0) {
        zip_source_free(source);
        throwFault(*zip_get_error(zip_));
    }
    Number const number = static_cast<Number>(added);
    setMethod(id, number);
    if (tree_.node(id).packed == nullptr)
        copyMode(ZipArchive::numberOf(old_->index().at(tree_.node(id).origin)), number);
    else
        setMode(number, modeOfFiles);
    setTime(number, tree_.index().at(id).modified);
}

/// New content, or that of another entry of the old archive, in any case as it is packed.
::zip_source* ZipRewrite::makeSource(Id id)
{
    PendingNode const& node = tree_.node(id);
    if (node.packed != nullptr)
        return makePackedSource(zip_, node.packed, failure_);
    Number const origin = ZipArchive::numberOf(old_->index().at(node.origin));
    zip_source_t* const source = zip_source_zip(zip_, zip_, origin, ZIP_FL_UNCHANGED, 0, -1);
    if (source == nullptr)
        throwFault(*zip_get_error(zip_));
    return source;
}

/// As the content is packed, so that libzip takes it as it is.
void ZipRewrite::setMethod(Id id, Number number)
{
    PendingNode const& node = tree_.node(id);
    bool const isStored =
        node.packed != nullptr ? node.packed->isStored() : ZipArchive::isStored(old_->index().at(node.origin));
    require(zip_set_file_compression(zip_, number, isStored ? ZIP_CM_STORE : ZIP_CM_DEFAULT, 0) == 0);
}

void ZipRewrite::setTime(Number number, std::int64_t time)
{
    require(setTimeOfEntry(zip_, number, time));
}

void ZipRewrite::setMode(Number number, std::uint32_t mode)
{
    zip_uint32_t const attributes = (mode << 16) | (S_ISDIR(mode) ? folderFlag : 0);
    require(zip_file_set_external_attributes(zip_, number, 0, ZIP_OPSYS_UNIX, attributes) == 0);
}

void ZipRewrite::copyMode(Number from, Number to)
{
    zip_uint8_t system = 0;
    zip_uint32_t attributes = 0;
    require(zip_file_get_external_attributes(zip_, from, ZIP_FL_UNCHANGED, &system, &attributes) == 0);
    require(zip_file_set_external_attributes(zip_, to, 0, system, attributes) == 0);
}

std::string ZipRewrite::nameOf(Id id) const
{
    std::u16string path = tree_.path(id);
    if (tree_.index().at(id).kind == EntryKind::Folder)
        path += u'/';
    std::string name = fl::filesystem::to_native_bytes(path);
    if (name.size() > longestName)
        throw Fault(Reason::NotWritten, provider::ErrorCode::InvalidLocation);
    return name;
}

/// A name that no entry has.
std::string ZipRewrite::freeName()
{
    for (;;) {
        std::string name = "renamed~" + std::to_string(temporaryNames_++);
        if (zip_name_locate(zip_, name.c_str(), 0) < 0 && zip_name_locate(zip_, (name + '/').c_str(), 0) < 0)
            return name;
    }
}

void ZipRewrite::require(bool succeeded)
{
    if (!succeeded)
        throwFault(*zip_get_error(zip_));
}

void ZipRewrite::throwFault(::zip_error const& error)
{
    if (failure_)
        throw Fault(*std::exchange(failure_, std::nullopt));
    if (error.zip_err == ZIP_ER_MEMORY)
        throw std::bad_alloc();
    throw Fault(error.zip_err == ZIP_ER_INTERNAL || error.zip_err == ZIP_ER_OPNOTSUPP ? Reason::NotWritten
                                                                                      : reasonOf(error));
}

/// No exception may pass through libzip. What failed first is what is told.
std::int64_t ZipRewrite::serve(void* self, void* data, std::uint64_t length, int command)
{
    ZipRewrite& rewrite = *static_cast<ZipRewrite*>(self);
    auto const fail = [&](Fault const& fault) {
        if (!rewrite.failure_)
            rewrite.failure_ = fault;
    };
    try {
        return rewrite.answer(data, length, command);
    } catch (Fault const& fault) {
        fail(fault);
    } catch (std::exception const&) {
        fail(Fault(Reason::StoreFailed));
    }
    zip_error_set(rewrite.error_.get(), ZIP_ER_WRITE, 0);
    return -1;
}

} // namespace foundation::storage::archive::detail
