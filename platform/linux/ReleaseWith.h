#pragma once

namespace ventras {

/// Deleter of a C library's handles, by the function that releases them: std::unique_ptr<T, ReleaseWith<f>>.
template <auto release>
struct ReleaseWith {
    template <class Handle>
    void operator()(Handle* handle) const {
        release(handle);
    }
};

}  // namespace ventras
