#include <boost/date_time/posix_time/time_formatters.hpp>
#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>

#include <algorithm>
#include <set>

namespace foundation::storage::conformance::detail {

using namespace provider;
namespace posix_time = boost::posix_time;

namespace {

using posix_time::ptime;

/// A store keeps its own clock; this is far less than a time zone.
constexpr int clockToleranceInMinutes = 10;

bool isAboutNow(ptime const& time)
{
    posix_time::time_duration const tolerance = posix_time::minutes(clockToleranceInMinutes);
    ptime const now = posix_time::microsec_clock::universal_time();
    return !time.is_special() && time > now - tolerance && time < now + tolerance;
}

bool setsTimes(Harness const& harness)
{
    return harness.capabilities.settableTimes.has_value();
}

bool refusesToSetTimes(Harness const& harness)
{
    return !setsTimes(harness);
}

bool enforcesWritability(Harness const& harness)
{
    return harness.capabilities.settableWritability && harness.capabilities.enforcedWritability;
}

std::vector<ptime> sampleTimes()
{
    using boost::gregorian::date;
    return {ptime(date(1971, 2, 3), posix_time::hours(4)),
            ptime(date(2001, 9, 9), posix_time::time_duration(1, 46, 39) + posix_time::microseconds(123456)),
            ptime(date(2024, 2, 29), posix_time::time_duration(23, 59, 59) + posix_time::microseconds(999999)),
            ptime(date(2099, 12, 31), posix_time::hours(12))};
}

testing::AssertionResult isKept(ptime const& set, ptime const& got, posix_time::time_duration const& step)
{
    posix_time::time_duration const off = got > set ? got - set : set - got;
    if (off < step || off.ticks() == 0)
        return testing::AssertionSuccess();
    return testing::AssertionFailure() << posix_time::to_iso_extended_string(got) << ", set to "
                                       << posix_time::to_iso_extended_string(set);
}

void sizesAreExact(Harness const& harness)
{
    std::vector<std::size_t> const sizes{0, 1, 4095, 4096, 4097, 1048577};
    Tree content;
    for (std::size_t const size : sizes)
        content[u"file" + std::u16string(1, static_cast<char16_t>(u'a' + content.size()))] = someContent(size);
    Scene const scene(harness, content);
    for (auto const& [path, bytes] : content)
        EXPECT_EQ(scene.provider().getFileAttributes(scene.iri(path)).getSize(), bytes.size());
}

void whatWasJustMadeIsDatedNow(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    EXPECT_TRUE(isAboutNow(scene.provider().getFileAttributes(scene.iri(u"file")).getLastModified()));
    EXPECT_TRUE(isAboutNow(scene.provider().getFolderAttributes(scene.iri(u"folder")).getLastModified()));
}

void whatWasJustMadeIsWritable(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    EXPECT_TRUE(scene.provider().getFileAttributes(scene.iri(u"file")).isWritable());
    EXPECT_TRUE(scene.provider().getFolderAttributes(scene.iri(u"folder")).isWritable());
}

void nothingIsWritableInAReadOnlyStore(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    EXPECT_FALSE(scene.provider().getFileAttributes(scene.iri(u"file")).isWritable());
    EXPECT_FALSE(scene.provider().getFolderAttributes(scene.iri(u"folder")).isWritable());
}

void fileAttributesNeedAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file/inner", u"folder"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().getFileAttributes(scene.iri(path)); },
                                  ErrorCode::ResourceNotFound, scene.iri(path)));
}

void folderAttributesNeedAFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file/inner", u"file"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().getFolderAttributes(scene.iri(path)); },
                                  ErrorCode::ResourceNotFound, scene.iri(path)));
}

void extendedAttributesAreThoseClaimed(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    ExtendedAttributes const attributes = scene.provider().getExtendedAttributes(scene.iri(u"file"));
    std::set<std::string> names;
    for (auto const& [name, value] : attributes)
        names.insert(name);
    EXPECT_EQ(names, harness.capabilities.extendedAttributes);
}

void timesAreSet(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}, {u"other", "other"}});
    IProvider const& provider = scene.provider();
    for (ptime const& time : sampleTimes()) {
        provider.setLastModified(scene.iri(u"file"), time);
        provider.setLastModified(scene.iri(u"folder"), time);
        EXPECT_TRUE(isKept(time, provider.getFileAttributes(scene.iri(u"file")).getLastModified(),
                           *harness.capabilities.settableTimes));
        EXPECT_TRUE(isKept(time, provider.getFolderAttributes(scene.iri(u"folder")).getLastModified(),
                           *harness.capabilities.settableTimes));
    }
    EXPECT_TRUE(isAboutNow(provider.getFileAttributes(scene.iri(u"other")).getLastModified()));
    EXPECT_TRUE(scene.holds({{u"file", "content"}, {u"folder/", ""}, {u"other", "other"}}));
}

