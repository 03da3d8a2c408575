// Opaque implementations: one owned alone and copied deeply, one shared by counted handles.
//
// A class derives from one of the two and reaches its implementation through d(). The member functions are not
// inline, so that a header can declare an instantiation `extern` while the implementation type is still incomplete.
#pragma once

#include <atomic>
#include <cstdint>
#include <utility>

namespace kvt::ex::detail {

/// Owns one `Impl`. A copy owns a copy of the `Impl`; a moved-from object owns none and may only be destroyed or
/// assigned to.
template <typename Impl>
class PimplBase {
public:
    /// Owns a default-constructed `Impl`.
    PimplBase();
    /// Takes ownership of `impl`, which was made with `new` and is not null.
    explicit PimplBase(Impl* impl) noexcept;
    PimplBase(const PimplBase& other);
    PimplBase(PimplBase&& other) noexcept;
    ~PimplBase();
    /// Copies first and releases the old `Impl` after that: when the copy throws, this object is unchanged.
    PimplBase& operator=(const PimplBase& other);
    PimplBase& operator=(PimplBase&& other) noexcept;

protected:
    /// The implementation. Not to be called on a moved-from object.
    const Impl& d() const;
    Impl& d();

private:
    Impl* impl_;
};

/// What the handles of one `PimplShared` share: the implementation, the mutex that its users take, and the number
/// of handles.
template <typename Impl, typename Mutex>
struct SharedDataT {
    SharedDataT() = default;
    explicit SharedDataT(Impl&& value) : impl(std::move(value)) {}

    Impl impl{};
    mutable Mutex mutex;
    std::atomic<std::uint64_t> handles{1};
};

/// A counted handle. Handles on one block may be copied and dropped on different threads; the last one destroys the
/// block. A moved-from handle may only be destroyed or assigned to.
///
/// Assignment lets go of the old block before it takes the new one and does not test for self-assignment: the last
/// handle of a block must not be assigned to itself.
template <typename Impl, typename Mutex>
class PimplShared {
public:
    using Shared = SharedDataT<Impl, Mutex>;

    /// A new block with a default-constructed `Impl`.
    PimplShared();
    /// A new block that holds `impl`.
    explicit PimplShared(Impl&& impl);
    PimplShared(const PimplShared& other) noexcept;
    PimplShared(PimplShared&& other) noexcept;
    ~PimplShared();
    PimplShared& operator=(const PimplShared& other) noexcept;
    PimplShared& operator=(PimplShared&& other) noexcept;

protected:
    /// The shared block. Not to be called on a moved-from handle.
    const Shared& d() const;
    Shared& d();

private:
    static Shared* incref(Shared* shared) noexcept;
    static void deref(Shared* shared) noexcept;

    Shared* shared_;
};

template <typename Impl>
PimplBase<Impl>::PimplBase() : impl_(new Impl()) {}

template <typename Impl>
PimplBase<Impl>::PimplBase(Impl* impl) noexcept : impl_(impl) {}

template <typename Impl>
PimplBase<Impl>::PimplBase(const PimplBase& other) : impl_(new Impl(*other.impl_)) {}

template <typename Impl>
PimplBase<Impl>::PimplBase(PimplBase&& other) noexcept : impl_(std::exchange(other.impl_, nullptr)) {}

template <typename Impl>
PimplBase<Impl>::~PimplBase() {
    delete impl_;
}

template <typename Impl>
PimplBase<Impl>& PimplBase<Impl>::operator=(const PimplBase& other) {
    delete std::exchange(impl_, new Impl(*other.impl_));
    return *this;
}

template <typename Impl>
PimplBase<Impl>& PimplBase<Impl>::operator=(PimplBase&& other) noexcept {
    delete std::exchange(impl_, std::exchange(other.impl_, nullptr));
    return *this;
}

template <typename Impl>
const Impl& PimplBase<Impl>::d() const {
    return *impl_;
}

template <typename Impl>
Impl& PimplBase<Impl>::d() {
    return *impl_;
}

template <typename Impl, typename Mutex>
PimplShared<Impl, Mutex>::PimplShared() : shared_(new Shared()) {}

template <typename Impl, typename Mutex>
PimplShared<Impl, Mutex>::PimplShared(Impl&& impl) : shared_(new Shared(std::move(impl))) {}

template <typename Impl, typename Mutex>
PimplShared<Impl, Mutex>::PimplShared(const PimplShared& other) noexcept : shared_(incref(other.shared_)) {}

template <typename Impl, typename Mutex>
PimplShared<Impl, Mutex>::PimplShared(PimplShared&& other) noexcept
    : shared_(std::exchange(other.shared_, nullptr)) {}

template <typename Impl, typename Mutex>
PimplShared<Impl, Mutex>::~PimplShared() {
    deref(shared_);
}

template <typename Impl, typename Mutex>
PimplShared<Impl, Mutex>& PimplShared<Impl, Mutex>::operator=(const PimplShared& other) noexcept {
    deref(shared_);
    shared_ = incref(other.shared_);
    return *this;
}

template <typename Impl, typename Mutex>
PimplShared<Impl, Mutex>& PimplShared<Impl, Mutex>::operator=(PimplShared&& other) noexcept {
    deref(shared_);
    shared_ = std::exchange(other.shared_, nullptr);
    return *this;
}

template <typename Impl, typename Mutex>
const typename PimplShared<Impl, Mutex>::Shared& PimplShared<Impl, Mutex>::d() const {
    return *shared_;
}

template <typename Impl, typename Mutex>
typename PimplShared<Impl, Mutex>::Shared& PimplShared<Impl, Mutex>::d() {
    return *shared_;
}

template <typename Impl, typename Mutex>
typename PimplShared<Impl, Mutex>::Shared* PimplShared<Impl, Mutex>::incref(Shared* shared) noexcept {
    // A new handle is made from a living one, so nothing needs to be ordered with it.
    shared->handles.fetch_add(1, std::memory_order_relaxed);
    return shared;
}

template <typename Impl, typename Mutex>
void PimplShared<Impl, Mutex>::deref(Shared* shared) noexcept {
    // Release: what this thread did to the block comes before its destruction. Acquire: the destroying thread sees it.
    if (shared != nullptr && shared->handles.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        delete shared;
    }
}

} // namespace kvt::ex::detail
