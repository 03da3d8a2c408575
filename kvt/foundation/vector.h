// A vector whose array is released by the module that allocated it.
//
// It has the shape of a standard vector. What differs is ownership: whoever allocates the array stores, next to it,
// the function that releases it, and that function travels with the array when the vector is moved. So a vector
// that was filled in one module may be destroyed in another. Elements are relocated by their move operations only,
// never bytewise.
//
// Sizes and positions count elements. References, pointers and iterators stay valid until the next operation that
// grows beyond capacity() or moves elements. Operations that allocate throw std::bad_alloc when memory runs out and
// std::length_error "vector<T> too long" beyond max_size().
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/memory.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <iterator>
#include <limits>
#include <memory>
#include <stdexcept>
#include <type_traits>
#include <utility>

namespace kvt::ex {

template <typename T>
class KVT_EXPORT vector : public TypedAllocator<T> {
    static_assert(alignof(T) <= __STDCPP_DEFAULT_NEW_ALIGNMENT__,
                  "the library's allocator gives no stricter alignment");

    template <typename Iterator>
    using RequireInput =
        std::enable_if_t<std::is_convertible_v<typename std::iterator_traits<Iterator>::iterator_category,
                                               std::input_iterator_tag>>;
    // Two arrays are not the ends of one range. They would come from literals in braces, {"a", "b"}.
    template <typename First, typename Last>
    using RequireRange = std::enable_if_t<std::is_same_v<std::decay_t<First>, std::decay_t<Last>> &&
                                          !(std::is_array_v<std::remove_reference_t<First>> &&
                                            std::is_array_v<std::remove_reference_t<Last>>)>;

public:
    using value_type = T;
    using size_type = std::uint64_t;
    using difference_type = std::ptrdiff_t;
    using reference = T&;
    using const_reference = const T&;
    using pointer = T*;
    using const_pointer = const T*;
    using iterator = T*;
    using const_iterator = const T*;

    /// Empty: no array, no deleter.
    vector() noexcept = default;
    /// `count` value-initialised elements.
    explicit vector(size_type count) : vector() { resize(count); }
    vector(size_type count, const T& value) : vector() { resize(count, value); }
    vector(std::initializer_list<T> values) : vector(values.begin(), values.end()) {}
    /// The elements from `first` up to `last`, two input iterators of one type.
    template <typename First, typename Last, typename = RequireInput<std::decay_t<First>>,
              typename = RequireRange<First, Last>>
    vector(First&& first, Last&& last) : vector() {
        append<std::decay_t<First>>(first, last);
    }
    vector(const vector& other) : vector(other.begin(), other.end()) {}
    /// Takes the array and its deleter; the source is left empty, without an array.
    vector(vector&& other) noexcept : vector() { swap(other); }

    /// Destroys the elements in order, then has the array released by the code that allocated it.
    virtual ~vector() { release(); }

    vector& operator=(const vector& other) {
        if (this != &other) {
            vector(other).swap(*this);
        }
        return *this;
    }
    vector& operator=(vector&& other) noexcept {
        if (this != &other) {
            vector(std::move(other)).swap(*this);
        }
        return *this;
    }
    vector& operator=(std::initializer_list<T> values) {
        vector(values).swap(*this);
        return *this;
    }

    size_type size() const noexcept { return size_; }
    size_type capacity() const noexcept { return capacity_; }
    bool empty() const noexcept { return size_ == 0; }
    static constexpr size_type max_size() noexcept {
        return static_cast<size_type>(std::numeric_limits<difference_type>::max()) / sizeof(T);
    }
    /// The function that releases the array; empty while there is no array.
    const std::function<void(T*)>& deleter() const noexcept { return deleter_; }

    /// The first element; null while there is no array.
    T* data() noexcept { return data_; }
    const T* data() const noexcept { return data_; }
    iterator begin() noexcept { return data_; }
    iterator end() noexcept { return data_ + size_; }
    const_iterator begin() const noexcept { return data_; }
    const_iterator end() const noexcept { return data_ + size_; }
    const_iterator cbegin() const noexcept { return begin(); }
    const_iterator cend() const noexcept { return end(); }

