#include <fl/filesystem/detail/system_error.hpp>

#include <gtest/gtest.h>

#include <cerrno>
#include <string>
#include <vector>

#include <fl/filesystem/exceptions.hpp>

namespace fl::filesystem::detail {
namespace {

template <class Expected>
void expectThrownFor(std::vector<int> const& errors)
{
    for (int const error : errors) {
        try {
            throw_system_error(error, "message");
        } catch (Expected const& thrown) {
            EXPECT_STREQ(thrown.what(), "message");
        } catch (FsysExceptionBase const&) {
            ADD_FAILURE() << "another kind for " << error;
        }
    }
}

TEST(SystemError, RightsThatDoNotSuffice)
{
    expectThrownFor<AccessDenied>({EACCES, EPERM});
}

TEST(SystemError, NothingThere)
{
    expectThrownFor<PathNotFound>({ENOENT, ENOTDIR});
}

TEST(SystemError, PathsThatCannotBe)
{
    expectThrownFor<InvalidArgument>({EINVAL, ENAMETOOLONG, ELOOP});
}

TEST(SystemError, EverythingElse)
{
    expectThrownFor<filesystem::SystemError>({0, -1, EIO, ENOMEM, EMFILE, EROFS, ESTALE, EOVERFLOW, 100000});
}

} // namespace
} // namespace fl::filesystem::detail
