/* SPDX-License-Identifier: Apache-2.0 */
// Mirror sessions: what a save writes for each session type, and what a load returns.

#include "configstore/converters/mirror.h"

#include "configstore/converters/converter_fixture.h"

using namespace converter_test;

namespace {

constexpr const char *kEtherswitch = "com.orbeno.etherswitch.mirrorSessions";
constexpr const char *kVswitch = "com.orbeno.vswitch.mirrorSessions";
constexpr const char *kEtherswitchPort = "com.orbeno.etherswitch.port.mirrorSessions";
constexpr const char *kVswitchPort = "com.orbeno.vswitch.port.mirrorSessions";
constexpr uint32_t kNotSet = 0xffffffff;

struct Session {
    std::string key = "s1", name = "span one";
    uint32_t type = 1, packetLength = kNotSet, flags = 0;
    uint16_t encapVlan = 0, receiveTypes = 0, transmitTypes = 0;
    uint32_t samplingRate = 0, encapType = 0;
    uint16_t erspanId = 0;
    uint8_t erspanCos = 0, nanosec = 0;
    uint32_t destinations = 0, receive = 0, transmit = 0, first = 0;

    [[nodiscard]] Bytes Value() const {
        Bytes bytes;
        bytes.Text(key, 32).Text(name, 81).Zeros(3).U32(type).U32(packetLength).U32(flags).U16(encapVlan);
        bytes.U16(receiveTypes).U16(transmitTypes).Zeros(2).U32(samplingRate).U32(encapType).U16(erspanId);
        bytes.U8(erspanCos).U8(nanosec).Zeros(68);
        return bytes.U32(destinations).U32(receive).U32(transmit).U32(first);
    }
};

Bytes Table(const std::vector<Session> &sessions, uint32_t ports = 0) {
    Bytes bytes =
        Bytes().U32(0xfacebeef).U32(1).U32(static_cast<uint32_t>(sessions.size())).U32(ports).U32(0);
    for (const Session &session : sessions)
        bytes.Add(session.Value());
    return bytes;
}

Bytes Port(uint32_t kind, const std::string &name, bool wide = false) {
    return Bytes().U32(kind).Text(name, wide ? 48 : 32);
}

struct Mirror : ConverterTest {
    [[nodiscard]] bool Has(const std::string &line) const {
        const std::string dump = Dump();
        const bool found = dump.find(line + "\n") != std::string::npos;
        if (!found) ADD_FAILURE() << "no " << line << " in\n" << dump;
        return found;
    }
    [[nodiscard]] bool Lacks(const std::string &part) const { return Dump().find(part) == std::string::npos; }
};

TEST_F(Mirror, SavesEveryFieldOfASession) {
    Session session;
    session.flags = 0x20 | 0x01;
    session.encapVlan = 12;
    session.receiveTypes = 0x1 | 0x8;
    session.transmitTypes = 0x2;
    session.samplingRate = 5;
    session.encapType = 2;
    session.erspanId = 300;
    session.erspanCos = 7;
    session.nanosec = 9;
    session.destinations = 1;
    session.receive = 2;
    session.transmit = 1;
    const Bytes value =
        Table({session}).Add(Port(0, "d1")).Add(Port(0, "r1")).Add(Port(0, "r2")).Add(Port(0, "t1"));
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, value));
    const std::string base = "/settings/vspans[s1]";
    EXPECT_EQ("/settings {}\n" + base + " {}\n" + base + "/key = \"s1\"\n" + base + "/name = \"span one\"\n" +
                  base + "/mirrored_packet_length = 4294967295\n" + base +
                  "/session_type = \"DVPORT_MIRROR\"\n" + base + "/enabled = false\n" + base +
                  "/strip_original_vlan = true\n" + base + "/normal_traffic_allowed = false\n" + base +
                  "/legacy_mode = false\n" + base + "/source_transmit_port {}\n" + base +
                  "/source_transmit_port/wildcard_port_connectee_types[] = \"PNIC\"\n" + base +
                  "/source_transmit_port/port_keys[] = \"t1\"\n" + base + "/source_recv_port {}\n" + base +
                  "/source_recv_port/wildcard_port_connectee_types[] = \"VM_VNIC\"\n" + base +
                  "/source_recv_port/wildcard_port_connectee_types[] = \"HOST_HYP_VNIC\"\n" + base +
                  "/source_recv_port/port_keys[] = \"r1\"\n" + base +
                  "/source_recv_port/port_keys[] = \"r2\"\n" + base + "/encapsulation_vlan_id = 12\n" + base +
                  "/sampling_rate = 5\n" + base + "/encap_type = \"ERSPAN3\"\n" + base +
                  "/erspan_id = 300\n" + base + "/erspan_COS = 7\n" + base + "/erspan_gra_nanosec = true\n" +
                  base + "/destination_port {}\n" + base + "/destination_port/port_keys[] = \"d1\"\n",
              Dump());
}

