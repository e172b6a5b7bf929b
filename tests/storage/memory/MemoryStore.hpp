#pragma once

#include <fl/i18n/utf8.hpp>
#include <storage/memory/MemoryProvider.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <boost/date_time/posix_time/posix_time.hpp>

#include <string>
#include <vector>

namespace foundation::storage::memory {

/// A location in the store of the tests.
inline provider::StorageIRI at(std::u16string const& path)
{
    return provider::StorageIRI(provider::StorageIRI(u"mem://test/"), path);
}

constexpr provider::ByteStreamOpenOptions rewrite{
    provider::ByteStreamAccess::ReadWrite, provider::ByteStreamCreate::Create,
    provider::ByteStreamTruncate::TruncateExisting, provider::ByteStreamAppend::Overwrite};
constexpr provider::ByteStreamOpenOptions update{
    provider::ByteStreamAccess::ReadWrite, provider::ByteStreamCreate::NeverCreate,
    provider::ByteStreamTruncate::PreserveExisting, provider::ByteStreamAppend::Overwrite};
constexpr provider::ByteStreamOpenOptions append{
    provider::ByteStreamAccess::ReadWrite, provider::ByteStreamCreate::Create,
    provider::ByteStreamTruncate::PreserveExisting, provider::ByteStreamAppend::Append};

inline void writeAll(provider::ByteStream& stream, std::string const& content)
{
    long const size = static_cast<long>(content.size());
    ASSERT_EQ(stream.write(content.data(), size), size);
}

inline std::string readAll(provider::ByteStream& stream)
{
    std::string content;
    char buffer[4096];
    for (long count; (count = stream.read(buffer, sizeof buffer)) != -1;)
        content.append(buffer, static_cast<std::size_t>(count));
    return content;
}

/// A store with a few helpers, at `at(u"/")`.
struct MemoryStore : MemoryProvider
{
    MemoryStore() : MemoryProvider(at(u"/")) {}

    void write(std::u16string const& path, std::string const& content) const
    {
        auto const stream = openStream(at(path), rewrite);
        writeAll(*stream, content);
        stream->close();
    }

    std::string read(std::u16string const& path) const { return readAll(*openReadOnlyStream(at(path))); }

    void limit(std::string const& bytes)
    {
        boost::property_tree::ptree tree;
        tree.put("limit", bytes);
        configure(tree);
    }
};

/// The names of a listing in its order, with a slash behind those of folders.
inline std::vector<std::u16string> namesOf(provider::IFolderEntryIterator& listing)
{
    std::vector<std::u16string> names;
    for (provider::FolderEntry const& entry : provider::entries(listing))
        names.push_back(entry.getName() + (entry.isFile() ? u"" : u"/"));
    return names;
}

using Names = std::vector<std::u16string>;
using tests::support::failure;
using tests::support::failureOf;

} // namespace foundation::storage::memory
