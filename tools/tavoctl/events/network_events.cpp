// Events of links and addresses.
#include "events/event.h"
#include "events/kernel_socket.h"
#include "frame/files.h"

#include <map>
#include <string>

#include <arpa/inet.h>
#include <linux/rtnetlink.h>
#include <net/if.h>

namespace tavoctl {
namespace {

constexpr unsigned lower_up = 1U << 16;  // IFF_LOWER_UP of <linux/if.h>, which does not go beside <net/if.h>

class NetworkSource : public EventSource {
  public:
    NetworkSource()
    {
        struct if_nameindex *const names = ::if_nameindex();
        for (const struct if_nameindex *entry = names; entry && entry->if_index; ++entry)
            links_[entry->if_index] = {entry->if_name, HasCarrier(entry->if_name)};
        ::if_freenameindex(names);
    }

    std::vector<pollfd> Wanted() const override { return {{socket_.Get(), POLLIN, 0}}; }

    void Look(std::vector<Event> &events) override
    {
        while (const auto bytes = socket_.Receive()) {
            auto left = static_cast<unsigned>(bytes->size());
            for (auto *message = reinterpret_cast<const nlmsghdr *>(bytes->data()); NLMSG_OK(message, left);
                 message = NLMSG_NEXT(message, left))
                Take(*message, events);
        }
    }

  private:
    struct Link {
        std::string name;
        bool up;
    };

    static bool HasCarrier(const std::string &name) { return KernelText("/sys/class/net/" + name + "/carrier") == "1"; }

    void Take(const nlmsghdr &message, std::vector<Event> &events)
    {
        switch (message.nlmsg_type) {
        case RTM_NEWLINK:
        case RTM_DELLINK:
            TakeLink(message, events);
            break;
        case RTM_NEWADDR:
        case RTM_DELADDR:
            TakeAddress(message, events);
            break;
        default:
            break;
        }
    }

    void TakeLink(const nlmsghdr &message, std::vector<Event> &events)
    {
        const auto *info = static_cast<const ifinfomsg *>(NLMSG_DATA(&message));
        const auto index = static_cast<unsigned>(info->ifi_index);
        std::string name;
        auto left = static_cast<int>(IFLA_PAYLOAD(&message));
        for (const rtattr *attribute = IFLA_RTA(info); RTA_OK(attribute, left); attribute = RTA_NEXT(attribute, left))
            if (attribute->rta_type == IFLA_IFNAME)
                name = static_cast<const char *>(RTA_DATA(attribute));
        const bool up = message.nlmsg_type == RTM_NEWLINK && (info->ifi_flags & lower_up) != 0;
        const auto known = links_.find(index);
        if (known == links_.end() ? up : known->second.up != up)
            events.push_back({up ? "link-up" : "link-down", name, ""});
        if (message.nlmsg_type == RTM_DELLINK)
            links_.erase(index);
        else
            links_[index] = {name, up};
    }

    void TakeAddress(const nlmsghdr &message, std::vector<Event> &events) const
    {
        const auto *info = static_cast<const ifaddrmsg *>(NLMSG_DATA(&message));
        char text[INET6_ADDRSTRLEN] = "";
        auto left = static_cast<int>(IFA_PAYLOAD(&message));
        for (const rtattr *attribute = IFA_RTA(info); RTA_OK(attribute, left); attribute = RTA_NEXT(attribute, left))
            if (attribute->rta_type == (info->ifa_family == AF_INET ? IFA_LOCAL : IFA_ADDRESS))
                ::inet_ntop(info->ifa_family, RTA_DATA(attribute), text, sizeof text);
        const auto link = links_.find(info->ifa_index);
        events.push_back({message.nlmsg_type == RTM_NEWADDR ? "address-added" : "address-removed",
                          link == links_.end() ? "" : link->second.name,
                          std::string(text) + "/" + std::to_string(info->ifa_prefixlen)});
    }

    KernelSocket socket_{NETLINK_ROUTE, RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR};
    std::map<unsigned, Link> links_;
};

}  // namespace

Source NetworkEvents()
{
    return std::make_unique<NetworkSource>();
}

}  // namespace tavoctl