TEST_F(Mirror, NoSessionsSaveNothing) {
    ASSERT_EQ(0, Save(kPort, kEtherswitchPort, Table({})));
    EXPECT_EQ("", Dump());
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({})));
    EXPECT_EQ("/settings {}\n", Dump());
    EXPECT_FALSE(LoadOne(kGlobal, kEtherswitch));
}

TEST_F(Mirror, PacketLengthIsSavedOnlyIfNotSet) {
    for (const uint32_t length : {0u, 60u, 1500u}) {
        (void)configstore::DeleteSubObject(object, "settings", "");
        Session session;
        session.packetLength = length;
        ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({session})));
        EXPECT_TRUE(Lacks("mirrored_packet_length"));
        session.packetLength = kNotSet;
        session.flags = 0x10;
        EXPECT_EQ(Table({session}), LoadOne(kGlobal, kEtherswitch));
    }
    // A length that another writer stored is loaded.
    ASSERT_EQ(0, configstore::SetValueUint32(Sub("settings/vspans[s1]"), "mirrored_packet_length", 64));
    Session session;
    session.packetLength = 64;
    session.flags = 0x10;
    EXPECT_EQ(Table({session}), LoadOne(kGlobal, kEtherswitch));
}

TEST_F(Mirror, DestinationsOfARemoteSourceAreUplinks) {
    Session session;
    session.type = 2;
    session.destinations = 2;
    session.receive = 1;
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch,
                      Table({session}).Add(Port(1, "u1")).Add(Port(0, "u2")).Add(Port(0, "r1"))));
    EXPECT_TRUE(Has("/settings/vspans[s1]/destination_port/uplink_port_names[] = \"u1\""));
    EXPECT_TRUE(Has("/settings/vspans[s1]/destination_port/uplink_port_names[] = \"u2\""));
    EXPECT_TRUE(Has("/settings/vspans[s1]/source_recv_port/port_keys[] = \"r1\""));
}

TEST_F(Mirror, SourcesOfARemoteDestinationAreVlans) {
    Session session;
    session.type = 3;
    session.destinations = session.receive = session.transmit = 1;
    const Bytes vlan = Bytes().U32(0).U16(0xfffe).Zeros(30);
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({session}).Add(Port(0, "d1")).Add(vlan).Add(vlan)));
    EXPECT_TRUE(Has("/settings/vspans[s1]/destination_port/port_keys[] = \"d1\""));
    EXPECT_TRUE(Has("/settings/vspans[s1]/source_recv_port/vlans[] = 65534"));
    EXPECT_TRUE(Has("/settings/vspans[s1]/source_transmit_port/vlans[] = 65534"));
}

TEST_F(Mirror, SavesTheThirdOfThreeAddresses) {
    Session session;
    session.type = 4;
    session.destinations = 3;
    const auto address = [](uint8_t last) {
        return Bytes().U32(0).U32(0).U8(10).U8(0).U8(0).U8(last).Zeros(24);
    };
    ASSERT_EQ(0,
              Save(kGlobal, kEtherswitch, Table({session}).Add(address(1)).Add(address(2)).Add(address(3))));
    EXPECT_TRUE(Has("/settings/vspans[s1]/destination_port/addresses[] = \"10.0.0.3\""));
    EXPECT_TRUE(Lacks("10.0.0.1"));
    session.destinations = 1;
    const Bytes ipv6 = Bytes().U32(0).U8(1).Zeros(3).U8(0xfe).U8(0x80).Zeros(13).U8(1).Zeros(12);
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({session}).Add(ipv6)));
    EXPECT_TRUE(Has(
        "/settings/vspans[s1]/destination_port/addresses[] = \"fe80:0000:0000:0000:0000:0000:0000:0001\""));
}

TEST_F(Mirror, MixedDestinationsAreSavedByKind) {
    Session session;
    session.type = 0;
    session.destinations = 3;
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch,
                      Table({session}).Add(Port(1, "u")).Add(Port(0, "k")).Add(Port(2, "?"))));
    EXPECT_TRUE(Has("/settings/vspans[s1]/destination_port/uplink_port_names[] = \"u\""));
    EXPECT_TRUE(Has("/settings/vspans[s1]/destination_port/port_keys[] = \"k\""));
    EXPECT_TRUE(Lacks("\"?\""));
}

