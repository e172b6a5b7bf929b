#include <tools/storage/TreeWalk.hpp>

#include <tools/storage/interrupt.hpp>

namespace foundation::storage::tool {

namespace {

class Walk
{
public:
    Walk(Session& session, std::unique_ptr<TreeCursor> tree, TreeVisitor& visitor)
        : session_(session), tree_(std::move(tree)), visitor_(visitor)
    {
        visitor_.enter();
    }

    void run()
    {
        while (!isDone_) {
            checkInterrupt();
            session_.attempt([&] { step(); });
        }
    }

private:
    void step()
    {
        std::optional<ListedName> const listed = tree_->next();
        if (!listed)
            leave();
        else if (visitor_.visit(*tree_, *listed) && tree_->enter(*listed))
            visitor_.enter();
    }

    void leave()
    {
        std::size_t const depth = tree_->depth();
        visitor_.leave(*tree_);
        isDone_ = depth == 0;
        if (isDone_)
            return;
        try {
            tree_->leave();
        } catch (Failure const&) {
            for (std::size_t lost = tree_->depth() + 1; lost < depth; ++lost)
                visitor_.lose();
            throw;
        }
    }

    Session& session_;
    std::unique_ptr<TreeCursor> tree_;
    TreeVisitor& visitor_;
    bool isDone_ = false;
};

} // namespace

void walkTree(Session& session, Place const& folder, Listing listing, TreeVisitor& visitor)
{
    session.attempt([&] { Walk(session, openTree(session.stores(), folder, listing), visitor).run(); });
}

} // namespace foundation::storage::tool
