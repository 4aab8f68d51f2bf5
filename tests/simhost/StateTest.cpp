// The typed state: a mapping written once serves scenario reading (with locations), writing and
// checking; the generic stores for singletons and collections; staged changes; boot hooks.
#include "TestSupport.h"

#include <simhost/Call.h>
#include <simhost/Host.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>
#include <simhost/domains/Clock.h>
#include <simhost/domains/Mounts.h>

#include <gtest/gtest.h>

#include <map>
#include <optional>

namespace {

struct Port {
    std::string name;
    std::uint16_t number = 0;
    bool open = false;
};

template <class V>
void Describe(V& v, Port& port) {
    v("name", port.name, simhost::Required(), simhost::Text(8, false));
    v("number", port.number, simhost::Range(1, 65535));
    v("open", port.open);
}

struct Firewall {
    std::string zone = "public";
    std::vector<Port> ports;
    std::map<std::string, std::string> labels;
    std::optional<std::int32_t> limit;
    std::vector<std::string> tags;

    std::string Check() const { return zone == "none" && !ports.empty() ? "a zone of none has no ports" : ""; }
};

template <class V>
void Describe(V& v, Firewall& f) {
    v("zone", f.zone, simhost::OneOf({"public", "internal", "none"}));
    v("ports", f.ports, simhost::MaxItems(3));
    v("labels", f.labels);
    v("limit", f.limit);
    v("tags", f.tags, simhost::Each(simhost::Text(4)));
}

std::string ReadError(const std::string& text) {
    Firewall firewall;
    try {
        simhost::Codec<Firewall>::Read(nlohmann::json::parse(text), simhost::Location().Member("fw"), firewall);
    } catch (const simhost::HostError& error) {
        return error.what();
    }
    return "(accepted)";
}

TEST(Mapping, ReadsOverlaysWritesInOrderAndRoundTrips) {
    Firewall firewall;
    firewall.zone = "internal";
    firewall.tags = {"keep"};
    simhost::Codec<Firewall>::Read(
        nlohmann::json::parse(R"({"ports": [{"name": "ssh", "number": 22}], "limit": 5,
                                 "labels": {"b": "2", "a": "1"}})"),
        simhost::Location(), firewall);
    EXPECT_EQ(firewall.zone, "internal");  // absent members keep the value they had
    EXPECT_EQ(firewall.tags, std::vector<std::string>{"keep"});
    ASSERT_EQ(firewall.ports.size(), 1u);
    EXPECT_EQ(firewall.ports[0].number, 22);
    EXPECT_FALSE(firewall.ports[0].open);  // a list element starts from its type's defaults
    EXPECT_EQ(firewall.limit, 5);
    nlohmann::ordered_json written = simhost::Codec<Firewall>::Write(firewall);
    EXPECT_EQ(written.dump(),
              R"({"zone":"internal","ports":[{"name":"ssh","number":22,"open":false}],)"
              R"("labels":{"a":"1","b":"2"},"limit":5,"tags":["keep"]})");
    Firewall again;
    simhost::Codec<Firewall>::Read(nlohmann::json::parse(written.dump()), simhost::Location(), again);
    EXPECT_EQ(simhost::Codec<Firewall>::Write(again), written);
    simhost::Codec<Firewall>::Read(nlohmann::json::parse(R"({"limit": null})"), simhost::Location(), again);
    EXPECT_FALSE(again.limit);
}

TEST(Mapping, EveryRefusalNamesItsLocation) {
    EXPECT_EQ(ReadError(R"({"zone": "dmz"})"),
              "scenario: fw.zone: expected \"public\", \"internal\" or \"none\"");
    EXPECT_EQ(ReadError(R"({"ports": [{"number": 1}]})"), "scenario: fw.ports[0]: missing member 'name'");
    EXPECT_EQ(ReadError(R"({"ports": [{"name": "a"}, {"name": "b", "number": 0}]})"),
              "scenario: fw.ports[1].number: expected an integer from 1 to 65535");
    EXPECT_EQ(ReadError(R"({"ports": [{"name": "a", "number": 70000}]})"),
              "scenario: fw.ports[0].number: expected an integer from 0 to 65535");
    EXPECT_EQ(ReadError(R"({"ports": [{"name": "a", "colour": 1}]})"),
              "scenario: fw.ports[0]: unknown member 'colour'");
    EXPECT_EQ(ReadError(R"({"ports": [{"name":"a"},{"name":"b"},{"name":"c"},{"name":"d"}]})"),
              "scenario: fw.ports: expected at most 3 items");
    EXPECT_EQ(ReadError(R"({"tags": ["ok", "toolong"]})"),
              "scenario: fw.tags[1]: expected a string of at most 4 bytes");
    EXPECT_EQ(ReadError(R"({"limit": 2147483648})"),
              "scenario: fw.limit: expected an integer from -2147483648 to 2147483647");
    EXPECT_EQ(ReadError(R"({"labels": {"a": 1}})"), "scenario: fw.labels.a: expected a string");
    EXPECT_EQ(ReadError(R"({"zone": "none", "ports": [{"name": "a"}]})"),
              "scenario: fw: a zone of none has no ports");
    EXPECT_EQ(ReadError(R"({"ports": {}})"), "scenario: fw.ports: expected an array");
}

TEST(Mapping, VerifyChecksAValueAgainstTheSameRules) {
    Firewall firewall;
    EXPECT_EQ(simhost::Verify(firewall), "");
    firewall.ports.push_back({"", 22, true});
    EXPECT_EQ(simhost::Verify(firewall), "ports[0].name: expected a non-empty string");
    firewall.ports[0].name = "web";
    firewall.tags = {"a", "bad\xff"};
    EXPECT_EQ(simhost::Verify(firewall), "tags[1]: expected UTF-8 text");
    firewall.tags.clear();
    firewall.zone = "none";
    EXPECT_EQ(simhost::Verify(firewall), "a zone of none has no ports");
}

