// The settings of an interface and the gateway as they are now, so that they can be put back exactly.
#ifndef TAVOCTL_NET_SNAPSHOT_H
#define TAVOCTL_NET_SNAPSHOT_H

#include "tavo_net.h"

#include <cstdio>
#include <optional>
#include <string>

namespace tavoctl {

// As the kernel names them; throws a Failure for what cannot be a name.
void CheckInterface(const std::string &attempted, const std::string &interface);

// The first interface; throws a Failure when there is none.
TAVONETCARD FirstCard(const std::string &attempted);

// Fills a field of a record; what does not fit is cut.
template <std::size_t Size>
void Put(char (&field)[Size], const std::string &text)
{
    std::snprintf(field, Size, "%s", text.c_str());
}

class NetSnapshot {
  public:
    explicit NetSnapshot(const std::string &interface);

    // The card as its file, or else the kernel, has it.
    const TAVONETCARD &Card() const { return card_; }

    // In the kernel and in the files, byte for byte. False when somebody holds the network's lock, or it failed.
    bool PutBack() const;

  private:
    bool PutBackFiles() const;
    bool PutBackKernel() const;

    std::string file_;
    std::optional<std::string> file_text_;     // empty: there was no file
    std::optional<std::string> network_text_;  // of /etc/sysconfig/network
    std::string gateway_;                      // the kernel's, "" for none
    TAVONETCARD card_ = {};
};

}  // namespace tavoctl

#endif
