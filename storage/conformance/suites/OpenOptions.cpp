#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>

#include <array>
#include <optional>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr std::string_view written = "XY";

/// A file as it is before it is opened: missing, empty, filled.
using Before = std::optional<std::string>;

std::array<Before, 3> const states{Before(), Before(""), Before("abcdef")};

template <typename Function>
void forEachCombination(Function const& function)
{
    for (auto const access : {ByteStreamAccess::WriteOnly, ByteStreamAccess::ReadWrite})
        for (auto const create : {ByteStreamCreate::Create, ByteStreamCreate::NeverCreate})
            for (auto const truncate : {ByteStreamTruncate::TruncateExisting, ByteStreamTruncate::PreserveExisting})
                for (auto const append : {ByteStreamAppend::Append, ByteStreamAppend::Overwrite})
                    for (Before const& before : states) {
                        ByteStreamOpenOptions const options{access, create, truncate, append};
                        SCOPED_TRACE(testing::Message() << options << " on a file that is "
                                                        << (before ? before->empty() ? "empty" : "filled" : "missing"));
                        function(options, before);
                    }
}

Tree treeOf(Before const& before)
{
    Tree tree{{u"other", "other"}};
    if (before)
        tree[u"file"] = *before;
    return tree;
}

bool opens(ByteStreamOpenOptions const& options, Before const& before)
{
    return before || options.create == ByteStreamCreate::Create;
}

std::string afterOpening(ByteStreamOpenOptions const& options, Before const& before)
{
    return before && options.truncate == ByteStreamTruncate::PreserveExisting ? *before : "";
}

std::string afterWriting(ByteStreamOpenOptions const& options, Before const& before)
{
    std::string content = afterOpening(options, before);
    if (options.append == ByteStreamAppend::Append)
        return content.append(written);
    return content.replace(0, std::min(written.size(), content.size()), written);
}

/// Sets the place back to what it was, so that one place serves all combinations.
void prepare(Scene const& scene, Before const& before)
{
    if (before)
        scene.write(u"file", *before);
    else if (scene.provider().fileExists(scene.iri(u"file")))
        scene.provider().removeFile(scene.iri(u"file"));
}

void openingAloneCreatesAndTruncatesAsToldTo(Harness const& harness)
{
    Scene const scene(harness, treeOf({}));
    forEachCombination([&](ByteStreamOpenOptions const& options, Before const& before) {
        if (!opens(options, before))
            return;
        prepare(scene, before);
        scene.provider().openStream(scene.iri(u"file"), options)->close();
        EXPECT_TRUE(scene.holds(treeOf(afterOpening(options, before))));
    });
}

void writingGoesWhereToldTo(Harness const& harness)
{
    Scene const scene(harness, treeOf({}));
    forEachCombination([&](ByteStreamOpenOptions const& options, Before const& before) {
        if (!opens(options, before))
            return;
        prepare(scene, before);
        auto const stream = scene.provider().openStream(scene.iri(u"file"), options);
        writeAll(*stream, written);
        stream->close();
        EXPECT_TRUE(scene.holds(treeOf(afterWriting(options, before))));
    });
}

void whatIsNeverCreatedIsMissing(Harness const& harness)
{
    Scene const scene(harness, treeOf({}));
    forEachCombination([&](ByteStreamOpenOptions const& options, Before const& before) {
        if (opens(options, before))
            return;
        prepare(scene, before);
        EXPECT_TRUE(scene.refuses([&] { scene.provider().openStream(scene.iri(u"file"), options); },
                                  ErrorCode::ResourceNotFound, scene.iri(u"file")));
    });
}

void readingIsAllowedByAccessAlone(Harness const& harness)
{
    Scene const scene(harness, treeOf({}));
    forEachCombination([&](ByteStreamOpenOptions const& options, Before const& before) {
        if (!opens(options, before))
            return;
        prepare(scene, before);
        auto const stream = scene.provider().openStream(scene.iri(u"file"), options);
        writeAll(*stream, written);
        EXPECT_EQ(stream->seek(0, std::ios_base::beg), 0);
        bool const readable = options.access == ByteStreamAccess::ReadWrite;
        EXPECT_EQ(readAll(*stream), readable ? afterWriting(options, before) : "");
        stream->close();
    });
}

void aFolderIsNotOpened(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}, {u"folder/inner", "inner"}});
    forEachCombination([&](ByteStreamOpenOptions const& options, Before const&) {
        EXPECT_TRUE(scene.refuses([&] { scene.provider().openStream(scene.iri(u"folder"), options); },
                                  ErrorCode::ResourceNotFound, scene.iri(u"folder")));
    });
    EXPECT_TRUE(scene.refuses([&] { scene.provider().openReadOnlyStream(scene.iri(u"folder")); },
                              ErrorCode::ResourceNotFound, scene.iri(u"folder")));
}

void openingNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const path : {u"missing/new", u"file/new"}) {
        StorageIRI const iri = scene.iri(path);
        forEachCombination([&](ByteStreamOpenOptions const& options, Before const&) {
            EXPECT_TRUE(
                scene.refuses([&] { scene.provider().openStream(iri, options); }, ErrorCode::ResourceNotFound, iri));
        });
    }
}

} // namespace

std::vector<Check> openOptionsChecks()
{
    return Family("OpenOptions")
        .forWritable({
            CHECK_FUNCTION(openingAloneCreatesAndTruncatesAsToldTo),
            CHECK_FUNCTION(writingGoesWhereToldTo),
            CHECK_FUNCTION(whatIsNeverCreatedIsMissing),
            CHECK_FUNCTION(readingIsAllowedByAccessAlone),
            CHECK_FUNCTION(aFolderIsNotOpened),
            CHECK_FUNCTION(openingNeedsAFolderToStandIn),
        })
        .checks();
}

} // namespace foundation::storage::conformance::detail
