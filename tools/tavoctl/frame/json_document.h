// JSON: facts, and documents from a caller.
#ifndef TAVOCTL_JSON_DOCUMENT_H
#define TAVOCTL_JSON_DOCUMENT_H

#include "frame/column.h"

#include <nlohmann/json.hpp>

#include <string>

namespace tavoctl {

nlohmann::ordered_json ToJson(const Cell &cell);

// Throws a Failure that names the place in a document of what is wrong; "" for the whole of it.
[[noreturn]] void RefuseDocument(const std::string &place, const std::string &why, const std::string &hint = {});

// An object with the present format_version. Throws a Failure for anything else, and for what is not JSON, has a key
// twice in one object, or is nested too deeply.
nlohmann::ordered_json ParseJsonDocument(const std::string &text);

}  // namespace tavoctl

#endif
