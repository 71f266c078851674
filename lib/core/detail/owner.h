// Owners of resources: one class per resource. Their destructors keep errno, because they run between a failed call and
// the report that reads it.
#ifndef TAVO_CORE_DETAIL_OWNER_H
#define TAVO_CORE_DETAIL_OWNER_H

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <type_traits>
#include <utility>

#include <unistd.h>

namespace tavo {

class KeepErrno {
  public:
    KeepErrno() noexcept = default;
    ~KeepErrno() { errno = saved_; }
    KeepErrno(const KeepErrno &) = delete;
    KeepErrno &operator=(const KeepErrno &) = delete;

  private:
    int saved_ = errno;
};

// A file descriptor.
class Fd {
  public:
    Fd() noexcept = default;
    explicit Fd(int fd) noexcept : fd_(fd) {}
    Fd(Fd &&other) noexcept : fd_(other.Release()) {}
    Fd &operator=(Fd &&other) noexcept
    {
        if (this != &other)
            Reset(other.Release());
        return *this;
    }
    ~Fd() { Reset(); }

    explicit operator bool() const noexcept { return fd_ >= 0; }
    int Get() const noexcept { return fd_; }
    int Release() noexcept { return std::exchange(fd_, -1); }

    void Reset(int fd = -1) noexcept
    {
        KeepErrno keep;
        if (fd_ >= 0)
            ::close(fd_);
        fd_ = fd;
    }

    // Closes; false when the kernel could not store everything that was written.
    bool Close() noexcept { return fd_ < 0 || ::close(Release()) == 0; }

  private:
    int fd_ = -1;
};

// A stdio stream.
class File {
  public:
    File() noexcept = default;
    explicit File(std::FILE *stream) noexcept : stream_(stream) {}
    File(File &&other) noexcept : stream_(other.Release()) {}
    File &operator=(File &&other) noexcept
    {
        if (this != &other)
            Reset(other.Release());
        return *this;
    }
    ~File() { Reset(); }

    explicit operator bool() const noexcept { return stream_ != nullptr; }
    std::FILE *Get() const noexcept { return stream_; }
    std::FILE *Release() noexcept { return std::exchange(stream_, nullptr); }
    int Descriptor() const noexcept { return ::fileno(stream_); }

    void Reset(std::FILE *stream = nullptr) noexcept
    {
        KeepErrno keep;
        if (stream_)
            std::fclose(stream_);
        stream_ = stream;
    }

    // Flushes and closes; false when not everything was written.
    bool Close() noexcept { return !stream_ || std::fclose(Release()) == 0; }

  private:
    std::FILE *stream_ = nullptr;
};

// For std::unique_ptr: releases a record by the function of its family, such as FreedBy<RAIDInfoFree>.
template <auto release>
struct FreedBy {
    template <class Record>
    void operator()(Record *record) const
    {
        release(record);
    }
};

// A block from malloc, for a caller that releases it with free.
template <class T>
class HeapBlock {
  public:
    HeapBlock() noexcept = default;
    explicit HeapBlock(T *block) noexcept : block_(block) {}
    HeapBlock(HeapBlock &&other) noexcept : block_(other.Release()) {}
    HeapBlock &operator=(HeapBlock &&other) noexcept
    {
        if (this != &other)
            Reset(other.Release());
        return *this;
    }
    ~HeapBlock() { Reset(); }

    explicit operator bool() const noexcept { return block_ != nullptr; }
    T *Get() const noexcept { return block_; }
    std::add_lvalue_reference_t<T> operator*() const noexcept { return *block_; }
    T *operator->() const noexcept { return block_; }
    T *Release() noexcept { return std::exchange(block_, nullptr); }

    void Reset(T *block = nullptr) noexcept
    {
        KeepErrno keep;
        std::free(block_);
        block_ = block;
    }

  private:
    T *block_ = nullptr;
};

}  // namespace tavo

#endif
