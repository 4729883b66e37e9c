#pragma once

#include <memory>

/// Deletes a handle of a C library by calling the library's `release` on it.
template <auto release>
struct HandleDeleter {
  template <typename Handle>
  void operator()(Handle* handle) const {
    release(handle);
  }
};

/// Owns a handle of a C library, or memory that it allocated; `release` frees it.
template <typename Handle, auto release>
using HandlePtr = std::unique_ptr<Handle, HandleDeleter<release>>;
