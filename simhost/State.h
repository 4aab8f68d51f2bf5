// The host's state: domains, their sections in scenarios, and the one generic path by which
// host operations read and change them.
//
// A domain is one self-contained part of the host's state, a plain typed value declared in
// simhost/domains/ and listed once in Registry.def. Its type says which kind of domain it is:
//
//   struct Layouts {                                   // a singleton: one value
//       static constexpr char kSection[] = "keyboard";  // its scenario member
//       static constexpr StateKind kKind = StateKind::kSingleton;
//       static Layouts Default();                       // the documented default state
//       ...members, described with Describe (Mapping.h)...
//   };
//
// kCollection: many values of the type, each with `std::string Key() const`, kept in order
// (Default() returns the default list); kLog: an append-only list of entries without keys.
// Optional hooks: `std::string Check() const` (a rule across members), and for the next boot
// `static void Boot(T&)` (singleton) or `static bool Boot(T&)` (collection item; false removes
// it). A scenario section that is missing means the domain's default state.
//
// Singletons are stored as one JSON value each, collections one JSON value per item in a keyed,
// ordered table; no domain writes SQL of its own for that. Read with Load<T>(db) or Items<T>;
// change through Call::Update / Call::Change (Call.h) so that the change and its journal entry
// commit together. Staged<T> keeps changes of a host object until its final call (SaveConfig,
// Commit) applies them at once.
//
// Everything throws HostError; state that cannot be read back is reported as kDamaged.
#pragma once

#include <simhost/Db.h>
#include <simhost/Export.h>
#include <simhost/Mapping.h>

#include <nlohmann/json.hpp>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <type_traits>
#include <unordered_set>
#include <utility>
#include <vector>

namespace simhost {

enum class StateKind { kSingleton, kCollection, kLog, kCustom };

// What a domain's section is populated into when a host is created or replaced: the database
// (inside the caller's write transaction) and the directory that becomes the host's root/.
struct WriteContext {
    Db& db;
    std::string root;
};

// One domain's part of a scenario, as a plain value owned by whoever parsed or read it.
class SIMHOST_API Section {
public:
    virtual ~Section() = default;
    // The section as it appears in a scenario.
    virtual nlohmann::ordered_json ToJson() const = 0;
    // Stores the section into an empty host.
    virtual void Write(WriteContext& context) const = 0;
};

class SIMHOST_API Domain {
public:
    virtual ~Domain() = default;
    // The scenario member that holds this domain, e.g. "identity".
    virtual const char* Name() const = 0;
    // A text that changes whenever the domain's stored shape does (for the schema version).
    virtual std::string Shape() const = 0;
    // Parses and validates the domain's section; value is nullptr when the scenario lacks it,
    // which means the domain's default state.
    virtual std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const = 0;
    // Reads the domain's current state; root is the host's root/ directory.
    virtual std::unique_ptr<Section> Read(Db& db, const std::string& root) const = 0;
    // Turns the next-boot configuration into the current state (a reboot of the host).
    virtual void Boot(Db&) const {}
};

// Every domain, in Registry.def order. Owned by the library; valid for the process's lifetime.
SIMHOST_API const std::vector<const Domain*>& Domains();

// Applies every domain's next-boot configuration, in Registry.def order; the caller holds the
// write transaction.
SIMHOST_API void BootAllDomains(Db& db);

// ---- storage -------------------------------------------------------------------------------------

namespace store {
// The tables every domain shares: "state" (one JSON value per singleton) and "items" (one JSON
// value per collection item, keyed and ordered by insertion).
SIMHOST_API const char* Schema();
SIMHOST_API std::optional<std::string> LoadState(Db& db, const char* domain);
SIMHOST_API void SaveState(Db& db, const char* domain, const std::string& json);

SIMHOST_API std::optional<std::string> FindItem(Db& db, const char* domain, const std::string& key);
SIMHOST_API void ForEachItem(Db& db, const char* domain,
                             const std::function<void(const std::string& key, const std::string& json)>& fn);
// Items whose keys start with prefix, in order.
SIMHOST_API void ForEachItemWithPrefix(
    Db& db, const char* domain, const std::string& prefix,
    const std::function<void(const std::string& key, const std::string& json)>& fn);
SIMHOST_API std::int64_t CountItems(Db& db, const char* domain);
// Items whose JSON member `member` (a top-level name) equals the text `value`, counted without
// decoding them; an item that is not JSON fails the count (HostError).
SIMHOST_API std::int64_t CountItemsWhere(Db& db, const char* domain, const char* member,
                                         const std::string& value);
// Replaces an existing item in place, or appends a new one.
SIMHOST_API void PutItem(Db& db, const char* domain, const std::string& key, const std::string& json);
SIMHOST_API bool EraseItem(Db& db, const char* domain, const std::string& key);
SIMHOST_API void ClearItems(Db& db, const char* domain);
// Appends an entry to a log domain under the next sequence key.
SIMHOST_API void AppendEntry(Db& db, const char* domain, const std::string& json);
}  // namespace store

namespace state_detail {

template <class T, class = void>
struct HasSingletonBoot : std::false_type {};
template <class T>
struct HasSingletonBoot<T, decltype(T::Boot(std::declval<T&>()))> : std::true_type {};

template <class T, class = void>
struct HasItemBoot : std::false_type {};
template <class T>
struct HasItemBoot<T, std::enable_if_t<std::is_same<decltype(T::Boot(std::declval<T&>())), bool>::value>>
    : std::true_type {};

SIMHOST_API std::string Missing(const char* domain);

}  // namespace state_detail

// The singleton domain T's current value.
template <class T>
T Load(Db& db) {
    static_assert(T::kKind == StateKind::kSingleton, "Load is for singleton domains");
    std::optional<std::string> text = store::LoadState(db, T::kSection);
    if (!text) throw HostError(state_detail::Missing(T::kSection), HostError::Code::kDamaged);
    return FromStoredJson<T>(*text, T{}, std::string("the ") + T::kSection + " state");
}

// Stores a new value of the singleton domain T; refuses (HostError) a value that breaks its
// rules, naming the member.
template <class T>
void Save(Db& db, const T& value) {
    std::string problem = Verify(value);
    if (!problem.empty()) throw HostError(problem);
    store::SaveState(db, T::kSection, ToStoredJson(value));
}

// The items of the collection or log domain T.
template <class T>
class Items {
public:
    explicit Items(Db& db) : db_(db) {}

