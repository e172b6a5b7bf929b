#pragma once

#include <storage/provider/IProvider.hpp>

#include <future>
#include <memory>
#include <utility>

namespace foundation::tests::support {

/// A callback that takes until it is released, at the latest at the end of this object.
class HeldCallback
{
public:
    HeldCallback() = default;
    HeldCallback(HeldCallback const&) = delete;
    HeldCallback& operator=(HeldCallback const&) = delete;
    ~HeldCallback() { release(); }

    storage::provider::ChangeEventCallback callback()
    {
        return [shared = shared_](auto const&...) {
            if (std::exchange(shared->hasRun, true))
                return;
            shared->running.set_value();
            shared->released.get_future().wait();
        };
    }

    void waitUntilRunning() { shared_->running.get_future().wait(); }

    void release()
    {
        if (!std::exchange(isReleased_, true))
            shared_->released.set_value();
    }

private:
    struct Shared
    {
        bool hasRun = false;
        std::promise<void> running;
        std::promise<void> released;
    };

    std::shared_ptr<Shared> shared_ = std::make_shared<Shared>();
    bool isReleased_ = false;
};

} // namespace foundation::tests::support
