// Shared ownership of the immutable blocks behind values. Internal: hosts meet it only inside
// Value.

#pragma once

#include <atomic>
#include <cstddef>
#include <utility>

namespace oxmv::detail {

// An object that counts the handles on it and deletes itself with the last one. The count is
// atomic, because dictionaries on different threads may share a block that neither can see.
class Shared {
 public:
  Shared(const Shared&) = delete;
  Shared& operator=(const Shared&) = delete;

  void retain() const noexcept { references_.fetch_add(1, std::memory_order_relaxed); }
  void release() const noexcept {
    if (references_.fetch_sub(1, std::memory_order_acq_rel) == 1) destroy();
  }
  bool isUnique() const noexcept { return references_.load(std::memory_order_acquire) == 1; }

 protected:
  Shared() = default;
  virtual ~Shared() = default;

 private:
  // Deletes this, and whatever that releases in its turn, in a loop: a host may nest values a
  // million deep, and their end must not cost a stack frame each.
  void destroy() const noexcept;

  mutable std::atomic<std::size_t> references_{1};
  mutable const Shared* nextDoomed_ = nullptr;
};

// A handle on a T derived from Shared; may be empty.
template <class T>
class Ref {
 public:
  Ref() noexcept = default;
  // Takes over the one reference that a new object comes with.
  static Ref adopt(T* object) noexcept {
    Ref ref;
    ref.object_ = object;
    return ref;
  }
  Ref(const Ref& other) noexcept : object_(other.object_) {
    if (object_ != nullptr) object_->retain();
  }
  Ref(Ref&& other) noexcept : object_(std::exchange(other.object_, nullptr)) {}
  Ref& operator=(Ref other) noexcept {
    std::swap(object_, other.object_);
    return *this;
  }
  ~Ref() {
    if (object_ != nullptr) object_->release();
  }

  T* get() const noexcept { return object_; }
  T* operator->() const noexcept { return object_; }
  T& operator*() const noexcept { return *object_; }
  explicit operator bool() const noexcept { return object_ != nullptr; }
  // Gives the reference away; the handle is empty afterwards.
  T* detach() noexcept { return std::exchange(object_, nullptr); }

 private:
  T* object_ = nullptr;
};

}  // namespace oxmv::detail