    std::optional<T> Find(const std::string& key) const {
        std::optional<std::string> text = store::FindItem(db_, T::kSection, key);
        if (!text) return std::nullopt;
        return Decode(*text);
    }
    bool Contains(const std::string& key) const {
        return store::FindItem(db_, T::kSection, key).has_value();
    }
    std::vector<T> All() const {
        std::vector<T> all;
        ForEach([&](T item) { all.push_back(std::move(item)); });
        return all;
    }
    // fn(T) for every item, in order.
    template <class Fn>
    void ForEach(Fn fn) const {
        store::ForEachItem(db_, T::kSection,
                           [&](const std::string&, const std::string& text) { fn(Decode(text)); });
    }
    // fn(T) for every item whose key starts with prefix, in order.
    template <class Fn>
    void ForEachWithPrefix(const std::string& prefix, Fn fn) const {
        store::ForEachItemWithPrefix(
            db_, T::kSection, prefix,
            [&](const std::string&, const std::string& text) { fn(Decode(text)); });
    }
    std::int64_t Count() const { return store::CountItems(db_, T::kSection); }
    // The number of items whose member `member` holds the text `value`.
    std::int64_t CountWhere(const char* member, const std::string& value) const {
        return store::CountItemsWhere(db_, T::kSection, member, value);
    }

