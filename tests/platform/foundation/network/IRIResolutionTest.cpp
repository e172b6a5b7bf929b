#include <foundation/network/IRI.hpp>

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include <tests/support/generators.hpp>

namespace foundation::network {
namespace {

using iri::Encoding;
using tests::support::shown;
using tests::support::Text;

using Rows = std::vector<std::pair<std::u16string, std::u16string>>;

std::u16string plainPath(IRI const& iri)
{
    return iri.getPath(Encoding::Decoded);
}

void expectResolved(std::u16string const& base, Rows const& rows)
{
    for (auto const& [reference, target] : rows)
        EXPECT_EQ(IRI(reference).resolveAgainst(IRI(base)).toString(), target) << shown(reference);
}

// RFC 3986, section 5.4.1.
TEST(IRIResolution, NormalExamples)
{
    expectResolved(u"http://a/b/c/d;p?q", {
                                              {u"g:h", u"g:h"},
                                              {u"g", u"http://a/b/c/g"},
                                              {u"./g", u"http://a/b/c/g"},
                                              {u"g/", u"http://a/b/c/g/"},
                                              {u"/g", u"http://a/g"},
                                              {u"//g", u"http://g"},
                                              {u"?y", u"http://a/b/c/d;p?y"},
                                              {u"g?y", u"http://a/b/c/g?y"},
                                              {u"#s", u"http://a/b/c/d;p?q#s"},
                                              {u"g#s", u"http://a/b/c/g#s"},
                                              {u"g?y#s", u"http://a/b/c/g?y#s"},
                                              {u";x", u"http://a/b/c/;x"},
                                              {u"g;x", u"http://a/b/c/g;x"},
                                              {u"g;x?y#s", u"http://a/b/c/g;x?y#s"},
                                              {u"", u"http://a/b/c/d;p?q"},
                                              {u".", u"http://a/b/c/"},
                                              {u"./", u"http://a/b/c/"},
                                              {u"..", u"http://a/b/"},
                                              {u"../", u"http://a/b/"},
                                              {u"../g", u"http://a/b/g"},
                                              {u"../..", u"http://a/"},
                                              {u"../../", u"http://a/"},
                                              {u"../../g", u"http://a/g"},
                                          });
}

// RFC 3986, section 5.4.2, read strictly.
TEST(IRIResolution, AbnormalExamples)
{
    expectResolved(u"http://a/b/c/d;p?q", {
                                              {u"../../../g", u"http://a/g"},
                                              {u"../../../../g", u"http://a/g"},
                                              {u"/./g", u"http://a/g"},
                                              {u"/../g", u"http://a/g"},
                                              {u"g.", u"http://a/b/c/g."},
                                              {u".g", u"http://a/b/c/.g"},
                                              {u"g..", u"http://a/b/c/g.."},
                                              {u"..g", u"http://a/b/c/..g"},
                                              {u"./../g", u"http://a/b/g"},
                                              {u"./g/.", u"http://a/b/c/g/"},
                                              {u"g/./h", u"http://a/b/c/g/h"},
                                              {u"g/../h", u"http://a/b/c/h"},
                                              {u"g;x=1/./y", u"http://a/b/c/g;x=1/y"},
                                              {u"g;x=1/../y", u"http://a/b/c/y"},
                                              {u"g?y/./x", u"http://a/b/c/g?y/./x"},
                                              {u"g?y/../x", u"http://a/b/c/g?y/../x"},
                                              {u"g#s/./x", u"http://a/b/c/g#s/./x"},
                                              {u"g#s/../x", u"http://a/b/c/g#s/../x"},
                                              {u"http:g", u"http:g"},
                                          });
}

// RFC 3986, section 5.2.4.
TEST(IRIResolution, DotSegmentExamples)
{
    expectResolved(u"http://h/", {{u"/a/b/c/./../../g", u"http://h/a/g"}});
    expectResolved(u"s:x", {{u"s:mid/content=5/../6", u"s:mid/6"}});
}

TEST(IRIResolution, RemovesDotSegmentsAtTheEnds)
{
    expectResolved(u"s://h/x/y", {
                                     {u"/a/./b/../c", u"s://h/a/c"},
                                     {u"/..", u"s://h/"},
                                     {u"/.", u"s://h/"},
                                     {u"/a/..", u"s://h/"},
                                     {u"/a/.", u"s://h/a/"},
                                     {u"/a//../b", u"s://h/a/b"},
                                     {u"/a/...", u"s://h/a/..."},
                                     {u"/%2E%2E/a", u"s://h/%2E%2E/a"},
                                     {u"t://i/a/../b", u"t://i/b"},
                                     {u"//i/a/../b", u"s://i/b"},
                                     {u"s:../a", u"s:a"},
                                     {u"s:.", u"s:"},
                                     {u"s:..", u"s:"},
                                 });
}

TEST(IRIResolution, MergesWithABaseThatHasNoPath)
{
    expectResolved(u"s://h", {{u"a", u"s://h/a"}, {u"", u"s://h"}, {u"?q", u"s://h?q"}});
    expectResolved(u"s:", {{u"a", u"s:a"}});
    expectResolved(u"", {{u"a/../b", u"/b"}, {u"a", u"a"}, {u"s://h/./a", u"s://h/a"}});
}

TEST(IRIResolution, NeverTurnsAPathIntoAnAuthority)
{
    expectResolved(u"s:/a", {{u"/.//b", u"s:/%2Fb"}});
    expectResolved(u"s:a", {{u"..//b", u"s:/b"}});
}

TEST(IRIResolution, RelativeReferencesLeadFromTheFolderOfTheBase)
{
    struct Row
    {
        std::u16string target;
        std::u16string base;
        std::u16string reference;
    };
    for (auto const& [target, base, reference] : std::vector<Row>{
             {u"s://h/a/b", u"s://h/a/c", u"b"},
             {u"s://h/a/b", u"s://h/a/", u"b"},
             {u"s://h/a/b", u"s://h/a", u"a/b"},
             {u"s://h/a", u"s://h/b/c/d", u"../../a"},
             {u"s://h/a/", u"s://h/a/b", u"./"},
             {u"s://h/a", u"s://h/a/b", u"../a"},
             {u"s://h/a", u"s://h/a", u"a"},
             {u"s://h/a/", u"s://h/a/", u""},
             {u"s://h/a/?q", u"s://h/a/", u"?q"},
             {u"s://h/a/", u"s://h/a/?q", u"./"},
             {u"s://h/a#f", u"s://h/", u"a#f"},
             {u"s://h/a/b:c", u"s://h/a/", u"b%3Ac"},
             {u"s://h/a//b", u"s://h/a/", u".//b"},
             {u"s://h/a//b", u"s://h/a//c", u"b"},
             {u"s://h/a/b", u"s://h/a//", u"../b"},
             {u"s://h/", u"s://h/a/b/", u"../../"},
             {u"s://h", u"s://h/a", u"//h"},
             {u"s://h/a", u"s://h", u"a"},
             {u"s://h/a/b", u"s://h/a/./x/../", u"b"},
             {u"s://h/a/./b", u"s://h/a/", u"%2E/b"},
             {u"s://h/a/../b", u"s://h/a/", u"%2E%2E/b"},
             {u"s://h/a/b", u"t://h/a/", u"s://h/a/b"},
             {u"s://h/a/b", u"s://i/a/", u"s://h/a/b"},
             {u"s:/a/b", u"s:///a/", u"s:/a/b"},
             {u"s:a/b", u"s:a/c", u"s:a/b"},
             {u"/a/b", u"/a/c/", u"../b"},
             {u"/a/b", u"", u"/a/b"},
             {u"/%2Fa/b", u"/%2Fc/", u"../%2Fa/b"},
         })
    {
        IRI const relative = IRI(target).makeRelativeTo(IRI(base));
        EXPECT_EQ(relative.toString(), reference) << shown(target) << " from " << shown(base);
        EXPECT_EQ(plainPath(relative.resolveAgainst(IRI(base))), plainPath(IRI(target)));
    }
}

/// An absolute path as it is written, at most a few segments deep, of few different segments.
rc::Gen<Text> writtenPath()
{
    auto const common =
        rc::gen::map(rc::gen::element<std::u16string>(u"", u"a", u"b", u"a:b", u".", u"..", u"%2E", u"%2F"),
                     [](std::u16string const& segment) { return Text{segment}; });
    auto const any =
        rc::gen::map(tests::support::fileName(), [](Text const& name) { return Text{iri::encodePath(name.value)}; });
    auto const segments = rc::gen::scale(
        0.08, rc::gen::container<std::vector<Text>>(rc::gen::weightedOneOf<Text>({{5, common}, {1, any}})));
    return rc::gen::map(segments, [](std::vector<Text> const& all) {
        std::u16string path = all.empty() ? u"/" : u"";
        for (Text const& segment : all)
            path.append(u"/").append(segment.value);
        return Text{path};
    });
}

void checkInverse(IRI const& target, IRI const& base)
{
    IRI const relative = target.makeRelativeTo(base);
    IRI const reached = relative.resolveAgainst(base);
    RC_LOG() << shown(relative.toString()) << " leads to " << shown(reached.toString()) << '\n';
    RC_ASSERT(shown(plainPath(reached)) == shown(plainPath(target)));
}

RC_GTEST_PROP(IRIResolution, MakingRelativeIsUndoneByResolving, ())
{
    auto const start = *rc::gen::element<std::u16string>(u"s://h", u"s://", u"s:///x", u"");
    checkInverse(IRI(start + (*writtenPath()).value), IRI(start + (*writtenPath()).value));
}

RC_GTEST_PROP(IRIResolution, MakingRelativeIsUndoneAcrossAuthoritiesAndSchemes, ())
{
    auto const starts = rc::gen::element<std::u16string>(u"s://h", u"t://h", u"s://i", u"s:///");
    checkInverse(IRI(*starts + (*writtenPath()).value), IRI(*starts + (*writtenPath()).value));
}

RC_GTEST_PROP(IRIResolution, WithoutAuthorityMakingRelativeIsUndoneToo, ())
{
    auto const path = rc::gen::map(writtenPath(), [](Text const& written) {
        return Text{written.value.starts_with(u"//") ? u"/x" + written.value : written.value};
    });
    checkInverse(IRI(u"s:" + (*path).value), IRI(u"s:" + (*path).value));
}

RC_GTEST_PROP(IRIResolution, QueryAndFragmentAreReachedToo, ())
{
    auto const text =
        rc::gen::map(rc::gen::tuple(rc::gen::element<std::u16string>(u"/", u"/a", u"/a/", u"/a/b"),
                                    rc::gen::element<std::u16string>(u"", u"?", u"?q", u"?r"),
                                    rc::gen::element<std::u16string>(u"", u"#f")),
                     [](auto const& parts) {
                         return Text{u"s://h" + std::get<0>(parts) + std::get<1>(parts) + std::get<2>(parts)};
                     });
    IRI const target((*text).value);
    IRI const base((*text).value);
    RC_ASSERT(shown(target.makeRelativeTo(base).resolveAgainst(base).toString()) == shown(target.toString()));
}

} // namespace
} // namespace foundation::network
