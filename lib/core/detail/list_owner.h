// Owners of a string list and a string hash. Addr() is for functions that may move the block.
#ifndef TAVO_CORE_DETAIL_LIST_OWNER_H
#define TAVO_CORE_DETAIL_LIST_OWNER_H

#include "tavo_hash.h"
#include "tavo_list.h"

#include "core/detail/owner.h"

#include <utility>

namespace tavo {

template <class Container, void (*Free)(Container *)>
class ContainerOwner {
  public:
    ContainerOwner() noexcept = default;
    explicit ContainerOwner(Container *container) noexcept : container_(container) {}
    ContainerOwner(ContainerOwner &&other) noexcept : container_(other.Release()) {}
    ContainerOwner &operator=(ContainerOwner &&other) noexcept
    {
        if (this != &other)
            Reset(other.Release());
        return *this;
    }
    ~ContainerOwner()
    {
        if (container_)
            Reset();
    }

    explicit operator bool() const noexcept { return container_ != nullptr; }
    Container *Get() const noexcept { return container_; }
    Container *operator->() const noexcept { return container_; }
    Container **Addr() noexcept { return &container_; }
    Container *Release() noexcept { return std::exchange(container_, nullptr); }

    void Reset(Container *container = nullptr) noexcept
    {
        KeepErrno keep;
        Free(container_);
        container_ = container;
    }

  private:
    Container *container_ = nullptr;
};

using ListOwner = ContainerOwner<TLIBSZLIST, TLIBSzListFree>;
using HashOwner = ContainerOwner<TLIBSZHASH, TLIBSzHashFree>;

}  // namespace tavo

#endif
