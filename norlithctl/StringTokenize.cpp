#include <norlithctl/Util.h>

namespace NorlithCtl {
namespace Util {

void StringTokenize(const std::string& value, std::vector<std::string>& tokens,
                    const std::string& separators) {
    std::string::size_type start = value.find_first_not_of(separators);
    while (start != std::string::npos) {
        std::string::size_type end = value.find_first_of(separators, start);
        tokens.push_back(value.substr(start, end == std::string::npos ? std::string::npos : end - start));
        start = end == std::string::npos ? end : value.find_first_not_of(separators, end);
    }
}

}  // namespace Util
}  // namespace NorlithCtl
