// Sending the test notification (SnmpNotify.h) with Net-SNMP's library. Part of the SNMP support
// module, so that programs that never send one never load Net-SNMP.
#include "../SnmpModule.h"
#include "../SnmpNotify.h"

#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>

#include <cstdlib>
#include <cstring>
#include <mutex>
#include <vector>

namespace norlithctl {
namespace snmpmodule {
namespace {

using snmpnotify::Destination;
using snmpnotify::kInformTimeoutSeconds;

const char kAppType[] = "quarn-snmp-test";

oid kSysUpTime[] = {1, 3, 6, 1, 2, 1, 1, 3, 0};
oid kSnmpTrapOid[] = {1, 3, 6, 1, 6, 3, 1, 1, 4, 1, 0};
oid kWarmStart[] = {1, 3, 6, 1, 6, 3, 1, 1, 5, 2};
// Version 1 traps of the standard kinds name snmpTraps as their enterprise.
oid kSnmpTraps[] = {1, 3, 6, 1, 6, 3, 1, 1, 5};

// The library's own set-up, without what init_snmp adds for programs: no configuration files,
// no MIB files (whose warnings would go to standard error), no persistent state, no log output.
void SetUpLibrary() {
    static std::once_flag once;
    std::call_once(once, [] {
        netsnmp_ds_set_boolean(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_DONT_READ_CONFIGS, 1);
        netsnmp_ds_set_boolean(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_DONT_PERSIST_STATE, 1);
        netsnmp_ds_set_boolean(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_DISABLE_PERSISTENT_LOAD, 1);
        netsnmp_ds_set_boolean(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_DISABLE_PERSISTENT_SAVE, 1);
        netsnmp_ds_set_boolean(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_DONT_LOAD_HOST_FILES, 1);
        netsnmp_ds_set_string(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_APPTYPE, kAppType);
        snmp_disable_log();
        register_mib_handlers();
        init_snmp_transport();
        init_snmpv3(kAppType);
        init_snmp_alarm();
        init_snmp_enum(kAppType);
        read_premib_configs();
        read_configs();
    });
}

std::string NoAnswer() { return "no answer within " + std::to_string(kInformTimeoutSeconds) + " seconds"; }

// The library's text for a failure (of opening a session, or of an exchange on it), freed here.
// An inform first discovers the receiver's engine, so a receiver that does not answer shows as
// the library's timeout.
std::string SessionError(netsnmp_session* session) {
    int library = 0;
    int system = 0;
    char* text = nullptr;
    snmp_error(session, &system, &library, &text);
    std::string message = library == SNMPERR_TIMEOUT ? NoAnswer() : text ? text : "unknown error";
    std::free(text);
    return message;
}

std::string HandleError(void* handle) {
    int library = 0;
    int system = 0;
    char* text = nullptr;
    snmp_sess_error(handle, &system, &library, &text);
    std::string message = library == SNMPERR_TIMEOUT ? NoAnswer() : text ? text : "unknown error";
    std::free(text);
    return message;
}

class Session {
public:
    explicit Session(netsnmp_session* settings) : handle_(snmp_sess_open(settings)) {}
    ~Session() {
        if (handle_) snmp_sess_close(handle_);
    }
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    void* get() const { return handle_; }

private:
    void* handle_;
};

std::string PeerName(const Destination& to) {
    std::string port = std::to_string(to.port);
    if (to.host.find(':') != std::string::npos) return "udp6:[" + to.host + "]:" + port;
    return "udp:" + to.host + ":" + port;
}

netsnmp_pdu* WarmStartPdu(const Destination& to, unsigned long uptime_ticks) {
    if (!to.v3) {
        netsnmp_pdu* pdu = snmp_pdu_create(SNMP_MSG_TRAP);
        pdu->enterprise = static_cast<oid*>(std::malloc(sizeof kSnmpTraps));
        std::memcpy(pdu->enterprise, kSnmpTraps, sizeof kSnmpTraps);
        pdu->enterprise_length = OID_LENGTH(kSnmpTraps);
        pdu->trap_type = SNMP_TRAP_WARMSTART;
        pdu->specific_type = 0;
        pdu->time = uptime_ticks;
        return pdu;
    }
    netsnmp_pdu* pdu = snmp_pdu_create(to.inform ? SNMP_MSG_INFORM : SNMP_MSG_TRAP2);
    long ticks = static_cast<long>(uptime_ticks);
    snmp_pdu_add_variable(pdu, kSysUpTime, OID_LENGTH(kSysUpTime), ASN_TIMETICKS, &ticks, sizeof ticks);
    snmp_pdu_add_variable(pdu, kSnmpTrapOid, OID_LENGTH(kSnmpTrapOid), ASN_OBJECT_ID, kWarmStart,
                          sizeof kWarmStart);
    return pdu;
}

// Fills the version 3 part of the settings; the strings it points at belong to the caller.
void SetUser(netsnmp_session& settings, const Destination& to, std::vector<u_char>& engine,
             std::vector<u_char>& auth, std::vector<u_char>& priv, unsigned long uptime_ticks) {
    settings.version = SNMP_VERSION_3;
    settings.securityName = const_cast<char*>(to.user.c_str());
    settings.securityNameLen = to.user.size();
    settings.securityLevel = to.level == "priv"   ? SNMP_SEC_LEVEL_AUTHPRIV
                             : to.level == "auth" ? SNMP_SEC_LEVEL_AUTHNOPRIV
                                                  : SNMP_SEC_LEVEL_NOAUTH;
    if (!to.inform) {
        // The sender of a trap is the authoritative engine: the keys' engine, with its boots and
        // time in the message.
        engine.assign(to.engine_id.begin(), to.engine_id.end());
        settings.securityEngineID = engine.data();
        settings.securityEngineIDLen = engine.size();
        settings.engineBoots = 1;
        settings.engineTime = static_cast<u_int>(uptime_ticks / 100);
    }
    // The receiver of an inform is: its engine id, boots and time are discovered first, and the
    // keys only work when its engine is the one they were localized to.
    if (to.level != "none") {
        if (to.auth_protocol == "MD5") {
            settings.securityAuthProto = usmHMACMD5AuthProtocol;
            settings.securityAuthProtoLen = USM_AUTH_PROTO_MD5_LEN;
        } else {
            settings.securityAuthProto = usmHMACSHA1AuthProtocol;
            settings.securityAuthProtoLen = USM_AUTH_PROTO_SHA_LEN;
        }
        auth.assign(to.auth_key.begin(), to.auth_key.end());
        settings.securityAuthLocalKey = auth.data();
        settings.securityAuthLocalKeyLen = auth.size();
    }
    if (to.level == "priv") {
        settings.securityPrivProto = usmAESPrivProtocol;
        settings.securityPrivProtoLen = USM_PRIV_PROTO_AES_LEN;
        priv.assign(to.priv_key.begin(), to.priv_key.end());
        settings.securityPrivLocalKey = priv.data();
        settings.securityPrivLocalKeyLen = priv.size();
    }
}

}  // namespace

std::string SendWarmStart(const Destination& to, unsigned long uptime_ticks) {
    SetUpLibrary();
    netsnmp_session settings;
    snmp_sess_init(&settings);
    std::string peer = PeerName(to);
    settings.peername = const_cast<char*>(peer.c_str());
    // Tries of one second each, so an unanswered inform gives up after the documented bound.
    settings.timeout = 1000000;
    settings.retries = kInformTimeoutSeconds - 1;
    std::vector<u_char> community(to.community.begin(), to.community.end());
    std::vector<u_char> engine;
    std::vector<u_char> auth;
    std::vector<u_char> priv;
    if (to.v3) {
        SetUser(settings, to, engine, auth, priv, uptime_ticks);
    } else {
        settings.version = SNMP_VERSION_1;
        settings.community = community.data();
        settings.community_len = community.size();
    }
    Session session(&settings);
    if (!session.get()) return SessionError(&settings);

    netsnmp_pdu* pdu = WarmStartPdu(to, uptime_ticks);
    if (!to.inform) {
        if (snmp_sess_send(session.get(), pdu) != 0) return "";
        snmp_free_pdu(pdu);  // not sent, so still ours
        return HandleError(session.get());
    }
    netsnmp_pdu* response = nullptr;
    int status = snmp_sess_synch_response(session.get(), pdu, &response);
    std::string problem;
    if (status == STAT_TIMEOUT)
        problem = NoAnswer();
    else if (status != STAT_SUCCESS)
        problem = HandleError(session.get());
    else if (response && response->errstat != SNMP_ERR_NOERROR)
        problem = std::string("the receiver answered ") + snmp_errstring(static_cast<int>(response->errstat));
    if (response) snmp_free_pdu(response);
    return problem;
}

}  // namespace snmpmodule
}  // namespace norlithctl