    /// Not checked: `index` must be below size(), and the vector not empty for front() and back().
    T& operator[](size_type index) noexcept { return data_[index]; }
    const T& operator[](size_type index) const noexcept { return data_[index]; }
    T& front() noexcept { return data_[0]; }
    const T& front() const noexcept { return data_[0]; }
    T& back() noexcept { return data_[size_ - 1]; }
    const T& back() const noexcept { return data_[size_ - 1]; }
    /// Checked: throws std::out_of_range "invalid vector<T> subscript" when `index` is not below size().
    T& at(size_type index) { return data_[checked(index)]; }
    const T& at(size_type index) const { return data_[checked(index)]; }

    /// Makes room for `count` elements in all; never shrinks.
    void reserve(size_type count) {
        if (count > capacity_) {
            Storage larger(count);
            std::uninitialized_move(begin(), end(), larger.data);
            adopt(larger);
        }
    }

    /// Sets the number of elements, adding value-initialised ones or destroying the last ones.
    void resize(size_type count) {
        growTo(count, [](T* first, T* last) { std::uninitialized_value_construct(first, last); });
    }
    /// The same, with copies of `value`, which may be an element of this vector.
    void resize(size_type count, const T& value) {
        if (count > size_) {
            const T copy(value);
            growTo(count, [&copy](T* first, T* last) { std::uninitialized_fill(first, last, copy); });
        } else {
            growTo(count, [](T*, T*) {});
        }
    }

    /// Adds an element at the end, made from `arguments`, which may refer to elements of this vector. If making it
    /// throws, the vector is unchanged.
    template <typename... Arguments>
    T& emplace_back(Arguments&&... arguments) {
        if (size_ < capacity_) {
            ::new (static_cast<void*>(data_ + size_)) T(std::forward<Arguments>(arguments)...);
        } else {
            // The new element is made before the old ones move, since it may be made from one of them.
            Storage larger(grownCapacity(1));
            larger.element =
                ::new (static_cast<void*>(larger.data + size_)) T(std::forward<Arguments>(arguments)...);
            std::uninitialized_move(begin(), end(), larger.data);
            adopt(larger);
            larger.element = nullptr;
        }
        ++size_;
        return back();
    }
    void push_back(const T& value) { emplace_back(value); }
    void push_back(T&& value) { emplace_back(std::move(value)); }
    /// Not checked: the vector must not be empty.
    void pop_back() noexcept { std::destroy_at(data_ + --size_); }

    /// Inserts before `position` and returns an iterator to the first element inserted, or to where it would be.
    /// A range must not come from this vector.
    iterator insert(const_iterator position, const T& value) {
        return insertWith(position, [&] { emplace_back(value); });
    }
    iterator insert(const_iterator position, T&& value) {
        return insertWith(position, [&] { emplace_back(std::move(value)); });
    }
    iterator insert(const_iterator position, size_type count, const T& value) {
        return insertWith(position, [&] { resize(checkedSum(count), value); });
    }
    template <typename Iterator, typename = RequireInput<Iterator>>
    iterator insert(const_iterator position, Iterator first, Iterator last) {
        return insertWith(position, [&] { append(first, last); });
    }
    iterator insert(const_iterator position, std::initializer_list<T> values) {
        return insert(position, values.begin(), values.end());
    }

    /// Removes elements and returns an iterator to the one that now stands at `position`, or end().
    iterator erase(const_iterator position) { return erase(position, position + 1); }
    iterator erase(const_iterator first, const_iterator last) {
        T* const to = data_ + (first - data_);
        if (first != last) {
            T* const newEnd = std::move(data_ + (last - data_), end(), to);
            std::destroy(newEnd, end());
            size_ = static_cast<size_type>(newEnd - data_);
        }
        return to;
    }

