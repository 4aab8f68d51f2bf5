#include "snmp/NormalizeEngineId.h"

#include <boost/algorithm/string/classification.hpp>
#include <boost/algorithm/string/split.hpp>
#include <boost/algorithm/string/trim.hpp>

#include <vector>

namespace TarselCli {
namespace System {

void NormalizeEngineId(std::string& engineId) {
    boost::algorithm::trim(engineId);
    if (engineId.size() <= 2) return;
    if (engineId[0] == '0' && (engineId[1] == 'x' || engineId[1] == 'X')) engineId.erase(0, 2);
    if (engineId.find(':') == std::string::npos) return;
    std::vector<std::string> groups;
    boost::algorithm::split(groups, engineId, boost::algorithm::is_any_of(":"));
    std::string joined;
    for (const std::string& group : groups) {
        if (group.size() == 1) joined += '0';
        joined += group;
    }
    engineId = joined;
}

}  // namespace System
}  // namespace TarselCli
