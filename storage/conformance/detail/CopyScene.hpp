#pragma once

#include <storage/conformance/FaultInjectingProvider.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/provider/CopyFileOptions.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/TransactionPolicy.hpp>
#include <storage/provider/TransactionStatus.hpp>

#include <array>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace foundation::storage::conformance::detail {

/// The chunk of a copy between items.
inline constexpr std::size_t copyChunk = 1048576;

/// Of the ways to copy between items, one.
struct CopyMode
{
    provider::TransactionPolicy transaction;
    bool interruptible;

    bool isAtomic() const { return transaction == provider::TransactionPolicy::Atomic; }

    /// Options that let the copy go on whenever they are asked.
    provider::CopyFileOptions
    options(provider::ReplacementPolicy policy = provider::ReplacementPolicy::Overwrite) const;
};

inline constexpr std::array<CopyMode, 4> copyModes{{{provider::TransactionPolicy::NonAtomic, false},
                                                    {provider::TransactionPolicy::NonAtomic, true},
                                                    {provider::TransactionPolicy::Atomic, false},
                                                    {provider::TransactionPolicy::Atomic, true}}};

std::ostream& operator<<(std::ostream& stream, CopyMode const& mode);

/// Interrupts when it is asked for the n-th time, and counts how often it is asked.
provider::IProvider::Interrupt interruptAt(int n, int& asked);

/// How a copy has to fail.
struct CopyFailure
{
    provider::ErrorCode code;
    provider::StorageIRI location;
    bool beside = false; ///< at the location or at a scratch file in its folder
};

/// Two places, with a file to copy in one of them; or one place with the file.
class CopyScene
{
public:
    CopyScene(Harness const& source, Harness const& destination, std::string content);
    CopyScene(Harness const& both, std::string content);

    /// Sets the destination back to hold this and nothing else, beside the source where they share a place.
    void prepare(Tree const& before);

    Scene const& source() const { return source_; }
    Scene const& destination() const { return owned_ ? *owned_ : source_; }

    provider::StorageItem from() const { return source().item(u"from"); }
    provider::StorageItem to() const { return destination().item(u"to"); }

    /// The same through a provider with faults.
    provider::StorageItem from(std::shared_ptr<provider::IProvider> const& faulty) const
    {
        return {faulty, source().iri(u"from")};
    }
    provider::StorageItem to(std::shared_ptr<provider::IProvider> const& faulty) const
    {
        return {faulty, destination().iri(u"to")};
    }

    /// Whether everything is as it was prepared.
    testing::AssertionResult isUntouched() const;

    /// Whether the file is copied whole, and nothing else happened.
    testing::AssertionResult isCopied() const { return isCopiedUpTo(content_.size()); }
    testing::AssertionResult isCopiedUpTo(std::size_t size) const;

    /// Whether nothing happened but to the file that is copied to.
    testing::AssertionResult hasNothingElse() const;

    /// Removes the scratch files that a provider left which could no longer remove them.
    void removeScratchFiles() const;

private:
    testing::AssertionResult holds(Tree const& destination) const;

    std::string content_;
    Scene source_;
    std::unique_ptr<Scene> owned_;
    Tree before_;
};

/// The destinations that a copy meets: an old file in its place, and none.
extern std::array<Tree, 2> const copyDestinations;

/// What came of a copy: a status, a failure of the interface, or what else was thrown.
struct CopyOutcome
{
    std::optional<provider::TransactionStatus> status = {};
    std::optional<provider::Exception> failure = {};
    std::string text = {};

    /// Without a failure: whether the copy completed.
    testing::AssertionResult is(std::optional<CopyFailure> const& expected) const;
    testing::AssertionResult is(provider::TransactionStatus expected) const;
};

CopyOutcome copied(provider::StorageItem const& from, provider::StorageItem const& to,
                   provider::CopyFileOptions const& options);

} // namespace foundation::storage::conformance::detail
