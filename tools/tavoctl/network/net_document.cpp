// The whole network as one document.
#include "network/net_document.h"

#include "frame/failure.h"
#include "frame/json_document.h"
#include "frame/table.h"
#include "network/net_text.h"

#include <algorithm>

namespace tavoctl {
namespace {

using Json = nlohmann::ordered_json;

constexpr char ipv4_network_pattern[] = R"(^[0-9]{1,3}(\.[0-9]{1,3}){3}/[0-9]{1,2}$)";
constexpr char ipv4_pattern[] = R"(^[0-9]{1,3}(\.[0-9]{1,3}){3}$)";
constexpr char ipv6_pattern[] = "^[0-9A-Fa-f:.]+$";  // matches IPv4 addresses, too
constexpr char ipv6_network_pattern[] = "^[0-9A-Fa-f:.]+/[0-9]{1,3}$";
constexpr char ipv4_card_allowed[] = "the IPv4 address of a host with the length of its network, 192.0.2.10/24";
constexpr char route_pattern[] = "^[0-9A-Fa-f:.]+/[0-9]{1,3}( via [0-9A-Fa-f:.]+)?$";
constexpr char interface_pattern[] = "^[A-Za-z0-9_.:-]{1,15}$";

}  // namespace

const std::vector<NetItem> net_items = {
    {"hostname", NetItem::text, false, "", "^[A-Za-z_][A-Za-z0-9_-]{0,14}$", "of the appliance", NormalHostname,
     "1 to 15 letters, digits, \"-\" and \"_\", with a letter first"},
    {"gateway", NetItem::text, true, "", ipv4_pattern, "the IPv4 router, while the first card has a static address",
     NormalIpv4, "the IPv4 address of a host"},
    {"dns", NetItem::texts, false, "", ipv6_pattern, "the name servers, in the order in which they are asked",
     NormalServer, "the IPv4 or IPv6 address of a host"},
    {"search", NetItem::texts, false, "search", "^[A-Za-z0-9.-]{1,255}$", "domains in which a short name is looked up",
     NormalDomain, "the name of a domain"},
};

const std::vector<NetItem> card_items = {
    {"bond", NetItem::text, false, "bonds", "^(lacp|adaptive|backup)$", "how the members work together", NormalBondMode,
     "lacp, adaptive or backup"},
    {"members", NetItem::texts, false, "bonds", interface_pattern, "the cards of a bond", NormalInterface,
     "the name of an interface"},
    {"parent", NetItem::text, false, "vlans", interface_pattern, "the interface that carries a VLAN", NormalInterface,
     "the name of an interface"},
    {"vlan", NetItem::number, false, "vlans", "", "the number of the VLAN", nullptr, "", 1, 4094},
    {"mode", NetItem::text, false, "", "^(dhcp|static|none)$", "where the address comes from", NormalCardMode,
     "dhcp, static or none"},
    {"address", NetItem::text, true, "", ipv4_network_pattern, "of a static card, with the length of its mask",
     NormalIpv4Card, ipv4_card_allowed},
    {"more_addresses", NetItem::texts, false, "addresses", ipv4_network_pattern, "further IPv4 addresses",
     NormalIpv4Card, ipv4_card_allowed},
    {"ipv6", NetItem::truth, false, "", "", "whether the card speaks IPv6", nullptr},
    {"ipv6_addresses", NetItem::texts, false, "", ipv6_network_pattern, "static ones", NormalIpv6Card,
     "the IPv6 address of a host with the length of its network, 2001:db8::10/64"},
    {"ipv6_gateway", NetItem::text, true, "ipv6_gateway", ipv6_pattern, "the IPv6 router on this card", NormalIpv6,
     "the IPv6 address of a host"},
    {"routes", NetItem::texts, false, "routes", route_pattern, "\"NETWORK/LENGTH via ROUTER\", or without a router",
     NormalRoute, "NETWORK/LENGTH via ROUTER, or NETWORK/LENGTH"},
    {"mtu", NetItem::number, false, "mtu", "", "in bytes", nullptr, "", 68, 65535},
    {"wake_on_lan", NetItem::truth, false, "wake_on_lan", "", "whether the card wakes the appliance", nullptr},
};

namespace {

std::string KnownFields(const std::vector<NetItem> &items, const char *before)
{
    std::string text = before;
    for (const NetItem &item : items)
        text += std::string(", ") + item.name;
    return text;
}

std::string OneText(const NetItem &item, const Json &value, const std::string &place)
{
    if (!value.is_string())
        RefuseDocument(place, "not a text");
    const std::string &given = value.get_ref<const std::string &>();
    const auto normal = given.find('\0') == given.npos ? item.normal(given) : std::nullopt;
    if (!normal)
        RefuseDocument(place, "\"" + given.substr(0, 80) + "\" is not valid", std::string("allowed: ") + item.allowed);
    return *normal;
}

constexpr std::size_t most_texts = 256;

Cell Texts(const NetItem &item, const Json &value, const std::string &place)
{
    if (!value.is_array())
        RefuseDocument(place, "not a list");
    if (value.size() > most_texts)
        RefuseDocument(place, "more than " + std::to_string(most_texts));
    std::vector<std::string> texts;
    for (const Json &one : value) {
        const std::string here = place + "[" + std::to_string(texts.size()) + "]";
        texts.push_back(OneText(item, one, here));
        if (std::count(texts.begin(), texts.end(), texts.back()) > 1)
            RefuseDocument(here, "duplicate " + texts.back());
    }
    // Only for name servers and search domains the order means something.
    const std::string name = item.name;
    if (name != "dns" && name != "search")
        std::sort(texts.begin(), texts.end());
    return texts;
}

Cell ValueOf(const NetItem &item, const Json &value, const std::string &place)
{
    if (value.is_null()) {
        if (!item.may_be_null)
            RefuseDocument(place, "cannot be null");
        return {};
    }
    switch (item.form) {
    case NetItem::text:
        return OneText(item, value, place);
    case NetItem::texts:
        return Texts(item, value, place);
    case NetItem::truth:
        if (!value.is_boolean())
            RefuseDocument(place, "neither true nor false");
        return value.get<bool>();
    case NetItem::number:
        break;
    }
    if (!value.is_number_integer() || (value.is_number_unsigned() && value.get<uint64_t>() > 1000000) ||
        value.get<int64_t>() < item.least || value.get<int64_t>() > item.most)
        RefuseDocument(place, "not a number from " + std::to_string(item.least) + " to " + std::to_string(item.most));
    return value.get<int64_t>();
}

void TakeFact(const std::vector<NetItem> &items, const std::string &name, const Json &value, const std::string &place,
              const char *others, NetFactsMap &facts)
{
    const auto item = std::find_if(items.begin(), items.end(), [&](const NetItem &one) { return name == one.name; });
    if (item == items.end())
        RefuseDocument(place, "there is no such field", "known: " + KnownFields(items, others));
    facts[name] = ValueOf(*item, value, place);
}

// Checks across several fields.
void CheckCard(const std::string &place, NetFactsMap &card)
{
    const auto has = [&](const char *name) { return card.contains(name); };
    if (has("bond") != has("members"))
        RefuseDocument(place, "a bond has both bond and members");
    if (has("members") && (TextsOf(card, "members").empty() || TextsOf(card, "members").size() > 8))
        RefuseDocument(place + ".members", "a bond has 1 to 8 members");
    if (has("parent") != has("vlan"))
        RefuseDocument(place, "a VLAN has both parent and vlan");
    if (has("vlan") && has("bond"))
        RefuseDocument(place, "a bond or a VLAN, not both");
    if (IsGiven(card, "address") && !has("mode"))
        card["mode"] = "static";
    const std::string mode = TextOf(card, "mode");
    if (mode == "static" && !IsGiven(card, "address"))
        RefuseDocument(place, "a static card has an address");
    if ((mode == "dhcp" || mode == "none") && IsGiven(card, "address"))
        RefuseDocument(place + ".address", "only a static card has one");
    if (has("address") && !has("mode"))
        RefuseDocument(place + ".address", "say \"mode\": \"none\" for a card without an address");
    if (!mode.empty())
        card.try_emplace("address");
    const bool needs_ipv6 = IsGiven(card, "ipv6_addresses") || IsGiven(card, "ipv6_gateway");
    if (has("ipv6") && !IsGiven(card, "ipv6") && needs_ipv6)
        RefuseDocument(place + ".ipv6", "off, but there are IPv6 addresses");
}

void TakeCard(const Json &value, const std::string &place, NetDocument &document)
{
    if (!value.is_object())
        RefuseDocument(place, "not an object");
    if (!value.contains("name") || !value["name"].is_string())
        RefuseDocument(place, "has no name");
    const auto name = NormalInterface(value["name"].get<std::string>());
    if (!name)
        RefuseDocument(place + ".name", "not the name of an interface");
    if (document.cards.contains(*name) || Contains(document.absent, *name))
        RefuseDocument(place + ".name", "duplicate card " + *name);
    if (value.contains("absent")) {
        if (value["absent"] != true || value.size() != 2)
            RefuseDocument(place + ".absent", "true, and nothing else beside the name");
        document.absent.push_back(*name);
        return;
    }
    NetFactsMap &card = document.cards[*name];
    for (const auto &[key, one] : value.items())
        if (key != "name")
            TakeFact(card_items, key, one, place + "." + key, "name, absent", card);
    CheckCard(place, card);
}

// Across cards.
void CheckDocument(const NetDocument &document)
{
    std::map<std::string, std::string> users;  // of addresses and of members
    const auto claim = [&](const std::string &what, const std::string &card) {
        if (const auto [user, fresh] = users.try_emplace(what, card); !fresh)
            RefuseDocument("card " + card, what + " is also that of " + user->second);
    };
    for (const auto &[name, card] : document.cards) {
        if (IsGiven(card, "address"))
            claim(PlainAddress(TextOf(card, "address")), name);
        for (const char *list : {"more_addresses", "ipv6_addresses"})
            for (const std::string &address : TextsOf(card, list))
                claim(PlainAddress(address), name);
        for (const std::string &member : TextsOf(card, "members")) {
            claim(member, name);
            const auto own = document.cards.find(member);
            if (member == name ||
                (own != document.cards.end() &&
                 (own->second.contains("bond") || own->second.contains("vlan") || IsGiven(own->second, "address"))))
                RefuseDocument("card " + name, member + " cannot be a member");
        }
        if (const std::string parent = TextOf(card, "parent"); !parent.empty()) {
            const auto own = document.cards.find(parent);
            if (parent == name || (own != document.cards.end() && own->second.contains("vlan")))
                RefuseDocument("card " + name, parent + " cannot carry a VLAN");
            claim(parent + " VLAN " + card.at("vlan").Text(), name);
        }
    }
}

void PutFacts(const std::vector<NetItem> &items, const NetFactsMap &facts, Json &object)
{
    for (const NetItem &item : items)
        if (const auto fact = facts.find(item.name); fact != facts.end())
            object[item.name] = ToJson(fact->second);
}

Json SchemaOf(const std::vector<NetItem> &items)
{
    Json properties = Json::object();
    for (const NetItem &item : items) {
        Json type = Json::object();
        const char *name = item.form == NetItem::text     ? "string"
                           : item.form == NetItem::number ? "integer"
                           : item.form == NetItem::truth  ? "boolean"
                                                          : "array";
        type["type"] = item.may_be_null ? Json{name, "null"} : Json(name);
        if (item.form == NetItem::text)
            type["pattern"] = item.pattern;
        if (item.form == NetItem::texts)
            type.update({{"items", {{"type", "string"}, {"pattern", item.pattern}}},
                         {"uniqueItems", true},
                         {"maxItems", most_texts}});
        if (item.form == NetItem::number)
            type.update({{"minimum", item.least}, {"maximum", item.most}});
        type["description"] = item.about;
        properties[item.name] = std::move(type);
    }
    return properties;
}

}  // namespace

std::string TextOf(const NetFactsMap &facts, const char *name)
{
    const auto fact = facts.find(name);
    const auto *text = fact == facts.end() ? nullptr : std::get_if<std::string>(&fact->second.Get());
    return text ? *text : "";
}

std::vector<std::string> TextsOf(const NetFactsMap &facts, const char *name)
{
    const auto fact = facts.find(name);
    const auto *texts = fact == facts.end() ? nullptr : std::get_if<std::vector<std::string>>(&fact->second.Get());
    return texts ? *texts : std::vector<std::string>();
}

bool IsGiven(const NetFactsMap &facts, const char *name)
{
    const auto fact = facts.find(name);
    if (fact == facts.end())
        return false;
    const Cell::Value &value = fact->second.Get();
    if (const auto *truth = std::get_if<bool>(&value))
        return *truth;
    if (const auto *texts = std::get_if<std::vector<std::string>>(&value))
        return !texts->empty();
    return !std::holds_alternative<std::monostate>(value);
}

std::optional<Cell> Instead(const std::string &name, const Cell &wanted, const NetFactsMap &stored,
                            const NetFactsMap &live)
{
    const auto file = stored.find(name);
    if (file == stored.end())
        return Cell();
    const auto kernel = live.find(name);
    return !(file->second == wanted)                             ? std::optional(file->second)
           : kernel != live.end() && !(kernel->second == wanted) ? std::optional(kernel->second)
                                                                 : std::nullopt;
}

NetDocument ParseNetDocument(const std::string &text)
{
    constexpr std::size_t most_cards = 256;
    const Json json = ParseJsonDocument(text);
    NetDocument document;
    for (const auto &[key, value] : json.items()) {
        if (key == "format_version" || key == "cards")
            continue;
        TakeFact(net_items, key, value, key, "format_version, cards", document.net);
    }
    if (json.contains("cards")) {
        const Json &cards = json["cards"];
        if (!cards.is_array() || cards.size() > most_cards)
            RefuseDocument("cards", "not a list of at most " + std::to_string(most_cards));
        for (std::size_t i = 0; i < cards.size(); ++i)
            TakeCard(cards[i], "cards[" + std::to_string(i) + "]", document);
    }
    CheckDocument(document);
    return document;
}

std::string JsonOf(const NetDocument &document)
{
    Json json = {{"format_version", format_version}};
    PutFacts(net_items, document.net, json);
    json["cards"] = Json::array();
    for (const auto &[name, facts] : document.cards) {
        Json card = {{"name", name}};
        PutFacts(card_items, facts, card);
        json["cards"].push_back(std::move(card));
    }
    return json.dump(2, ' ', true, Json::error_handler_t::replace);
}

std::string NetDocumentSchema()
{
    Json card = {
        {"name", {{"type", "string"}, {"pattern", interface_pattern}, {"description", "as the kernel names it"}}},
        {"absent", {{"const", true}, {"description", "removes a bond or a VLAN"}}}};
    card.update(SchemaOf(card_items));
    Json properties = {{"format_version", {{"const", format_version}}}};
    properties.update(SchemaOf(net_items));
    properties["cards"] = {{"type", "array"},
                           {"description", "the interfaces; those that are not listed stay as they are"},
                           {"items",
                            {{"type", "object"},
                             {"properties", std::move(card)},
                             {"required", {"name"}},
                             {"additionalProperties", false}}}};
    return Json{
        {"$schema", "http://json-schema.org/draft-07/schema#"},
        {"title", "The network of an appliance, as tavoctl net export writes it and tavoctl net apply reads it"},
        {"type", "object"},
        {"properties", std::move(properties)},
        {"required", {"format_version"}},
        {"additionalProperties", false}}
        .dump(2);
}

}  // namespace tavoctl