    // Replaces the item with the same key in place, or appends it; refuses an item that breaks
    // its rules.
    void Put(const T& item) {
        static_assert(T::kKind == StateKind::kCollection, "Put is for collections");
        std::string problem = Verify(item);
        if (!problem.empty()) throw HostError(problem);
        store::PutItem(db_, T::kSection, item.Key(), ToStoredJson(item));
    }
    bool Erase(const std::string& key) { return store::EraseItem(db_, T::kSection, key); }
    void Clear() { store::ClearItems(db_, T::kSection); }
    // Appends an entry to a log.
    void Append(const T& entry) {
        static_assert(T::kKind == StateKind::kLog, "Append is for logs");
        std::string problem = Verify(entry);
        if (!problem.empty()) throw HostError(problem);
        store::AppendEntry(db_, T::kSection, ToStoredJson(entry));
    }

private:
    static T Decode(const std::string& text) {
        return FromStoredJson<T>(text, T{}, std::string("an item of ") + T::kSection);
    }
    Db& db_;
};

// ---- the domains of typed state -----------------------------------------------------------------

template <class T>
class SingletonSection : public Section {
public:
    explicit SingletonSection(T value) : value_(std::move(value)) {}
    nlohmann::ordered_json ToJson() const override { return Codec<T>::Write(value_); }
    void Write(WriteContext& context) const override { Save(context.db, value_); }

private:
    T value_;
};

template <class T>
class ListSection : public Section {
public:
    explicit ListSection(std::vector<T> items) : items_(std::move(items)) {}
    nlohmann::ordered_json ToJson() const override { return Codec<std::vector<T>>::Write(items_); }
    void Write(WriteContext& context) const override {
        Items<T> items(context.db);
        for (const T& item : items_) {
            if constexpr (T::kKind == StateKind::kLog)
                items.Append(item);
            else
                items.Put(item);
        }
    }

private:
    std::vector<T> items_;
};


template <class T>
class SingletonDomain : public Domain {
public:
    const char* Name() const override { return T::kSection; }
    std::string Shape() const override {
        std::string shape;
        Codec<T>::Shape(shape);
        return shape;
    }
    std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const override {
        T state = T::Default();
        if (value) Codec<T>::Read(*value, at, state);
        return std::make_unique<SingletonSection<T>>(std::move(state));
    }
    std::unique_ptr<Section> Read(Db& db, const std::string&) const override {
        return std::make_unique<SingletonSection<T>>(Load<T>(db));
    }
    void Boot(Db& db) const override {
        if constexpr (state_detail::HasSingletonBoot<T>::value) {
            T state = Load<T>(db);
            T::Boot(state);
            Save(db, state);
        }
    }
};

// Collections and logs: the section is the list of items, in order.
template <class T>
class ListDomain : public Domain {
public:
    const char* Name() const override { return T::kSection; }
    std::string Shape() const override {
        std::string shape;
        Codec<std::vector<T>>::Shape(shape);
        return shape;
    }
    std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const override {
        std::vector<T> items = T::Default();
        if (value) Codec<std::vector<T>>::Read(*value, at, items);
        if constexpr (T::kKind == StateKind::kCollection) {
            // One pass with a set: a generated host of 100,000 items must not cost n^2 / 2.
            std::unordered_set<std::string> keys;
            keys.reserve(items.size());
            for (std::size_t i = 0; i < items.size(); ++i)
                if (!keys.insert(items[i].Key()).second)
                    at.Index(i).Fail("'" + items[i].Key() + "' appears twice");
        }
        return std::make_unique<ListSection<T>>(std::move(items));
    }
    std::unique_ptr<Section> Read(Db& db, const std::string&) const override {
        return std::make_unique<ListSection<T>>(Items<T>(db).All());
    }
    void Boot(Db& db) const override {
        if constexpr (state_detail::HasItemBoot<T>::value) {
            Items<T> items(db);
            for (T item : items.All()) {
                std::string key = item.Key();
                if (T::Boot(item))
                    items.Put(item);
                else
                    items.Erase(key);
            }
        }
    }
};

// The domain object of a domain type: the generic one for its kind, or the type's own
// (kCustom types provide `static const Domain& TheDomain()`).
template <class T>
const Domain& DomainOf() {
    if constexpr (T::kKind == StateKind::kSingleton) {
        static const SingletonDomain<T> domain;
        return domain;
    } else if constexpr (T::kKind == StateKind::kCustom) {
        return T::TheDomain();
    } else {
        static const ListDomain<T> domain;
        return domain;
    }
}

// ---- staged changes ------------------------------------------------------------------------------

class Call;

// Changes a host object has accepted but not yet applied: each is recorded with a name and a
// value for the journal and applied, in order, by Commit in one write transaction of the call
// that commits (SaveConfig, Commit, ...). Secret values never reach the journal.
class SIMHOST_API Stage {
public:
    void Add(const std::string& name, nlohmann::ordered_json value, std::function<void(Db&)> apply);
    void AddSecret(const std::string& name, std::function<void(Db&)> apply);
    bool Empty() const { return changes_.empty(); }
    // Applies every staged change and journals them under call's operation; the stage is empty
    // afterwards, whether the changes applied or a rule refused them (then nothing changed).
    void Commit(Call& call);
    void Discard();
    // Applies the staged changes to db without journaling (for a view inside a transaction).
    void ApplyTo(Db& db) const;

private:
    nlohmann::ordered_json journal_ = nlohmann::ordered_json::object();
    std::vector<std::function<void(Db&)>> changes_;
};

// Staged changes to the singleton domain T.
template <class T>
class Staged {
public:
    template <class Fn>
    void Set(const std::string& name, nlohmann::ordered_json value, Fn change) {
        changes_.push_back(change);
        stage_.Add(name, std::move(value), [change](Db& db) {
            T state = Load<T>(db);
            change(state);
            Save(db, state);
        });
    }
    template <class Fn>
    void SetSecret(const std::string& name, Fn change) {
        changes_.push_back(change);
        stage_.AddSecret(name, [change](Db& db) {
            T state = Load<T>(db);
            change(state);
            Save(db, state);
        });
    }
    bool Empty() const { return stage_.Empty(); }
    // The stored state with the staged changes applied, as it would be after Commit.
    T View(Db& db) const {
        T state = Load<T>(db);
        for (const auto& change : changes_) change(state);
        return state;
    }
    void Commit(Call& call) {
        changes_.clear();
        stage_.Commit(call);
    }
    void Discard() {
        changes_.clear();
        stage_.Discard();
    }

private:
    Stage stage_;
    std::vector<std::function<void(T&)>> changes_;
};

}  // namespace simhost
