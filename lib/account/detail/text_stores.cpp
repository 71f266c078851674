// The stores of a family as the text files give them.
#include "account/detail/text_stores.h"

#include "tavo_error.h"

#include "account/detail/account_name.h"
#include "core/detail/text_fields.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace tavo {
namespace {

constexpr int kSingleLookups = 8;  // then everything is parsed, once

bool IsAsciiKey(std::string_view name, std::string_view upper)
{
    return name.size() == upper.size() &&
           std::equal(name.begin(), name.end(), upper.begin(), [](char byte, char wanted) {
               return (byte >= 'a' && byte <= 'z' ? static_cast<char>(byte - 'a' + 'A') : byte) == wanted;
           });
}

bool HasKey(std::string_view line, std::string_view key, size_t key_size)
{
    const std::string_view name = line.substr(0, line.find(':'));
    if (IsAsciiKey(name, key.substr(0, key.size() - 1)))
        return true;
    const bool ascii = std::all_of(name.begin(), name.end(), [](char byte) { return (byte & 0x80) == 0; });
    return !ascii && AccountKey(name, key_size) == key;
}

size_t TextOf(const StoreFamily &family, const StoreRow &store)
{
    size_t text = 0;
    while (std::strcmp(family.texts[text].path, store.text) != 0)
        ++text;
    return text;
}

}  // namespace

class TextStores::Lines : public StoreView {
  public:
    Lines(TextStores &stores, size_t index) : stores_(stores), index_(index) {}

    Result<std::string_view> Get(std::string_view key) const override
    {
        if (IsSecret())
            return ERR_ACCESS_DENIED;
        const StoreEntries *entries = nullptr;
        if (index_ != stores_.kind_.id_store && key.ends_with('\0') && ++lookups_ <= kSingleLookups) {
            found_ = std::move(stores_.EntriesOf(key)[index_]);
            entries = &found_;
        } else {
            entries = &stores_.All(index_);
        }
        const auto found = entries->find(key);
        if (found == entries->end())
            return ERR_KEY_NOT_FOUND;
        return std::string_view(found->second);
    }

    Code Walk(Entry which, std::string_view &key, std::string_view &value) override
    {
        if (IsSecret())
            return ERR_ACCESS_DENIED;
        const StoreEntries &entries = stores_.All(index_);
        if (which == Entry::first)
            next_ = entries.begin();
        while (next_ != entries.end() && next_->first.starts_with('#'))
            ++next_;
        if (next_ == entries.end())
            return ERR_DB_END;
        key = next_->first;
        value = next_->second;
        ++next_;
        return 0;
    }

  private:
    bool IsSecret() const { return stores_.kind_.family.stores[index_].mode == kSecretStore; }

    TextStores &stores_;
    size_t index_;
    mutable int lookups_ = 0;
    mutable StoreEntries found_;
    StoreEntries::const_iterator next_;
};

Code TextStores::Open(std::span<const size_t> stores)
{
    const StoreFamily &family = kind_.family;
    texts_.assign(family.texts.size(), {});
    views_.clear();
    views_.resize(family.stores.size());
    std::vector<bool> wanted(family.texts.size());
    wanted[TextOf(family, family.stores[kind_.name_store])] = true;
    for (const size_t index : stores) {
        views_[index] = std::make_unique<Lines>(*this, index);
        if (family.stores[index].mode != kSecretStore)
            wanted[TextOf(family, family.stores[index])] = true;
    }
    for (size_t i = 0; i < texts_.size(); ++i) {
        int64_t ignored = 0;
        if (wanted[i] && !ReadTextFile(family.texts[i].path, texts_[i], ignored))
            return errno == EACCES || errno == EPERM ? ERR_ACCESS_DENIED : ERR_READ_FAILED;
    }
    return 0;
}

std::vector<StoreEntries> TextStores::EntriesOf(std::string_view key) const
{
    std::vector<std::string> lines(texts_.size());
    for (size_t i = 0; i < texts_.size(); ++i)
        for (std::string_view rest = texts_[i]; !rest.empty();)
            if (const std::string_view line = TakeLine(rest); HasKey(line, key, kind_.key_size))
                lines[i].append(line) += '\n';
    return kind_.entries(lines);
}

const StoreEntries &TextStores::All(size_t index)
{
    if (all_.empty())
        all_ = kind_.entries(texts_);
    return all_[index];
}

}  // namespace tavo