TEST_F(Mirror, PortKeysAreAppendedToExistingOnes) {
    Session session;
    session.destinations = 1;
    const Bytes value = Table({session}).Add(Port(0, "d"));
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, value));
    ASSERT_EQ(0, Save(kGlobal, kVswitch, value));
    const std::string line = "/settings/vspans[s1]/destination_port/port_keys[] = \"d\"\n";
    EXPECT_NE(std::string::npos, Dump().find(line + line));
}

TEST_F(Mirror, LegacyModeNamesThePromiscuousSessionAndLoadsInverted) {
    Session session;
    session.flags = 0x10;
    ASSERT_EQ(0, Save(kPort, kEtherswitchPort, Table({session})));
    EXPECT_TRUE(Has("/settings/promiscuous_mode_vspan_session = \"s1\"")) << "in the given object";
    EXPECT_TRUE(Has("/vspans[s1]/legacy_mode = true"));
    session.flags = 0;
    EXPECT_EQ(Table({session}), LoadOne(kPort, kEtherswitchPort));
    ASSERT_EQ(0, Save(kPort, kEtherswitchPort, Table({session})));
    session.flags = 0x10;
    EXPECT_EQ(Table({session}), LoadOne(kPort, kEtherswitchPort));
}

TEST_F(Mirror, FlagsAndNumbersLoadAsDocumented) {
    Session session;
    session.key = "k";
    session.type = 3;
    session.flags = 0x20 | 0x04 | 0x01 | 0x10;
    session.encapVlan = 0xffff;
    session.receiveTypes = 0x2;
    session.transmitTypes = 0xb;
    session.samplingRate = 77;
    session.encapType = 1;
    session.erspanId = 0xffff;
    session.erspanCos = 0xff;
    session.nanosec = 1;
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({session})));
    session.flags =
        0x20 | 0x04 | 0x03 | 0x08; // no legacy mode, 0x03 for 0x01, and the VLAN id marked as set
    session.receiveTypes = 0x6;    // PNIC, and the bit for any type
    session.transmitTypes = 0xf;
    EXPECT_EQ(Table({session}), LoadOne(kGlobal, kEtherswitch));
}

TEST_F(Mirror, TransmitSourcesReplaceReceiveSourcesOnLoad) {
    Session session;
    session.type = 1;
    session.destinations = 2;
    session.receive = 3;
    session.transmit = 1;
    Bytes value = Table({session}).Add(Port(0, "d1")).Add(Port(0, "d2"));
    value.Add(Port(0, "r1")).Add(Port(0, "r2")).Add(Port(0, "r3")).Add(Port(0, "t1"));
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, value));
    session.flags = 0x10;
    session.destinations = 1; // the count of the transmit sources
    session.receive = session.transmit = 0;
    // Each of the three port objects counts all six keys.
    Bytes expected = Table({session}, 18).Add(Port(0, "d1")).Add(Port(0, "d2"));
    expected.Add(Port(0, "t1")).Add(Port(0, "r2")).Add(Port(0, "r3")).Zeros((18 - 5) * 36);
    EXPECT_EQ(expected, LoadOne(kGlobal, kEtherswitch));
}

TEST_F(Mirror, UplinksFollowTheDestinationsPortKeys) {
    Session session;
    session.type = 0;
    session.destinations = 2;
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({session}).Add(Port(1, "u1")).Add(Port(0, "k1"))));
    session.flags = 0x10;
    session.destinations = 0;
    EXPECT_EQ(Table({session}, 4).Add(Port(0, "k1")).Add(Port(1, "u1")).Zeros(2 * 36),
              LoadOne(kGlobal, kEtherswitch));
}

TEST_F(Mirror, NextSessionStartsAfterTheDestinations) {
    Session one, two;
    two.key = "s2";
    one.destinations = one.receive = two.destinations = 1;
    const Bytes value = Table({one, two}).Add(Port(0, "d1")).Add(Port(0, "r1")).Add(Port(0, "d2"));
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, value));
    one.flags = two.flags = 0x10;
    one.destinations = one.receive = two.destinations = 0;
    two.first = 1;
    EXPECT_EQ(Table({one, two}, 9).Add(Port(0, "d1")).Add(Port(0, "d2")).Zeros(7 * 36),
              LoadOne(kGlobal, kEtherswitch));
}

