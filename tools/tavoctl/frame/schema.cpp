// Descriptions of the verbs for programs: JSON Schemas of the answers, and the list of the verbs.
#include "frame/program.h"
#include "frame/text.h"

#include <nlohmann/json.hpp>

#include <cerrno>
#include <fstream>

namespace tavoctl {
namespace {

using Json = nlohmann::ordered_json;

const char *TypeName(Kind kind)
{
    switch (kind) {
    case Kind::number:
    case Kind::bytes:
        return "integer";
    case Kind::truth:
        return "boolean";
    case Kind::texts:
        return "array";
    default:
        return "string";
    }
}

std::string About(const ColumnFacts &column)
{
    std::string about = column.about;
    const std::string unit = column.kind == Kind::bytes ? "bytes" : column.unit;
    if (!unit.empty())
        about += about.empty() ? unit : ", in " + unit;
    return about;
}

Json TypeOf(const ColumnFacts &column)
{
    Json type = Json::object();
    if (column.kind != Kind::any)
        type["type"] = column.maybe ? Json{TypeName(column.kind), "null"} : Json(TypeName(column.kind));
    if (column.kind == Kind::texts)
        type["items"] = {{"type", "string"}};
    if (const std::string about = About(column); !about.empty())
        type["description"] = about;
    return type;
}

enum class Details { few, some, all };  // which of the columns in_one are there: none, those that were chosen, all

// Every field is there, and no other one.
Json ObjectOf(const std::vector<ColumnFacts> &columns, Details details, Json properties)
{
    Json required = Json::array();
    for (const auto &[name, type] : properties.items())
        required.push_back(name);
    for (const ColumnFacts &column : columns) {
        if (column.place == in_one && details == Details::few)
            continue;
        properties[column.name] = TypeOf(column);
        if (column.place != in_one || details == Details::all)
            required.push_back(column.name);
    }
    return {{"type", "object"},
            {"properties", std::move(properties)},
            {"required", std::move(required)},
            {"additionalProperties", false}};
}

Json Version()
{
    return {{"format_version", {{"const", format_version}}}};
}

Json OneOf(const std::vector<ColumnFacts> &columns)
{
    return ObjectOf(columns, Details::all, Version());
}

Json ListOf(const std::vector<ColumnFacts> &columns, Details details = Details::few)
{
    Json properties = Version();
    properties["items"] = {{"type", "array"}, {"items", ObjectOf(columns, details, Json::object())}};
    return ObjectOf({}, Details::all, std::move(properties));
}

Json ChangeSchema(bool has_entries)
{
    Json properties = Version();
    properties["changed"] = {{"type", "boolean"}};
    properties["changes"] = {{"type", "array"},
                             {"items", ObjectOf(Facts(change_columns), Details::all, Json::object())}};
    if (has_entries) {
        Json entry = ObjectOf(Facts(entry_columns), Details::all, Json::object());
        entry["properties"]["result"]["enum"] = {"done", "planned", "unchanged", "failed"};
        properties["entries"] = {{"type", "array"}, {"items", std::move(entry)}};
    }
    Json schema = ObjectOf({}, Details::all, std::move(properties));
    schema["properties"]["dry_run"] = {{"const", true}};
    schema["properties"]["diff"] = {{"type", "string"}, {"description", "of the file that the verb edits"}};
    for (const char *id : {"uid", "gid"})
        schema["properties"][id] = {{"type", "integer"}, {"description", "the id that was chosen"}};
    const Json names = {{"type", "array"}, {"items", {{"type", "string"}}}};
    for (const auto &[name, about] :
         {std::pair("locked", "users that were created locked: the document has no hash of their password"),
          std::pair("failed", "what could not be done; all else was")}) {
        schema["properties"][name] = names;
        schema["properties"][name]["description"] = about;
    }
    return schema;
}

Json FailureSchema()
{
    constexpr ColumnFacts columns[] = {
        {"attempted", "what could not be done", Kind::text, false, in_list, ""},
        {"status", "the exit status", Kind::number, false, in_list, ""},
    };
    Json error = ObjectOf({std::begin(columns), std::end(columns)}, Details::all, Json::object());
    for (const char *name : {"reason", "code", "name", "module", "hint"})
        error["properties"][name] = {{"type", "string"}};
    error["properties"]["line"] = {{"type", "integer"}};
    Json properties = Version();
    properties["error"] = std::move(error);
    return ObjectOf({}, Details::all, std::move(properties));
}

Json SchemaOf(const Answer &answer)
{
    switch (answer.form) {
    case Answer::one:
        return OneOf(answer.columns);
    case Answer::list:
        return answer.or_one.empty() ? ListOf(answer.columns)
                                     : Json{{"anyOf", {ListOf(answer.columns), OneOf(answer.or_one)}}};
    case Answer::document:
        return ListOf(answer.columns, Details::some);
    case Answer::change:
        return ChangeSchema(answer.has_entries);
    case Answer::own:
        return Json::parse(answer.schema());
    default:
        return Json::object();
    }
}

std::string TraitNames(unsigned traits)
{
    std::vector<std::string> names;
    for (const auto &[trait, name] : std::initializer_list<std::pair<unsigned, const char *>>{
             {changes, "changes"}, {destroys, "destroys"}, {by_anybody, "by_anybody"}, {runs_program, "runs_program"}})
        if (traits & trait)
            names.emplace_back(name);
    return names.empty() ? "reads" : Joined(names, ",");
}

Json ArgumentJson(const ArgumentText &text)
{
    Json argument = {{"name", text.name},         {"value", text.value},    {"help", text.help},
                     {"required", text.required}, {"many", text.many},      {"kind", text.kind.name},
                     {"sample", text.sample},     {"choices", text.choices}};
    argument["wrong"] = text.kind.wrong ? Json(text.kind.wrong) : text.choices.empty() ? Json() : Json("nonsense");
    return argument;
}

std::string FormText(const Answer &answer)
{
    std::string fields;
    for (const ColumnFacts &column : answer.columns) {
        std::string type = column.kind == Kind::any     ? "any"
                           : column.kind == Kind::texts ? "[string]"
                                                        : TypeName(column.kind);
        if (column.kind == Kind::bytes)
            type = "bytes";
        fields += (fields.empty() ? "`" : ", `") + std::string(column.name) + "` " + type + (column.maybe ? "?" : "");
    }
    switch (answer.form) {
    case Answer::one:
        return fields;
    case Answer::list:
    case Answer::document:
        return "items: " + fields;
    case Answer::change:
        return answer.has_entries ? "changes, entries" : "changes";
    case Answer::own:
        return std::string("[a document](") + answer.page + ")";
    default:
        return "";
    }
}

}  // namespace

std::string SchemaOf(const Family *family, const VerbEntry *entry)
{
    const std::string title = entry ? family->Command(*entry) : "A failure of tavoctl";
    Json schema = {{"$schema", "http://json-schema.org/draft-07/schema#"}, {"title", title}};
    schema.update(entry ? SchemaOf(entry->answer) : FailureSchema());
    return schema.dump(2);
}

std::string SchemaOfRecord(const std::vector<ColumnFacts> &columns, const std::vector<std::string> &required)
{
    Json properties = Json::object();
    for (const ColumnFacts &column : columns)
        properties[column.name] = TypeOf(column);
    return Json{{"type", "object"},
                {"properties", std::move(properties)},
                {"required", required},
                {"additionalProperties", false}}
        .dump();
}

void WriteSchemas(const Program &program, const std::string &folder)
{
    const auto write = [&](const std::string &name, const std::string &text) {
        std::ofstream file(folder + "/" + name + ".json");
        if (!(file << text << "\n").flush())
            throw SystemFailure("write " + folder + "/" + name + ".json", errno);
    };
    write("error", SchemaOf(nullptr, nullptr));
    for (const auto &family : program.Families())
        for (const VerbEntry &entry : family->Verbs())
            if (entry.answer.form != Answer::nothing)
                write(family->Name() + std::string(entry.name.empty() ? "" : "-") + entry.name,
                      SchemaOf(family.get(), &entry));
}

std::string RegistryJson(const Program &program)
{
    Json verbs = Json::array();
    for (const auto &family : program.Families())
        for (const VerbEntry &entry : family->Verbs()) {
            const ReadyVerb verb(*family, entry);
            Json arguments = Json::array();
            for (const ArgumentText &text : verb.Declared().Texts())
                arguments.push_back(ArgumentJson(text));
            verbs.push_back({{"family", family->Name()},
                             {"verb", entry.name},
                             {"traits", TraitNames(entry.traits)},
                             {"answer", entry.answer.form == Answer::change ? "change" : "facts"},
                             {"arguments", std::move(arguments)}});
        }
    return Json{{"format_version", format_version}, {"verbs", std::move(verbs)}}.dump(2);
}

std::string ManualText(const Program &program)
{
    std::string text = "| verb | does | JSON |\n|---|---|---|\n";
    for (const auto &family : program.Families())
        for (const VerbEntry &entry : family->Verbs()) {
            const ReadyVerb verb(*family, entry);
            std::string usage = family->Name() + std::string(entry.name.empty() ? "" : " ") + entry.name;
            for (const ArgumentText &argument : verb.Declared().Texts())
                if (argument.positional)
                    usage += (argument.required ? " " : " [") + argument.name + (argument.required ? "" : "]") +
                             (argument.many ? "..." : "");
            text += "| `" + usage + "` | " + entry.Summary() + " | " + FormText(entry.answer) + " |\n";
        }
    return text;
}

}  // namespace tavoctl
