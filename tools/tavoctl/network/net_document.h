// The whole network as one document: facts of the appliance and of its interfaces, read from JSON and written as JSON.
#ifndef TAVOCTL_NET_DOCUMENT_H
#define TAVOCTL_NET_DOCUMENT_H

#include "frame/column.h"

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace tavoctl {

// One fact that a document may state.
struct NetItem {
    enum Form : unsigned char { text, number, truth, texts };

    const char *name;
    Form form;
    bool may_be_null;     // null: there is none
    const char *feature;  // the feature that the start script must have; "" for one that all have
    const char *pattern;  // of the text, or of each of the texts, for the schema; "" for any
    const char *about;
    // Returns the canonical form of the text; nullopt when it is not valid.
    std::optional<std::string> (*normal)(const std::string &);
    const char *allowed = "";  // the valid texts, for people
    long least = 0;
    long most = 0;
};

// By name; a missing fact is not stated, an empty cell says that there is none.
using NetFactsMap = std::map<std::string, Cell>;

struct NetDocument {
    NetFactsMap net;
    std::map<std::string, NetFactsMap> cards;
    std::vector<std::string> absent;  // bonds and VLANs that shall not be there
};

extern const std::vector<NetItem> net_items;
extern const std::vector<NetItem> card_items;

std::string TextOf(const NetFactsMap &facts, const char *name);
std::vector<std::string> TextsOf(const NetFactsMap &facts, const char *name);
// Returns whether the fact is stated and is not null, false or an empty list.
bool IsGiven(const NetFactsMap &facts, const char *name);

// Returns what the files, or else the kernel, have in place of a wanted fact; nothing where neither differs. Facts that the
// kernel does not state do not differ there.
std::optional<Cell> Instead(const std::string &name, const Cell &wanted, const NetFactsMap &stored,
                            const NetFactsMap &live);

// Throws a Failure that names the place.
NetDocument ParseNetDocument(const std::string &text);

std::string JsonOf(const NetDocument &document);

// Changes what differs, in the files and in the kernel; throws a Failure at the first thing that fails. The caller holds
// the network lock and puts back.
void ApplyNet(const NetDocument &wanted);

// The JSON Schema of a document.
std::string NetDocumentSchema();

}  // namespace tavoctl

#endif