class StateStoreTest : public ::testing::Test {
protected:
    simhost::TempHost host_{R"({"format": 1, "mounts": [{"target": "/b", "type": "tmpfs"},
                                                        {"target": "/a", "type": "tmpfs", "system": true}]})"};
};

TEST_F(StateStoreTest, CollectionsKeepTheirOrderAndReplaceInPlace) {
    simhost::Session session = simhost::Session::OpenCurrent();
    simhost::WriteTxn txn(session.db());
    simhost::Items<simhost::mounts::Mount> mounts(session.db());
    auto targets = [&] {
        std::vector<std::string> all;
        mounts.ForEach([&](const simhost::mounts::Mount& m) { all.push_back(m.target); });
        return all;
    };
    EXPECT_EQ(targets(), (std::vector<std::string>{"/b", "/a"}));
    simhost::mounts::Mount changed = *mounts.Find("/b");
    changed.options = "size=1m";
    mounts.Put(changed);
    mounts.Put({"/ab", "tmpfs", "", "", false});
    EXPECT_EQ(targets(), (std::vector<std::string>{"/b", "/a", "/ab"}));
    EXPECT_EQ(mounts.Find("/b")->options, "size=1m");
    std::vector<std::string> under_a;
    mounts.ForEachWithPrefix("/a", [&](const simhost::mounts::Mount& m) { under_a.push_back(m.target); });
    EXPECT_EQ(under_a, (std::vector<std::string>{"/a", "/ab"}));
    EXPECT_TRUE(mounts.Erase("/b"));
    EXPECT_FALSE(mounts.Erase("/b"));
    EXPECT_EQ(mounts.Count(), 2);
    EXPECT_FALSE(mounts.Find("/b"));
    EXPECT_THROW(mounts.Put({"relative", "tmpfs", "", "", false}), simhost::HostError);
}

TEST_F(StateStoreTest, ItemsAreCountedByOneMemberWithoutBeingDecoded) {
    simhost::Session session = simhost::Session::OpenCurrent();
    simhost::WriteTxn txn(session.db());
    simhost::Items<simhost::mounts::Mount> mounts(session.db());
    mounts.Put({"/tmpfs", "ramfs", "tmpfs", "", false});
    EXPECT_EQ(mounts.CountWhere("type", "tmpfs"), 2);
    EXPECT_EQ(mounts.CountWhere("type", "ramfs"), 1);
    EXPECT_EQ(mounts.CountWhere("source", "ramfs"), 0);  // only the named member counts
    EXPECT_EQ(mounts.CountWhere("type", "tmpfs "), 0);
    // Another domain's items with the same member are not counted.
    simhost::store::PutItem(session.db(), "dns_servers", "x", R"({"type": "tmpfs"})");
    EXPECT_EQ(mounts.CountWhere("type", "tmpfs"), 2);
    // An item that is not JSON fails the count instead of being skipped.
    simhost::store::PutItem(session.db(), "mounts", "/broken", "{\"type\": ");
    EXPECT_THROW(mounts.CountWhere("type", "tmpfs"), simhost::HostError);
}

TEST_F(StateStoreTest, BootKeepsWhatItsHooksKeep) {
    {
        simhost::Session session = simhost::Session::OpenCurrent();
        simhost::WriteTxn txn(session.db());
        simhost::BootAllDomains(session.db());
        txn.Commit();
    }
    auto mounts = nlohmann::json::parse(host_.host().Export())["mounts"];
    ASSERT_EQ(mounts.size(), 1u);
    EXPECT_EQ(mounts[0]["target"], "/a");
}

TEST_F(StateStoreTest, StagedChangesApplyTogetherAtCommitAndJournalOnce) {
    using simhost::simulation::Simulation;
    simhost::Staged<Simulation> staged;
    staged.Set("sleep_percent", 10, [](Simulation& s) { s.sleep_percent = 10; });
    staged.SetSecret("password", [](Simulation& s) { s.sleep_percent += 5; });
    {
        simhost::Session session = simhost::Session::OpenCurrent();
        EXPECT_EQ(staged.View(session.db()).sleep_percent, 15u);
        EXPECT_EQ(simhost::Load<Simulation>(session.db()).sleep_percent, 100u);  // not yet
    }
    {
        simhost::Call call(simhost::Op::SystemInfoImpl_New);
        staged.Commit(call);
        EXPECT_EQ(call.Read<Simulation>().sleep_percent, 15u);
    }
    EXPECT_TRUE(staged.Empty());
    auto journal = host_.host().Journal();
    ASSERT_EQ(journal.size(), 1u);
    EXPECT_EQ(journal[0].arguments, R"({"sleep_percent":10,"password":"***"})");

    // A staged change that breaks a rule is refused at commit, and nothing of the stage applies.
    staged.Set("sleep_percent", 50, [](Simulation& s) { s.sleep_percent = 50; });
    staged.Set("sleep_percent", 200, [](Simulation& s) { s.sleep_percent = 200; });
    {
        simhost::Call call(simhost::Op::SystemInfoImpl_New);
        try {
            staged.Commit(call);
            FAIL() << "committed a value out of range";
        } catch (const simhost::HostError& error) {
            EXPECT_EQ(std::string(error.what()), "sleep_percent: expected an integer from 0 to 100");
        }
        EXPECT_EQ(call.Read<Simulation>().sleep_percent, 15u);
    }
    EXPECT_TRUE(staged.Empty());
    EXPECT_EQ(host_.host().Journal().size(), 1u);
}

}  // namespace
