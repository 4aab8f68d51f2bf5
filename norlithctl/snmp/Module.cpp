// The SNMP support module's one export: its table of functions (see SnmpModule.h).
#include "../SnmpModule.h"

extern "C" __attribute__((visibility("default"))) const norlithctl::SnmpModuleApi* QuarnSnmpModule() {
    static const norlithctl::SnmpModuleApi api = {
        norlithctl::kSnmpModuleVersion,
        norlithctl::snmpmodule::LocalizedAuthKey,
        norlithctl::snmpmodule::LocalizedAes128Key,
        norlithctl::snmpmodule::SendWarmStart,
    };
    return &api;
}