TEST_F(Mirror, WildcardPnicLoadsAsSix) {
    const std::pair<std::vector<const char *>, uint16_t> rows[] = {
        {{"PNIC"}, 0x6}, {{"VM_VNIC", "HOST_HYP_VNIC"}, 0xd}, {{"pnic"}, 0x4}, {{}, 0}};
    for (const auto &[texts, expected] : rows) {
        configstore::Object *ports = Sub("settings/vspans[s1]/source_recv_port");
        ASSERT_EQ(0, configstore::SetValueEmptyList(ports, "wildcard_port_connectee_types"));
        for (const char *text : texts) {
            ASSERT_EQ(0, configstore::AppendValueString(ports, "wildcard_port_connectee_types", text));
        }
        const auto loaded = LoadOne(kGlobal, kEtherswitch);
        ASSERT_TRUE(loaded);
        EXPECT_EQ(expected, (*loaded)[20 + 130]);
    }
}

TEST_F(Mirror, OverlayVersionsHaveWidePortRecords) {
    const struct {
        const char *version;
        bool overlay, wide;
    } rows[] = {
        {"8.0.3", true, true}, {"8.0.3", false, false}, {"OVL 1.0", false, true}, {"6.5.0", true, false}};
    for (const auto &row : rows) {
        (void)configstore::DeleteSubObject(object, "settings", "");
        BecomeSwitch("etherswitch", row.version, row.overlay);
        dvsWidePortRecords = row.wide;
        Session session;
        session.destinations = 1;
        const std::string name(40, 'k');
        ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({session}).Add(Port(0, name, row.wide))));
        dvsWidePortRecords = !row.wide; // a load reads the width from the switch
        session.flags = 0x10;
        session.destinations = 0;
        const std::string kept = row.wide ? name : name.substr(0, 32);
        EXPECT_EQ(Table({session}, 3).Add(Port(0, kept, row.wide)).Zeros(2 * (row.wide ? 52 : 36)),
                  LoadOne(kGlobal, kEtherswitch))
            << row.version;
    }
}

TEST_F(Mirror, APortThatIsLoadedAloneTakesTheFlag) {
    Session session;
    session.destinations = 1;
    const auto loaded = [&] {
        const auto value = LoadOne(kPort, kEtherswitchPort);
        return value ? value->size() : 0;
    };
    ASSERT_EQ(0, Save(kPort, kEtherswitchPort, Table({session}).Add(Port(0, "d"))));
    const std::size_t head = 20 + 232;
    EXPECT_EQ(head + 3 * 36, loaded());
    dvsWidePortRecords = true;
    EXPECT_EQ(head + 3 * 52, loaded());
}

TEST_F(Mirror, EachClassLoadsTheKeysOfItsFamily) {
    Session session;
    for (const char *className : {"etherswitch", "vswitch", "cswitch"}) {
        BecomeSwitch(className);
        ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({session})));
        ASSERT_EQ(0, Save(kPort, kEtherswitchPort, Table({session})));
        const bool isVswitch = dvsSwitchClass != 0;
        const Properties global = Load(kGlobal);
        EXPECT_EQ(isVswitch, global.contains(kVswitch)) << className;
        EXPECT_EQ(!isVswitch, global.contains(kEtherswitch)) << className;
        const Properties port = Load(kPort);
        EXPECT_EQ(isVswitch, port.contains(kVswitchPort)) << className;
        EXPECT_EQ(!isVswitch, port.contains(kEtherswitchPort)) << className;
    }
}

TEST_F(Mirror, UnknownTextsLoadAsAllOnes) {
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({Session()})));
    configstore::Object *vspan = Sub("settings/vspans[s1]");
    ASSERT_EQ(0, configstore::SetValueStr(vspan, "session_type", "dvport_mirror"));
    ASSERT_EQ(0, configstore::SetValueStr(vspan, "encap_type", ""));
    Session expected;
    expected.type = expected.encapType = kNotSet;
    expected.flags = 0x10;
    EXPECT_EQ(Table({expected}), LoadOne(kGlobal, kEtherswitch));
    EXPECT_NE(std::string::npos, messages.find("Unknown vspan session type in schema: dvport_mirror\n"));
    EXPECT_NE(std::string::npos, messages.find("Unknown vspan encap type in schema: \n"));
}