    /// Destroys all elements and keeps the array.
    void clear() noexcept {
        std::destroy(begin(), end());
        size_ = 0;
    }

    void swap(vector& other) noexcept {
        std::swap(size_, other.size_);
        std::swap(capacity_, other.capacity_);
        deleter_.swap(other.deleter_);
        std::swap(data_, other.data_);
    }
    friend void swap(vector& left, vector& right) noexcept { left.swap(right); }

    friend bool operator==(const vector& left, const vector& right) {
        return std::equal(left.begin(), left.end(), right.begin(), right.end());
    }
    friend bool operator!=(const vector& left, const vector& right) { return !(left == right); }

private:
    // An array on its way into a vector, with the function that releases it, and a first element if there is one.
    struct Storage {
        explicit Storage(size_type count) : capacity(count) {
            if (count > max_size()) {
                throw std::length_error("vector<T> too long");
            }
            deleter = [bytes = static_cast<std::size_t>(count * sizeof(T))](T* array) {
                vector::deallocate(array, bytes);
            };
            data = static_cast<T*>(vector::allocate(static_cast<std::size_t>(count * sizeof(T))));
        }
        Storage(const Storage&) = delete;
        Storage& operator=(const Storage&) = delete;
        ~Storage() {
            if (element != nullptr) {
                std::destroy_at(element);
            }
            if (data != nullptr) {
                deleter(data);
            }
        }

        size_type capacity;
        std::function<void(T*)> deleter;
        T* data = nullptr;
        T* element = nullptr;
    };

    // Puts `storage`, into which the elements have been moved, in the place of the present array.
    void adopt(Storage& storage) noexcept {
        std::destroy(begin(), end());
        std::swap(capacity_, storage.capacity);
        deleter_.swap(storage.deleter);
        std::swap(data_, storage.data);
    }

    void release() noexcept {
        clear();
        if (data_ != nullptr) {
            deleter_(data_);
        }
    }

    size_type checked(size_type index) const {
        if (index >= size_) {
            throw std::out_of_range("invalid vector<T> subscript");
        }
        return index;
    }

    size_type checkedSum(size_type more) const {
        if (more > max_size() - size_) {
            throw std::length_error("vector<T> too long");
        }
        return size_ + more;
    }

    // Doubling keeps the cost of appending constant on average.
    size_type grownCapacity(size_type more) const {
        const size_type needed = checkedSum(more);
        return std::max(needed, capacity_ <= max_size() / 2 ? capacity_ * 2 : max_size());
    }

    template <typename Fill>
    void growTo(size_type count, Fill fill) {
        if (count <= size_) {
            std::destroy(data_ + count, end());
        } else {
            if (count > capacity_) {
                reserve(std::max(count, grownCapacity(count > max_size() ? max_size() : count - size_)));
            }
            fill(end(), data_ + count);
        }
        size_ = count;
    }

    template <typename Iterator>
    void append(Iterator first, Iterator last) {
        if constexpr (std::is_convertible_v<typename std::iterator_traits<Iterator>::iterator_category,
                                            std::forward_iterator_tag>) {
            const auto count = static_cast<size_type>(std::distance(first, last));
            if (count > capacity_ - size_) {
                reserve(size_ == 0 ? checkedSum(count) : grownCapacity(count));
            }
        }
        for (; first != last; ++first) {
            emplace_back(*first);
        }
    }

    // Appends, then turns what was appended into its place.
    template <typename Append>
    iterator insertWith(const_iterator position, Append append) {
        const auto offset = position - data_;
        const auto oldSize = static_cast<difference_type>(size_);
        append();
        std::rotate(data_ + offset, data_ + oldSize, end());
        return data_ + offset;
    }

    size_type size_ = 0;
    size_type capacity_ = 0;
    std::function<void(T*)> deleter_;
    T* data_ = nullptr;
};

} // namespace kvt::ex
