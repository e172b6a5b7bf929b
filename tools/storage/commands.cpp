#include <tools/storage/commands.hpp>

#include <array>

namespace foundation::storage::tool {

std::span<Command const> commands()
{
    static constexpr std::array table{
        Command{"ls", "List folders", defineLs},
        Command{"tree", "Draw a folder and all below it", defineTree},
        Command{"find", "List what lies below folders and has a name, type, size or time", defineFind},
        Command{"du", "Sum up the sizes of files, folder by folder", defineDu},
        Command{"stat", "Say what is known of files and folders", defineStat},
        Command{"cat", "Write files to standard output", defineCat},
        Command{"put", "Write standard input to a file, whole or not at all", definePut},
        Command{"cp", "Copy files and folders, each file whole or not at all", defineCp},
        Command{"mv", "Move or rename files and folders", defineMv},
        Command{"rm", "Remove files and folders", defineRm},
        Command{"clean", "Remove scratch files that killed writers left in local folders", defineClean},
        Command{"mkdir", "Make folders", defineMkdir},
        Command{"watch", "Tell what happens to files and folders, as it happens", defineWatch},
        Command{"schemes", "List the schemes of the stores that can be reached", defineSchemes},
        Command{"completion", "Print a script that has a shell complete commands", defineCompletion},
        Command{"man", "Print the manual page, as roff", defineMan},
    };
    return table;
}

} // namespace foundation::storage::tool