TEST_F(Mirror, AbsentFlagTakesThePreviousOne) {
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({Session()})));
    configstore::Object *vspan = Sub("settings/vspans[s1]");
    const auto flags = [&] { return LoadOne(kGlobal, kEtherswitch).value_or(Bytes().Zeros(252))[20 + 124]; };
    ASSERT_EQ(0, configstore::RemoveValue(vspan, "strip_original_vlan"));
    EXPECT_EQ(0x10, flags());
    ASSERT_EQ(0, configstore::SetValueBool(vspan, "enabled", false));
    EXPECT_EQ(0x10 | 0x20 | 0x04, flags());
    ASSERT_EQ(0, configstore::RemoveValue(vspan, "enabled"));
    EXPECT_EQ(0x10 | 0x20 | 0x04, flags()) << "without a previous flag the value is false";
    ASSERT_EQ(0, configstore::SetValueStr(vspan, "legacy_mode", "no"));
    EXPECT_FALSE(LoadOne(kGlobal, kEtherswitch));
    EXPECT_EQ(configstore::SCHEMA_VIOLATION, loadStatus);
}

TEST_F(Mirror, TruncatesLongKeysAndNames) {
    configstore::Object *vspan = Sub("settings/vspans[s1]");
    ASSERT_EQ(0, configstore::SetValueStr(vspan, "key", std::string(50, 'k').c_str()));
    ASSERT_EQ(0, configstore::SetValueStr(vspan, "name", std::string(90, 'n').c_str()));
    Session expected;
    expected.key = std::string(31, 'k');
    expected.name = std::string(80, 'n');
    expected.type = 0;
    expected.flags = 0x37 & ~0x08; // no field sets enabled, stripped, allowed or legacy
    EXPECT_EQ(Table({expected}), LoadOne(kGlobal, kEtherswitch));
}

TEST_F(Mirror, PortAreaIsLargeEnoughForAnyCountOfTheSizePass) {
    ASSERT_EQ(0, Save(kGlobal, kEtherswitch, Table({Session()})));
    for (const char *ports : {"destination_port", "source_recv_port", "source_transmit_port"}) {
        configstore::Object *sub = Sub(std::string("settings/vspans[s1]/") + ports);
        for (int i = 0; i < 4; ++i)
            ASSERT_EQ(0, configstore::AppendValueString(sub, "port_keys", ports));
    }
    // A list in the object itself hides the lists below it from the size pass.
    ASSERT_EQ(0, configstore::SetValueEmptyList(Sub("settings/vspans[s1]"), "port_keys"));
    const auto loaded = LoadOne(kGlobal, kEtherswitch);
    ASSERT_TRUE(loaded);
    EXPECT_EQ(20 + 232 + 12 * 36u, loaded->size());
    EXPECT_EQ(0, (*loaded)[12]);
}

TEST_F(Mirror, LongPortKeysStopAtTheEndOfTheValue) {
    configstore::Object *ports = Sub("settings/vspans[s1]/destination_port");
    ASSERT_EQ(0, configstore::AppendValueString(ports, "port_keys", std::string(1000, 'x').c_str()));
    const auto loaded = LoadOne(kGlobal, kEtherswitch);
    ASSERT_TRUE(loaded);
    ASSERT_EQ(20 + 232 + 3 * 36u, loaded->size());
    EXPECT_EQ(0, loaded->back());
    EXPECT_EQ('x', (*loaded)[loaded->size() - 2]);
}

TEST_F(Mirror, RejectsCountsBeyondTheValue) {
    Session session;
    session.destinations = session.receive = session.transmit = 1;
    const Bytes whole = Table({session}).Add(Port(0, "d")).Add(Port(0, "r")).Add(Port(0, "t"));
    for (std::size_t length = 0; length < whole.size(); ++length) {
        EXPECT_EQ(-1, Save(kGlobal, kEtherswitch,
                           {whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length)}))
            << length;
    }
    EXPECT_EQ("/settings {}\n", Dump());
    for (const uint32_t count : {2u, 0x7fffffffu, kNotSet}) {
        session.receive = count;
        EXPECT_EQ(-1, Save(kGlobal, kEtherswitch,
                           Table({session}).Add(Port(0, "d")).Add(Port(0, "r")).Add(Port(0, "t"))));
        EXPECT_EQ(-1, Save(kGlobal, kEtherswitch, Bytes().U32(0).U32(1).U32(count).Zeros(8).Zeros(232)));
    }
    dvsWidePortRecords = true;
    EXPECT_EQ(-1, Save(kGlobal, kEtherswitch, whole)) << "too short for wide records";
}

TEST_F(Mirror, StoreRejectsTypesWithoutText) {
    Session session;
    for (const uint32_t type : {5u, 6u, kNotSet}) {
        session.type = type;
        EXPECT_EQ(configstore::BAD_PARAMETER, Save(kGlobal, kEtherswitch, Table({session})));
    }
    session.type = 0;
    session.encapType = 3;
    EXPECT_EQ(configstore::BAD_PARAMETER, Save(kGlobal, kEtherswitch, Table({session})));
}

} // namespace
