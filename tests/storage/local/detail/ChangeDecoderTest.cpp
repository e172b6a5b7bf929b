#include <storage/local/detail/ChangeDecoder.hpp>

#include <gtest/gtest.h>

#include <string>
#include <sys/inotify.h>
#include <vector>

namespace foundation::storage::local::detail {
namespace {

using What = FolderChange::What;
using Texts = std::vector<std::string>;
using Events = std::vector<RawEvent>;

std::string textOf(WatchedEntry const& entry)
{
    return std::to_string(entry.watch) + "/" + entry.name;
}

/// Such as "created 1/name" or "moved 1/from 2/to", with a slash after the kind for folders.
Texts textsOf(std::vector<FolderChange> const& changes)
{
    static constexpr char const* names[] = {"created", "arrived",     "removed",    "modified", "attributes",
                                            "moved",   "foldermoved", "foldergone", "lost"};
    Texts texts;
    for (FolderChange const& change : changes) {
        std::string text = names[static_cast<int>(change.what)];
        text.append(change.type == events::EntryType::Folder ? "/ " : " ").append(textOf(change.entry));
        if (change.what == What::Moved)
            text.append(" ").append(textOf(change.target));
        texts.push_back(text);
    }
    return texts;
}

RawEvent from(int watch, std::string name, std::uint32_t cookie)
{
    return {watch, IN_MOVED_FROM, cookie, std::move(name)};
}

RawEvent to(int watch, std::string name, std::uint32_t cookie)
{
    return {watch, IN_MOVED_TO, cookie, std::move(name)};
}

TEST(ChangeDecoder, TellsEveryKind)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_CREATE, 0, "a"},
                                      {1, IN_CREATE | IN_ISDIR, 0, "b"},
                                      {2, IN_MODIFY, 0, "c"},
                                      {2, IN_ATTRIB, 0, "d"},
                                      {2, IN_ATTRIB | IN_ISDIR, 0, ""},
                                      {2, IN_DELETE, 0, "e"},
                                      {2, IN_DELETE | IN_ISDIR, 0, "f"},
                                      {3, IN_MOVE_SELF, 0, ""},
                                      {-1, IN_Q_OVERFLOW, 0, ""}})),
              (Texts{"created 1/a", "created/ 1/b", "modified 2/c", "attributes 2/d", "attributes/ 2/", "removed 2/e",
                     "removed/ 2/f", "foldermoved/ 3/", "lost/ -1/"}));
}

TEST(ChangeDecoder, TellsOnceThatAFolderIsGone)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_DELETE_SELF, 0, ""}, {1, IN_IGNORED, 0, ""}})), Texts{"foldergone/ 1/"});
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_UNMOUNT, 0, ""}, {1, IN_IGNORED, 0, ""}})), Texts{"foldergone/ 1/"});
}

TEST(ChangeDecoder, JoinsTheHalvesOfAMove)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({from(1, "a", 7), to(2, "b", 7)})), Texts{"moved 1/a 2/b"});
    EXPECT_FALSE(decoder.holdsBack());
}

TEST(ChangeDecoder, JoinsTheHalvesOfAMoveAroundOtherEventsInThePlaceOfTheFirst)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode(
                  {from(1, "a", 7), from(3, "x", 8), {4, IN_CREATE, 0, "c"}, to(2, "b", 7), to(3, "y", 8)})),
              (Texts{"moved 1/a 2/b", "moved 3/x 3/y", "created 4/c"}));
}

TEST(ChangeDecoder, JoinsHalvesThatComeWithTwoReads)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_CREATE, 0, "a"}, from(1, "a", 7), {3, IN_CREATE, 0, "c"}})),
              Texts{"created 1/a"});
    EXPECT_TRUE(decoder.holdsBack());
    EXPECT_EQ(textsOf(decoder.decode({to(2, "b", 7), {2, IN_DELETE, 0, "b"}})),
              (Texts{"moved 1/a 2/b", "created 3/c", "removed 2/b"}));
    EXPECT_FALSE(decoder.holdsBack());
}

TEST(ChangeDecoder, TakesAMoveForARemovalWhenTheNextReadBringsNoSecondHalf)
{
    for (Events const& next : {Events{}, Events{{1, IN_CREATE, 0, "a"}}}) {
        ChangeDecoder decoder;
        EXPECT_EQ(textsOf(decoder.decode({from(1, "a", 7)})), Texts{});
        Texts const texts = textsOf(decoder.decode(next));
        ASSERT_FALSE(texts.empty());
        EXPECT_EQ(texts[0], "removed 1/a");
        EXPECT_EQ(texts.size(), 1 + next.size());
        EXPECT_FALSE(decoder.holdsBack());
    }
}

TEST(ChangeDecoder, HoldsBackOnceForAllMovesThatAreOpenByThen)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({from(1, "a", 7), from(1, "b", 8), {1, IN_CREATE, 0, "a"}})), Texts{});
    EXPECT_EQ(textsOf(decoder.decode({from(1, "c", 9)})), (Texts{"removed 1/a", "removed 1/b", "created 1/a"}));
    EXPECT_TRUE(decoder.holdsBack());
    EXPECT_EQ(textsOf(decoder.decode({})), Texts{"removed 1/c"});
}

TEST(ChangeDecoder, TakesASecondHalfThatComesTooLateForAnArrival)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({from(1, "a", 7)})), Texts{});
    EXPECT_EQ(textsOf(decoder.decode({})), Texts{"removed 1/a"});
    EXPECT_EQ(textsOf(decoder.decode({to(2, "b", 7)})), Texts{"arrived 2/b"});
}

TEST(ChangeDecoder, LeavesOutRepetitionsPerEntry)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_MODIFY, 0, "a"},
                                      {1, IN_MODIFY, 0, "b"},
                                      {1, IN_MODIFY, 0, "a"},
                                      {2, IN_MODIFY, 0, "a"},
                                      {1, IN_ATTRIB, 0, "a"},
                                      {1, IN_ATTRIB, 0, "a"},
                                      {1, IN_MODIFY, 0, "a"}})),
              (Texts{"modified 1/a", "modified 1/b", "modified 2/a", "attributes 1/a", "modified 1/a"}));
}

TEST(ChangeDecoder, KeepsWhatIsNoRepetitionAfterAMoveOrALoss)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_MODIFY, 0, "a"},
                                      {1, IN_MODIFY, 0, "b"},
                                      from(1, "a", 7),
                                      to(1, "b", 7),
                                      {1, IN_MODIFY, 0, "a"},
                                      {1, IN_MODIFY, 0, "b"},
                                      {-1, IN_Q_OVERFLOW, 0, ""},
                                      {1, IN_MODIFY, 0, "b"}})),
              (Texts{"modified 1/a", "modified 1/b", "moved 1/a 1/b", "modified 1/a", "modified 1/b", "lost/ -1/",
                     "modified 1/b"}));
}

TEST(ChangeDecoder, TellsOfAModificationInEveryRead)
{
    ChangeDecoder decoder;
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_MODIFY, 0, "a"}})), Texts{"modified 1/a"});
    EXPECT_EQ(textsOf(decoder.decode({{1, IN_MODIFY, 0, "a"}})), Texts{"modified 1/a"});
}

} // namespace
} // namespace foundation::storage::local::detail