void writingDatesAFileNow(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    scene.provider().setLastModified(scene.iri(u"file"), sampleTimes().front());
    scene.write(u"file", "more");
    EXPECT_TRUE(isAboutNow(scene.provider().getFileAttributes(scene.iri(u"file")).getLastModified()));
}

void readingDoesNotDateAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    ptime const time = sampleTimes().front();
    scene.provider().setLastModified(scene.iri(u"file"), time);
    EXPECT_EQ(scene.read(u"file"), "content");
    EXPECT_TRUE(isKept(time, scene.provider().getFileAttributes(scene.iri(u"file")).getLastModified(),
                       *harness.capabilities.settableTimes));
}

void settingATimeNeedsAnEntry(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file/inner"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().setLastModified(scene.iri(path), sampleTimes().front()); },
                                  ErrorCode::ResourceNotFound, scene.iri(path)));
}

void settingATimeIsRefused(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    ptime const before = scene.provider().getFileAttributes(scene.iri(u"file")).getLastModified();
    for (auto const* const path : {u"file", u"folder"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().setLastModified(scene.iri(path), sampleTimes().front()); },
                                  ErrorCode::UnsupportedOperation, scene.iri(path)));
    EXPECT_EQ(scene.provider().getFileAttributes(scene.iri(u"file")).getLastModified(), before);
}

void writabilityIsTakenAndGivenBack(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    StorageIRI const file = scene.iri(u"file");
    scene.provider().setWritable(file, false);
    EXPECT_EQ(scene.provider().getFileAttributes(file).isWritable(), !harness.capabilities.enforcedWritability);
    EXPECT_EQ(scene.read(u"file"), "content");
    scene.provider().setWritable(file, true);
    EXPECT_TRUE(scene.provider().getFileAttributes(file).isWritable());
    scene.write(u"file", "more");
    EXPECT_TRUE(scene.holds({{u"file", "more"}}));
}

void anUnwritableFileIsNotOpenedForWriting(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    StorageIRI const file = scene.iri(u"file");
    scene.provider().setWritable(file, false);
    EXPECT_TRUE(
        scene.refuses([&] { scene.provider().openStream(file, {}); }, ErrorCode::PermissionDenied, scene.iri(u"file")));
    scene.provider().setWritable(file, true);
}

void settingWritabilityNeedsAnEntry(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file/inner"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().setWritable(scene.iri(path), false); },
                                  ErrorCode::ResourceNotFound, scene.iri(path)));
}

void settingWritabilityIsRefused(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (auto const* const path : {u"file", u"folder"})
        for (bool const writable : {false, true})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().setWritable(scene.iri(path), writable); },
                                      ErrorCode::UnsupportedOperation, scene.iri(path)));
    EXPECT_TRUE(scene.provider().getFileAttributes(scene.iri(u"file")).isWritable());
}

} // namespace

std::vector<Check> attributesChecks()
{
    return Family("Attributes")
        .forAll({
            CHECK_FUNCTION(sizesAreExact),
            CHECK_FUNCTION(fileAttributesNeedAFile),
            CHECK_FUNCTION(folderAttributesNeedAFolder),
            CHECK_FUNCTION(extendedAttributesAreThoseClaimed),
        })
        .forWritable({CHECK_FUNCTION(whatWasJustMadeIsDatedNow), CHECK_FUNCTION(whatWasJustMadeIsWritable)})
        .when(disclaims(&Capabilities::writable), {CHECK_FUNCTION(nothingIsWritableInAReadOnlyStore)})
        .forWritable(setsTimes, {CHECK_FUNCTION(timesAreSet), CHECK_FUNCTION(writingDatesAFileNow),
                                 CHECK_FUNCTION(readingDoesNotDateAFile), CHECK_FUNCTION(settingATimeNeedsAnEntry)})
        .forWritable(refusesToSetTimes, {CHECK_FUNCTION(settingATimeIsRefused)})
        .forWritable(claims(&Capabilities::settableWritability),
                     {CHECK_FUNCTION(writabilityIsTakenAndGivenBack), CHECK_FUNCTION(settingWritabilityNeedsAnEntry)})
        .forWritable(enforcesWritability, {CHECK_FUNCTION(anUnwritableFileIsNotOpenedForWriting)})
        .forWritable(disclaims(&Capabilities::settableWritability), {CHECK_FUNCTION(settingWritabilityIsRefused)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
