// JSON from a caller.
#ifndef TAVOCTL_JSON_DOCUMENT_H
#define TAVOCTL_JSON_DOCUMENT_H

#include <nlohmann/json.hpp>

#include <string>

namespace tavoctl {

// Throws a Failure for what is not JSON, has a key twice in one object, or is nested too deeply.
nlohmann::ordered_json ParseJsonDocument(const std::string &text);

}  // namespace tavoctl

#endif
