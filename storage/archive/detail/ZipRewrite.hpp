#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/BufferedReader.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/PendingTree.hpp>
#include <storage/archive/detail/RewriteTarget.hpp>
#include <storage/archive/detail/ZipArchive.hpp>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

struct zip;
struct zip_error;
struct zip_source;

namespace foundation::storage::archive::detail {

/// Writes a tree as a zip, by having libzip change the old one.
///
/// Entries that have not changed keep their bytes, wherever they are moved, and with them everything that is known of
/// them. An entry whose name would lead out of the tree, or is there twice, gets the name that it is shown under.
/// Errors: `Fault`; nothing is committed then.
class FOUNDATION_API ZipRewrite
{
public:
    /// The tree must stay as it is.
    ZipRewrite(PendingTree const& tree, RewriteTarget& target);
    ~ZipRewrite();
    ZipRewrite(ZipRewrite const&) = delete;
    ZipRewrite& operator=(ZipRewrite const&) = delete;

    void run();

private:
    using Id = Index::Id;
    using Number = std::uint64_t;

    static std::int64_t serve(void* self, void* data, std::uint64_t length, int command);

    std::int64_t answer(void* data, std::uint64_t length, int command);
    std::int64_t answerWriting(void* data, std::uint64_t length, int command);

    void open();
    void close();
    void writeEmpty();
    std::string commentOfOld();
    void findOwners();
    void removeEntries();
    void removeEntry(Number number);
    void renameEntries();
    void changeEntries();
    void replaceContent(Id id, Number number);
    void addEntries();
    void addFolder(Id id);
    void addFile(Id id);
    ::zip_source* makeSource(Id id);
    void setMethod(Id id, Number number);
    void setTime(Number number, std::int64_t time);
    void setMode(Number number, std::uint32_t mode);
    void copyMode(Number from, Number to);
    bool needsEntry(Id id) const;
    bool isNamedAsItIs(Node const& node) const;
    std::string nameOf(Id id) const;
    std::string freeName();
    [[noreturn]] void throwFault(::zip_error const& error);
    void require(bool succeeded);

    PendingTree const& tree_;
    RewriteTarget& target_;
    ZipArchive const* const old_; ///< nothing where there was no archive
    std::optional<BufferedReader> reader_;
    std::unique_ptr<::zip_error> error_;
    std::optional<Fault> failure_; ///< of the source, which libzip knows as an error of reading or writing alone
    ::zip* zip_ = nullptr;
    std::vector<Id> owners_; ///< by the number of the entry; nobody where it is to go
    std::uint64_t temporaryNames_ = 0;
};

} // namespace foundation::storage::archive::detail
