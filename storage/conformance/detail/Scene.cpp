#include <storage/conformance/detail/Scene.hpp>

#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/describe.hpp>
#include <storage/provider/Exception.hpp>

#include <algorithm>
#include <exception>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

Place makePlace(Harness const& harness, Tree const& content)
{
    if (!harness.capabilities.writable)
        return harness.makeFilledPlace(content);
    Place place = harness.makePlace();
    makeTree(StorageItem(place.provider, place.folder), content);
    return place;
}

bool isScratch(std::u16string const& path)
{
    return path.ends_with(u".tmp.bak");
}

} // namespace

Scene::Scene(Harness const& harness, Tree const& content) : harness_(harness), place_(makePlace(harness, content)) {}

Scene::~Scene()
{
    try {
        Tree const left = tree();
        EXPECT_TRUE(std::none_of(left.begin(), left.end(), [](auto const& entry) { return isScratch(entry.first); }))
            << "A scratch file is left:" << difference({}, left);
    } catch (...) {
        ADD_FAILURE() << "What the check left cannot be listed and read: " << describe(std::current_exception());
    }
    place_.provider.reset();
}

void Scene::write(std::u16string const& path, std::string_view content) const
{
    writeFile(item(path), content);
}

std::string Scene::read(std::u16string const& path) const
{
    return readFile(item(path));
}

Tree Scene::tree() const
{
    return readTree(item());
}

testing::AssertionResult Scene::holds(Tree const& expected) const
{
    std::string const differences = difference(expected, tree());
    if (differences.empty())
        return testing::AssertionSuccess();
    return testing::AssertionFailure() << "the store does not hold what it should:" << differences;
}

testing::AssertionResult Scene::refuses(std::function<void()> const& action, ErrorCode code,
                                        StorageIRI const& location) const
{
    Tree const before = tree();
    testing::AssertionResult const failed = fails(action, code, location);
    return failed ? holds(before) : failed;
}

testing::AssertionResult fails(std::function<void()> const& action, ErrorCode code, StorageIRI const& location)
{
    std::string const expected = describe(std::make_exception_ptr(Exception(code, location)));
    try {
        action();
    } catch (Exception const& error) {
        if (error.getErrorCode() == code && error.getStorageIRI() == location)
            return testing::AssertionSuccess();
        return testing::AssertionFailure() << describe(std::current_exception()) << ", expected " << expected;
    } catch (...) {
        return testing::AssertionFailure() << describe(std::current_exception()) << ", expected " << expected;
    }
    return testing::AssertionFailure() << "no failure, expected " << expected;
}

} // namespace foundation::storage::conformance::detail
