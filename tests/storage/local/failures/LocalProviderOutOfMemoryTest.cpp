#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/failures/operations.hpp>
#include <tests/support/allocations.hpp>

#include <new>

// Every operation of the provider, with each of its allocations failing in turn.

namespace foundation::storage::local {
namespace {

using namespace tests::support;

class LocalProviderOutOfMemory : public testing::TestWithParam<Operation>
{
protected:
    enum class Ending
    {
        Failed,
        DoneAllTheSame,
        NothingLeftToFail
    };

    /// What comes of the operation when the allocation of this number fails.
    static Ending run(Scene const& scene, std::size_t number)
    {
        std::size_t const before = allocations();
        try {
            FailingAllocation const failing(number);
            GetParam().run(scene);
        } catch (std::bad_alloc const&) {
            return Ending::Failed;
        }
        return allocations() - before < number ? Ending::NothingLeftToFail : Ending::DoneAllTheSame;
    }
};

TEST_P(LocalProviderOutOfMemory, LeavesNothingBehind)
{
    Scene const untouched(false);
    Scene const changed(false);
    GetParam().run(changed);
    Tree const before = untouched.tree();
    Tree const after = changed.tree();
    std::size_t const descriptors = openDescriptors();
    Ending ending = Ending::Failed;
    std::size_t number = 0;
    while (ending != Ending::NothingLeftToFail) {
        Scene const scene(false);
        ending = run(scene, ++number);
        SCOPED_TRACE(number);
        EXPECT_EQ(openDescriptors(), descriptors);
        EXPECT_TRUE(ending == Ending::Failed ? mayLeave(GetParam(), scene.tree(), before, after)
                                             : scene.tree() == after);
    }
    EXPECT_GT(number, 1u);
}

INSTANTIATE_TEST_SUITE_P(Of, LocalProviderOutOfMemory, testing::ValuesIn(allOperations()),
                         [](auto const& given) { return given.param.name; });

} // namespace
} // namespace foundation::storage::local
