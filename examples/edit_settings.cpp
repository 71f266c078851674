// Sets many keys of a settings file in one rewrite, under the lock that other programs of the appliance respect:
// edit_settings FILE KEY=VALUE...
#include <tavosdk.h>

#include <cstdio>
#include <string>

namespace {

class Lock {
  public:
    explicit Lock(unsigned lock) : lock_(lock), held_(Take(lock)) {}
    ~Lock()
    {
        if (held_)
            ErrTLIBFileUnlock(lock_);
    }
    Lock(const Lock &) = delete;
    Lock &operator=(const Lock &) = delete;
    explicit operator bool() const { return held_; }

  private:
    static bool Take(unsigned lock)
    {
        return ErrTLIBFileLock(lock | TAVO_LOCK_EXCLUSIVE | TAVO_LOCK_NONBLOCKING, 5) == 0;
    }

    unsigned lock_;
    bool held_;
};

// A hash moves when it grows, so what is freed is where it is at the end.
class Pairs {
  public:
    ~Pairs() { TLIBSzHashFree(hash_); }
    bool Set(const std::string &key, const std::string &value)
    {
        return TLIBSzHashSetValue(&hash_, key.c_str(), value.c_str()) >= 0;
    }
    const TLIBSZHASH *Get() const { return hash_; }

  private:
    TLIBSZHASH *hash_ = PshTLIBSzHashAlloc(1024);
};

}  // namespace

int main(int argc, char **argv)
{
    Pairs pairs;
    for (int i = 2; i < argc; ++i) {
        const std::string pair = argv[i];
        const auto equals = pair.find('=');
        if (equals == std::string::npos || !pairs.Set(pair.substr(0, equals), pair.substr(equals + 1))) {
            std::fprintf(stderr, "not KEY=VALUE: %s\n", argv[i]);
            return 2;
        }
    }
    const Lock lock(TAVO_LOCK_TAVOINFO);
    if (!lock || argc < 3 || TLIBFileSetKeys(argv[1], pairs.Get(), nullptr) < 0) {
        std::fprintf(stderr, "nothing was changed: 0x%04X\n", static_cast<unsigned>(TLIBErrGet()));
        return 1;
    }
    std::printf("%d settings written\n", TLIBSzHashPairNum(pairs.Get()));
    return 0;
}
