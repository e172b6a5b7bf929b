#include <tools/storage/printable.hpp>

#include <gtest/gtest.h>
#include <utility>
#include <vector>

namespace {

using foundation::storage::tool::printable;

TEST(Printable, EscapesWhatATerminalWouldObeyAndWhatIsNotText)
{
    std::vector<std::pair<std::string, std::string>> const rows{
        {"", ""},
        {"plain name.txt", "plain name.txt"},
        {"\xc3\xa4 \xe4\xb8\xad \xf0\x9f\x98\x80 e\xcc\x81", "\xc3\xa4 \xe4\xb8\xad \xf0\x9f\x98\x80 e\xcc\x81"},
        {"\a\b\t\n\v\f\r\\", "\\a\\b\\t\\n\\v\\f\\r\\\\"},
        {"\033[31m\x7f\1", "\\033[31m\\177\\001"},
        {std::string("\0", 1), "\\000"},
        {"\xff\xfe", "\\377\\376"},
        {"\xc3", "\\303"},
        {"\xed\xa0\x80", "\\355\\240\\200"},
        {"\xc2\x9b"
         "31m",
         "\\302\\23331m"},
        {"\xe2\x80\xae", "\\342\\200\\256"},
        {"\xe2\x81\xa6", "\\342\\201\\246"},
        {"\xee\xbe\x80", "\\356\\276\\200"},
    };
    for (auto const& [bytes, shown] : rows)
        EXPECT_EQ(printable(bytes), shown);
}

} // namespace
