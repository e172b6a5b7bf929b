#include <storage/memory/detail/Content.hpp>

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <algorithm>
#include <string>

namespace foundation::storage::memory::detail {
namespace {

constexpr std::size_t blockSize = Content::blockSize;

std::string bytesOf(Content const& content)
{
    std::string bytes(content.size(), '?');
    EXPECT_EQ(content.read(0, bytes.data(), bytes.size()), bytes.size());
    return bytes;
}

void write(Content& content, std::uint64_t offset, std::string const& bytes)
{
    content.write(offset, bytes.data(), bytes.size());
}

TEST(Content, IsEmptyAtFirst)
{
    Content const content;
    char buffer[1];
    EXPECT_EQ(content.size(), 0u);
    EXPECT_EQ(content.read(0, buffer, 1), 0u);
}

TEST(Content, ReadsWithinItsSize)
{
    Content content;
    write(content, 0, "12345");
    char buffer[8];
    EXPECT_EQ(content.read(3, buffer, 8), 2u);
    EXPECT_EQ(std::string(buffer, 2), "45");
    EXPECT_EQ(content.read(5, buffer, 8), 0u);
    EXPECT_EQ(content.read(6, buffer, 8), 0u);
}

TEST(Content, ReadsZerosWhereNothingWasWritten)
{
    Content content;
    write(content, 3, "4");
    write(content, 3 * blockSize + 1, "x");
    EXPECT_EQ(bytesOf(content), std::string("\0\0\0"
                                            "4",
                                            4) +
                                    std::string(3 * blockSize - 3, '\0') + "x");
}

TEST(Content, WritesOverTheSeamsOfBlocks)
{
    Content content;
    std::string const bytes = std::string(blockSize, 'a') + std::string(blockSize, 'b') + "c";
    write(content, blockSize - 1, bytes);
    EXPECT_EQ(bytesOf(content), std::string(blockSize - 1, '\0') + bytes);
}

TEST(Content, StaysWhatItWasWhenACopyIsWritten)
{
    Content content;
    write(content, 0, std::string(2 * blockSize, 'x'));
    Content copy = content;
    write(copy, blockSize - 1, "12");
    write(content, 2 * blockSize, "end");
    EXPECT_EQ(bytesOf(content), std::string(2 * blockSize, 'x') + "end");
    EXPECT_EQ(bytesOf(copy), std::string(blockSize - 1, 'x') + "12" + std::string(blockSize - 1, 'x'));
}

TEST(Content, BecomesAnotherBitByBit)
{
    Content source;
    write(source, 0, std::string(blockSize, 'a') + std::string(blockSize, 'b') + "c");
    Content content;
    content.extendFrom(source, blockSize);
    EXPECT_EQ(bytesOf(content), std::string(blockSize, 'a'));
    content.extendFrom(source, source.size());
    EXPECT_EQ(bytesOf(content), bytesOf(source));
}

/// A position near the seams of the first blocks, where mistakes are.
rc::Gen<std::size_t> nearASeam()
{
    return rc::gen::map(
        rc::gen::pair(rc::gen::inRange<std::size_t>(0, 3), rc::gen::inRange(-3, 4)), [](auto const& at) {
            return at.first * blockSize + static_cast<std::size_t>(std::max(at.second, at.first == 0 ? 0 : -3));
        });
}

RC_GTEST_PROP(Content, BehavesAsAStringThatIsCopied, ())
{
    std::vector<std::pair<Content, std::string>> versions(1);
    int const steps = *rc::gen::inRange(1, 8);
    for (int step = 0; step < steps; ++step) {
        auto [content, model] = versions[*rc::gen::inRange<std::size_t>(0, versions.size())];
        std::size_t const offset = *nearASeam();
        std::string const bytes(*rc::gen::oneOf(rc::gen::inRange<std::size_t>(0, 5), nearASeam()),
                                static_cast<char>('a' + step));
        if (!bytes.empty()) {
            write(content, offset, bytes);
            model.resize(std::max(model.size(), offset + bytes.size()));
            model.replace(offset, bytes.size(), bytes);
        }
        versions.emplace_back(content, model);
    }
    for (auto const& [content, model] : versions)
        RC_ASSERT(bytesOf(content) == model);
}

TEST(Content, DoesNotCopyWhatItAppendsTo)
{
    Content content;
    std::string const chunk(1000, 'x');
    std::size_t const chunks = 10 * blockSize / chunk.size();
    for (std::size_t count = 0; count < chunks; ++count)
        write(content, content.size(), chunk);
    EXPECT_EQ(bytesOf(content), std::string(chunks * chunk.size(), 'x'));
}

} // namespace
} // namespace foundation::storage::memory::detail
