#pragma once

#include <storage/conformance/Harness.hpp>
#include <tests/storage/conformance/broken/Misbehaviour.hpp>
#include <tests/storage/conformance/broken/soundHarnesses.hpp>

#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::conformance::broken {

/// A provider with one thing wrong, and the check that has to find it.
struct Defect
{
    std::string check; ///< in the family of its table
    std::string name;  ///< what the provider does, as in "one that …"
    Misbehaviour misbehaviour = {};

    /// A provider that passes the check, and the one of which the broken provider is made: the same unless told.
    Harness (*sound)() = memoryHarness;
    Harness (*base)() = nullptr;

    /// What the broken provider claims wrongly.
    void (*claim)(Capabilities& capabilities) = nullptr;

    /// For what a misbehaviour cannot say.
    std::shared_ptr<IProvider> (*wrap)(std::shared_ptr<IProvider> sound) = nullptr;

    /// Of a copy from one provider to another the source is broken, and not the destination.
    bool asSource = false;
};

Harness brokenHarness(Defect const& defect);

/// The defects of a family of checks.
struct Table
{
    std::string family;
    std::vector<Defect> defects;
};

std::vector<Table> entryDefects();
std::vector<Table> nameDefects();
std::vector<Table> listingDefects();
std::vector<Table> streamDefects();
std::vector<Table> transactionDefects();
std::vector<Table> moveDefects();
std::vector<Table> copyDefects();
std::vector<Table> copyBetweenDefects();
std::vector<Table> otherDefects();

} // namespace foundation::storage::conformance::broken
