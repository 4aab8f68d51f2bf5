// Kernel information records: the product version encoding and the Sysinfo reader.
#include "TestSupport.h"

#include <norlithctl/RavelException.h>
#include <norlithctl/Records.h>
#include <norlithctl/Sysinfo.h>

#include <simhost/Host.h>
#include <simhost/Records.h>
#include <simhost/domains/Identity.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

using NorlithCtl::Util::Sysinfo;
using simhost::identity::Identity;

using NorlithCtl::Util::Records::Field;
using Layout = NorlithCtl::Util::Records::ProductVersion;
// The layout's fields, checked against the byte positions the commands rely on.
const Field kFields[] = {Layout::kProduct, Layout::kVersion, Layout::kBuild, Layout::kUpdate};
static_assert(Layout::kProduct.offset == 0 && Layout::kVersion.offset == 32 &&
                  Layout::kBuild.offset == 64 && Layout::kUpdate.offset == 160 &&
                  Layout::kSize == 312,
              "the product version record's layout");

std::string TextAt(const unsigned char* record, std::size_t offset) {
    return reinterpret_cast<const char*>(record + offset);
}

Identity Sample() {
    Identity identity;
    identity.product = "Quarn";
    identity.version = "8.0.2";
    identity.build = "Build 22380479";
    identity.update = "1";
    identity.system_uuid = "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c";
    return identity;
}

TEST(ProductVersionRecord, PutsEachFieldAtItsOffsetAndZeroesTheRest) {
    auto record = simhost::EncodeProductVersion(Sample());
    ASSERT_EQ(record.size(), 312u);
    EXPECT_EQ(TextAt(record.data(), 0), "Quarn");
    EXPECT_EQ(TextAt(record.data(), 32), "8.0.2");
    EXPECT_EQ(TextAt(record.data(), 64), "Build 22380479");
    EXPECT_EQ(TextAt(record.data(), 160), "1");
    std::vector<bool> used(record.size(), false);
    for (const Field& field : kFields) {
        std::size_t length = std::strlen(reinterpret_cast<const char*>(record.data() + field.offset));
        for (std::size_t i = 0; i < length; ++i) used[field.offset + i] = true;
    }
    for (std::size_t i = 0; i < record.size(); ++i) {
        if (!used[i]) {
            EXPECT_EQ(record[i], 0) << "byte " << i;
        }
    }
}

TEST(ProductVersionRecord, FieldsAtTheirLimitsKeepTheirTerminatingNul) {
    Identity identity = Sample();
    identity.product = std::string(31, 'p');
    identity.version = std::string(31, 'v');
    identity.build = std::string(95, 'b');
    identity.update = std::string(151, 'u');
    EXPECT_EQ(simhost::Verify(identity), "");
    auto record = simhost::EncodeProductVersion(identity);
    const char letters[] = {'p', 'v', 'b', 'u'};
    for (int f = 0; f < 4; ++f) {
        const Field& field = kFields[f];
        for (std::size_t i = 0; i + 1 < field.width; ++i)
            ASSERT_EQ(record[field.offset + i], letters[f]) << "field " << f << " byte " << i;
        EXPECT_EQ(record[field.offset + field.width - 1], 0) << "field " << f;
    }
    identity.update.push_back('u');
    EXPECT_EQ(simhost::Verify(identity),
              "update: expected a string of at most 151 bytes");
    identity = Sample();
    identity.product = "";
    EXPECT_NE(simhost::Verify(identity), "");
}

class SysinfoTest : public ::testing::Test {
protected:
    simhost::TempHost host_;
};

TEST_F(SysinfoTest, GetEncodesTheHostsCurrentIdentity) {
    unsigned char record[312];
    std::memset(record, 0xAA, sizeof record);
    Sysinfo node(Layout::kNode);
    EXPECT_EQ(node.GetNode(), 1238);
    node.Get(record, sizeof record);
    EXPECT_EQ(TextAt(record, 0), "Quarn");
    EXPECT_EQ(TextAt(record, 32), "8.0.2");
    EXPECT_EQ(TextAt(record, 64), "Build 22380479");
    EXPECT_EQ(TextAt(record, 160), "1");
    EXPECT_EQ(record[311], 0);
    EXPECT_EQ(record[100], 0);  // the 0xAA fill is overwritten everywhere

    host_.host().Init(testsupport::ReadFile(simtest::ScenarioFile("limits.json")), true);
    host_.host().ClearFaults();  // the scenario also sets one on Get
    auto limits =
        nlohmann::json::parse(testsupport::ReadFile(simtest::ScenarioFile("limits.json")));
    node.Get(record, sizeof record);
    EXPECT_EQ(TextAt(record, 0), limits["identity"]["product"]);
    EXPECT_EQ(TextAt(record, 32), limits["identity"]["version"]);
    EXPECT_EQ(TextAt(record, 64), limits["identity"]["build"]);
    EXPECT_EQ(TextAt(record, 160), limits["identity"]["update"]);
}

TEST_F(SysinfoTest, RefusesWrongSizesUnknownNodesAndInstances) {
    Sysinfo node(Layout::kNode);
    std::vector<unsigned char> buffer(400, 0x55);
    for (std::size_t size : {0, 311, 313}) {
        try {
            node.Get(buffer.data(), size);
            FAIL() << "accepted size " << size;
        } catch (const Ravel::Lib::RavelException& error) {
            std::string message = error.GetMessage(0);
            EXPECT_NE(message.find(std::to_string(size) + " bytes"), std::string::npos) << message;
            EXPECT_NE(message.find("312"), std::string::npos) << message;
        }
    }
    EXPECT_EQ(buffer[0], 0x55);  // nothing written on refusal

    try {
        Sysinfo unknown(4242);
        FAIL() << "accepted an unknown node";
    } catch (const Ravel::Lib::RavelException& error) {
        EXPECT_EQ(error.GetMessage(0), "unknown kernel information node 4242");
    }
    std::vector<std::string> names;
    EXPECT_THROW(node.List(names), Ravel::Lib::RavelException);
    EXPECT_THROW(node.AddInstancePath("ramdisk0"), Ravel::Lib::RavelException);
    node.ResetInstance();
    node.Get(buffer.data(), 312);  // still usable
    EXPECT_EQ(TextAt(buffer.data(), 0), "Quarn");
}

}  // namespace
