#pragma once

#include <storage/conformance/Harness.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <storage/provider/StorageItem.hpp>

#include <cstddef>
#include <string>
#include <string_view>

namespace foundation::storage::conformance::detail {

/// Reads a stream to its end; throws `std::runtime_error` for one that answers 0.
std::string readAll(provider::ByteStream& stream);

/// Writes until the stream has taken everything; throws `std::runtime_error` when it no longer takes anything.
void writeAll(provider::ByteStream& stream, std::string_view content);

std::string readFile(provider::StorageItem const& file);

/// Replaces the content of a file in place, or makes the file.
void writeFile(provider::StorageItem const& file, std::string_view content);

void makeTree(provider::StorageItem const& folder, Tree const& content);

/// All that is below a folder, found by listing one folder after the other.
Tree readTree(provider::StorageItem const& folder);

/// `count` bytes of every value, other ones for another `seed`.
std::string someContent(std::size_t count, unsigned seed = 1);

/// What differs between two trees, for the reader of a failed check; empty when nothing does.
std::string difference(Tree const& expected, Tree const& actual);

} // namespace foundation::storage::conformance::detail
