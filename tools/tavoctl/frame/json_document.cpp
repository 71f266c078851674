// JSON: facts, and documents from a caller.
#include "frame/json_document.h"

#include "frame/failure.h"
#include "frame/table.h"

#include <set>
#include <vector>

namespace tavoctl {
namespace {

using Json = nlohmann::ordered_json;

// Parsers that take the last of two equal keys let one half of a program see another document than the other.
class KeysOnce {
  public:
    bool operator()(int depth, Json::parse_event_t event, Json &parsed)
    {
        constexpr int deepest = 8;
        if (depth > deepest)
            RefuseDocument("", "nested too deeply");
        if (event == Json::parse_event_t::object_start)
            keys_.emplace_back();
        else if (event == Json::parse_event_t::object_end)
            keys_.pop_back();
        else if (event == Json::parse_event_t::key && !keys_.back().insert(parsed.get<std::string>()).second)
            RefuseDocument("", "duplicate field " + parsed.get<std::string>());
        return true;
    }

  private:
    std::vector<std::set<std::string>> keys_;
};

}  // namespace

Json ToJson(const Cell &cell)
{
    return std::visit(
        [](const auto &value) -> Json {
            if constexpr (std::is_same_v<std::decay_t<decltype(value)>, std::monostate>)
                return nullptr;
            else if constexpr (std::is_same_v<std::decay_t<decltype(value)>, Bytes>)
                return value.count;
            else
                return value;
        },
        cell.Get());
}

void RefuseDocument(const std::string &place, const std::string &why, const std::string &hint)
{
    throw UsageFailure("take the document", (place.empty() ? "" : place + ": ") + why, hint);
}

Json ParseJsonDocument(const std::string &text)
{
    try {
        Json document = Json::parse(text, KeysOnce());
        if (!document.is_object())
            RefuseDocument("", "not an object");
        if (document.value("format_version", Json()) != format_version)
            RefuseDocument("format_version", "not " + std::to_string(format_version));
        return document;
    } catch (const Json::exception &error) {
        std::string why = error.what();
        why = why.substr(why.find("] ") + 2);
        RefuseDocument("", "not JSON: " + why.substr(0, 200));
    }
}

}  // namespace tavoctl
