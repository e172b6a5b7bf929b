#include <foundation/network/IRIArgs.hpp>

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

#include <foundation/network/IRI.hpp>

namespace foundation::network {
namespace {

using iri::Encoding;

IRIArgs schemeAndPath(std::wstring const& scheme, std::wstring const& path)
{
    IRIArgs args;
    args.scheme = scheme;
    args.hasScheme = true;
    args.path = path;
    args.hasPath = true;
    return args;
}

IRIArgs pathAlone(std::wstring const& path)
{
    IRIArgs args;
    args.path = path;
    args.hasPath = true;
    return args;
}

TEST(IRIArgs, HoldsNothingAtFirst)
{
    IRIArgs const args;
    EXPECT_EQ(args.scheme + args.userInfo + args.host + args.path + args.query + args.fragment, L"");
    EXPECT_EQ(args.port, 0);
    EXPECT_FALSE(args.hasScheme || args.hasUserInfo || args.hasHost || args.hasPort || args.hasPath || args.hasQuery ||
                 args.hasFragment || args.pathIsEncoded);
    EXPECT_EQ(IRI(args).toString(), u"");
}

TEST(IRIArgs, HoldsThePlainComponentsOfAnIri)
{
    IRIArgs const args{IRI(u"s://u%3Ax@h%C3%A9:080/a%20b/%F0%9F%98%80?q%26#f%23")};
    EXPECT_EQ(args.scheme, L"s");
    EXPECT_EQ(args.userInfo, L"u:x");
    EXPECT_EQ(args.host, L"h\u00E9");
    EXPECT_EQ(args.port, 80);
    EXPECT_EQ(args.path, L"/a b/\U0001F600");
    EXPECT_EQ(args.query, L"q&");
    EXPECT_EQ(args.fragment, L"f#");
    EXPECT_TRUE(args.hasScheme && args.hasUserInfo && args.hasHost && args.hasPort && args.hasPath && args.hasQuery &&
                args.hasFragment);
    EXPECT_FALSE(args.pathIsEncoded);
}

TEST(IRIArgs, TellsAbsentComponentsFromEmptyOnes)
{
    IRIArgs const bare{IRI(u"f:/x")};
    EXPECT_FALSE(bare.hasUserInfo || bare.hasHost || bare.hasPort || bare.hasQuery || bare.hasFragment);
    IRIArgs const empty{IRI(u"f://@:?#")};
    EXPECT_TRUE(empty.hasUserInfo && empty.hasHost && empty.hasQuery && empty.hasFragment);
    EXPECT_FALSE(empty.hasPort || empty.hasPath);
}

TEST(IRIArgs, ComponentCountsWhenItsFlagIsSet)
{
    IRIArgs args;
    args.scheme = L"s";
    args.userInfo = L"u";
    args.host = L"h";
    args.port = 7;
    args.path = L"/p";
    args.query = L"q";
    args.fragment = L"f";
    EXPECT_EQ(IRI(args).toString(), u"");
    args.hasScheme = true;
    EXPECT_EQ(IRI(args).toString(), u"s:");
    args.hasPath = true;
    EXPECT_EQ(IRI(args).toString(), u"s:/p");
    args.hasHost = true;
    EXPECT_EQ(IRI(args).toString(), u"s://h/p");
    args.hasPort = true;
    EXPECT_EQ(IRI(args).toString(), u"s://h:7/p");
    args.hasUserInfo = true;
    EXPECT_EQ(IRI(args).toString(), u"s://u@h:7/p");
    args.hasQuery = args.hasFragment = true;
    EXPECT_EQ(IRI(args).toString(), u"s://u@h:7/p?q#f");
}

TEST(IRIArgs, EmptyHostPrintsAnEmptyAuthority)
{
    IRIArgs args = schemeAndPath(L"file", L"/tmp");
    EXPECT_EQ(IRI(args).toString(), u"file:/tmp");
    args.hasHost = true;
    EXPECT_EQ(IRI(args).toString(), u"file:///tmp");
}

TEST(IRIArgs, EscapesWhatAPathMayNotHold)
{
    EXPECT_EQ(IRI(schemeAndPath(L"s", L"/a b%41?#[]\"\\|")).toString(), u"s:/a%20b%2541%3F%23%5B%5D%22%5C%7C");
    EXPECT_EQ(IRI(schemeAndPath(L"s", L"/-._~!$&'()*+,;=:@/")).toString(), u"s:/-._~!$&'()*+,;=:@/");
    EXPECT_EQ(IRI(schemeAndPath(L"s", L"/\u00E9\u4F60\U0001F600")).toString(), u"s:/\u00E9\u4F60\U0001F600");
    EXPECT_EQ(IRI(schemeAndPath(L"s", L"/\u0080\uE000\uFFFE\U0010FFFF")).toString(),
              u"s:/%C2%80%EE%80%80%EF%BF%BE%F4%8F%BF%BF");
}

TEST(IRIArgs, EscapesWhatTheOtherComponentsMayNotHold)
{
    IRIArgs args = schemeAndPath(L"s", L"/");
    args.userInfo = L"u:@/ ";
    args.host = L"h:@/?# \u00E9";
    args.query = L"q/?:@#[]\uE000";
    args.fragment = L"f/?:@#%41";
    args.hasUserInfo = args.hasHost = args.hasQuery = args.hasFragment = true;
    EXPECT_EQ(IRI(args).toString(), u"s://u:%40%2F%20@h%3A%40%2F%3F%23%20\u00E9/?q/?:@%23%5B%5D\uE000#f/?:@%23%2541");
}

// RFC 3987, section 2.2: iprivate is part of iquery, and of nothing else.
TEST(IRIArgs, WritesPrivateCharactersInAQueryAlone)
{
    IRIArgs args = schemeAndPath(L"s", L"/\uE000");
    args.userInfo = args.host = args.query = args.fragment = L"\uE000";
    args.hasUserInfo = args.hasHost = args.hasQuery = args.hasFragment = true;
    EXPECT_EQ(IRI(args).toString(), u"s://%EE%80%80@%EE%80%80/%EE%80%80?\uE000#%EE%80%80");
}

TEST(IRIArgs, KeepsAnIPLiteral)
{
    IRIArgs args = schemeAndPath(L"s", L"/");
    args.hasHost = true;
    args.host = L"[2001:db8::1]";
    EXPECT_EQ(IRI(args).toString(), u"s://[2001:db8::1]/");
    args.host = L"[fe80::1%eth0]";
    EXPECT_EQ(IRI(args).toString(), u"s://[fe80::1%25eth0]/");
    args.host = L"[a/b]c]";
    EXPECT_EQ(IRI(args).toString(), u"s://[a%2Fb%5Dc]/");
    args.host = L"[::1";
    EXPECT_EQ(IRI(args).toString(), u"s://%5B%3A%3A1/");
}

TEST(IRIArgs, EncodedPathIsUsedAsGiven)
{
    IRIArgs args = schemeAndPath(L"s", L"/%41%2f%C3%A9[b]");
    args.pathIsEncoded = true;
    EXPECT_EQ(IRI(args).toString(), u"s:/%41%2f%C3%A9[b]");
    args.path = L"f:/x?q#f!/d";
    EXPECT_EQ(IRI(args).toString(), u"s:f:/x?q#f!/d");
}

TEST(IRIArgs, PathThatWouldReadAsAnAuthorityIsEscaped)
{
    EXPECT_EQ(IRI(schemeAndPath(L"s", L"//h/a")).toString(), u"s:/%2Fh/a");
    EXPECT_EQ(IRI(schemeAndPath(L"s", L"///")).toString(), u"s:/%2F/");
    EXPECT_EQ(IRI(pathAlone(L"//a")).toString(), u"/%2Fa");
    EXPECT_EQ(IRI(pathAlone(L"//a")).getPath(Encoding::Decoded), u"//a");
    IRIArgs behindAuthority = schemeAndPath(L"s", L"//a");
    behindAuthority.hasHost = true;
    EXPECT_EQ(IRI(behindAuthority).toString(), u"s:////a");
}

TEST(IRIArgs, FirstSegmentOfARelativePathKeepsNoColon)
{
    EXPECT_EQ(IRI(pathAlone(L"a:b:/c:d")).toString(), u"a%3Ab%3A/c:d");
    EXPECT_EQ(IRI(pathAlone(L":a")).toString(), u"%3Aa");
    EXPECT_EQ(IRI(pathAlone(L"/a:b")).toString(), u"/a:b");
    EXPECT_EQ(IRI(schemeAndPath(L"s", L"a:b")).toString(), u"s:a:b");
}

TEST(IRIArgs, RefusesARelativePathBehindAnAuthority)
{
    IRIArgs args = schemeAndPath(L"s", L"a");
    args.hasHost = true;
    EXPECT_THROW(IRI{args}, std::invalid_argument);
}

TEST(IRIArgs, RefusesWhatIsNoScalarValue)
{
    EXPECT_THROW(IRI{schemeAndPath(L"s", std::wstring(1, static_cast<wchar_t>(0xD800)))}, std::out_of_range);
    EXPECT_THROW(IRI{schemeAndPath(L"s", std::wstring(1, static_cast<wchar_t>(0x110000)))}, std::out_of_range);
    IRIArgs encoded = schemeAndPath(L"s", std::wstring(1, static_cast<wchar_t>(0xDFFF)));
    encoded.pathIsEncoded = true;
    EXPECT_THROW(IRI{encoded}, std::out_of_range);
}

TEST(IRIArgs, SchemeThatIsNoneMakesARelativeReference)
{
    for (std::wstring const scheme : {L"", L"1s", L"a/b", L"a b"})
        EXPECT_FALSE(IRI(schemeAndPath(scheme, L"f:/x")).isAbsolute());
}

} // namespace
} // namespace foundation::network
