#pragma once

#include <storage/provider/Exception.hpp>
#include <storage/provider/StorageItem.hpp>
#include <tests/support/MinimalProvider.hpp>

#include <gtest/gtest.h>

#include <cstddef>
#include <memory>
#include <string>
#include <utility>

namespace foundation::storage::provider {

/// What a copy moves at once.
constexpr std::size_t chunk = 1048576;

inline InterruptSignal goOn()
{
    return InterruptSignal::Continue;
}

inline InterruptSignal stop()
{
    return InterruptSignal::Abort;
}

inline std::string patterned(std::size_t size)
{
    std::string text(size, '\0');
    for (std::size_t i = 0; i != size; ++i)
        text[i] = static_cast<char>('a' + i % 23);
    return text;
}

/// Two stores, and a file in the first that is to be copied to the second.
struct TwoStores
{
    explicit TwoStores(std::string content)
    {
        first->folders.insert(StorageIRI(u"a://h/"));
        second->folders.insert(StorageIRI(u"b://h/"));
        first->put(source.getLocation(), std::move(content));
    }

    std::shared_ptr<tests::support::MinimalProvider> first = std::make_shared<tests::support::MinimalProvider>();
    std::shared_ptr<tests::support::MinimalProvider> second = std::make_shared<tests::support::MinimalProvider>();
    StorageItem source{first, StorageIRI(u"a://h/source")};
    StorageItem target{second, StorageIRI(u"b://h/target")};
};

/// The code of the failure, which must name the location of `item`.
template <typename Action>
ErrorCode codeOfFailureAt(StorageItem const& item, Action const& action)
{
    try {
        action();
    } catch (Exception const& error) {
        EXPECT_EQ(error.getStorageIRI(), item.getLocation());
        return error.getErrorCode();
    }
    ADD_FAILURE() << "no failure";
    return ErrorCode::Unknown;
}

} // namespace foundation::storage::provider
