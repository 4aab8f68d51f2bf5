// Fuzzes the check of --format-param settings against a result's shape: arbitrary KEY=VALUE
// settings (the input split at NUL bytes, each at its first '=') against a template with a
// nested structure and a list of structures. Every outcome is an acceptance or one line of
// refusal without a control character (what the user typed is escaped in it).
#include "engine/FormatCheck.h"

#include <kitbase/MetaObj.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

namespace {

using namespace Kitbase::MetaObj;

boost::shared_ptr<MetaStruct> Template() {
    static boost::shared_ptr<MetaStruct> shape = [] {
        boost::shared_ptr<MetaStruct> row = MetaStruct::New("Module");
        row->SetField("Name", MetaString::New());
        row->SetField("Size", MetaInt::New());
        row->SetField("Loaded", MetaBool::New());
        boost::shared_ptr<MetaStruct> top = MetaStruct::New("Summary");
        top->SetField("Host", MetaString::New());
        top->SetField("Modules", MetaList::New(MetaTypeStruct, row));
        return top;
    }();
    return shape;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string input(reinterpret_cast<const char*>(data), size);
    std::vector<std::pair<std::string, std::string> > settings;
    std::size_t start = 0;
    while (start <= input.size()) {
        std::size_t end = input.find('\0', start);
        if (end == std::string::npos) end = input.size();
        const std::string word = input.substr(start, end - start);
        const std::size_t eq = word.find('=');
        settings.emplace_back(word.substr(0, eq), eq == std::string::npos ? "" : word.substr(eq + 1));
        start = end + 1;
    }
    std::string error;
    const MetaObject* shapes[] = {Template().get(), nullptr};  // with a template, and without
    for (const MetaObject* shape : shapes) {
        error.clear();
        if (Kitbase::Engine::CheckFormatParams(settings, shape, &error)) {
            if (!error.empty()) std::abort();
            continue;
        }
        if (error.empty()) std::abort();
        for (char c : error) {
            if (static_cast<unsigned char>(c) < 0x20 || c == 0x7f) std::abort();
        }
    }
    return 0;
}
