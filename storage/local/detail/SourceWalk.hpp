#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/FolderChain.hpp>
#include <storage/local/detail/MoveWatch.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <fcntl.h>
#include <string>

namespace foundation::storage::local::detail {

/// A tree to be moved, by its name in an open folder.
struct Tree
{
    Root const& root;
    provider::StorageIRI const& iri;
    FileDescriptor parent = {};
    std::string name = {};

    void open()
    {
        if (int const error = root.openParent(root.pathOf(iri), parent, name))
            throwError(error, iri);
    }

    FileDescriptor openParent() const
    {
        FileDescriptor opened;
        if (int const error = openFile({parent.get(), "."}, O_PATH | O_DIRECTORY, opened))
            throwError(error, iri);
        return opened;
    }
};

/// What is done in each folder and with each entry of the source. All throw `Exception`.
class SourceVisitor
{
public:
    virtual ~SourceVisitor() = default;

    /// The walk stands in the folder.
    virtual void enter(Status const& folder) = 0;
    virtual void leave() = 0;

    /// Of what is no folder, in the one in which the walk stands.
    virtual void visit(char const* name, Status const& entry) = 0;
};

/// Goes through the source, never by a link, nor into what is mounted there.
class SourceWalk
{
public:
    SourceWalk(Tree const& tree, MoveWatch const& watch) : tree_(tree), watch_(watch), chain_(tree.openParent()) {}

    void run(SourceVisitor& visitor);

    int folder() const { return chain_.folder(); }
    std::string const& name() const { return chain_.name(); }

    /// Throws what is wrong with an entry of the folder in which the walk stands; with the folder itself without one.
    [[noreturn]] void fail(int error, std::string const& entry = {}) const;

private:
    void enter(char const* name, SourceVisitor& visitor);
    void step(SourceVisitor& visitor);

    provider::StorageIRI locationOf(std::string const& entry) const;

    Tree const& tree_;
    MoveWatch const& watch_;
    FolderChain chain_;
};

} // namespace foundation::storage::local::detail
