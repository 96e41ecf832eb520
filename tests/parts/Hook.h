#pragma once

#include <functional>
#include <mutex>
#include <utility>

namespace ventras {

/// A function that a test puts in while others may already call it. Any thread may use it; calls come one at
/// a time.
template <typename Signature>
class Hook;

template <typename Result, typename... Arguments>
class Hook<Result(Arguments...)> {
public:
    template <typename Function>
    Hook& operator=(Function&& function) {
        const std::lock_guard lock(mutex_);
        function_ = std::forward<Function>(function);
        return *this;
    }

    /// What the function gives, or a value-initialized result while there is none.
    Result operator()(Arguments... arguments) {
        const std::lock_guard lock(mutex_);
        return function_ ? function_(std::forward<Arguments>(arguments)...) : Result{};
    }

private:
    std::mutex mutex_;
    std::function<Result(Arguments...)> function_;
};

}  // namespace ventras
