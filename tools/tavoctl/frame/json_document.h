// JSON: facts, and documents from a caller.
#ifndef TAVOCTL_JSON_DOCUMENT_H
#define TAVOCTL_JSON_DOCUMENT_H

#include "frame/column.h"

#include <nlohmann/json.hpp>

#include <string>

namespace tavoctl {

nlohmann::ordered_json ToJson(const Cell &cell);

// Throws a Failure for what is not JSON, has a key twice in one object, or is nested too deeply.
nlohmann::ordered_json ParseJsonDocument(const std::string &text);

}  // namespace tavoctl

#endif
