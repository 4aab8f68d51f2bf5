// What the core dump command tests share: running a command of the tree by path on the current
// host (checking that nothing escaped and every host object was released), and reading the
// fields of its result.
#pragma once

#include "Harness.h"

#include <kitbase/MetaObj.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

namespace coredumptest {

using Kitbase::CallSpec::Input;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaInt;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;

inline plugintest::Run RunCommand(const std::string& path, const std::function<void(Input&)>& fill = {}) {
    plugintest::InputPtr input = Input::New();
    if (fill) fill(*input);
    plugintest::Run run = plugintest::Execute(plugintest::FindCommand(path), input);
    EXPECT_FALSE(run.escaped) << path << ": " << run.exception;
    EXPECT_EQ(run.leaked, 0) << path;
    return run;
}

inline std::vector<std::string> Errors(const plugintest::Run& run) { return run.output->GetErrors(); }

inline bool Succeeded(const plugintest::Run& run) {
    auto result = boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult());
    return run.output->GetErrors().empty() && result && result->GetValue() && run.output->IsComplete();
}

inline boost::shared_ptr<MetaStruct> Struct(const boost::shared_ptr<Kitbase::MetaObj::MetaObject>& object) {
    return boost::dynamic_pointer_cast<MetaStruct>(object);
}

inline std::string Text(const boost::shared_ptr<MetaStruct>& row, const std::string& field) {
    auto value = boost::dynamic_pointer_cast<MetaString>(row->GetField(field));
    return value ? value->GetValue() : "<not a string>";
}
inline bool Flag(const boost::shared_ptr<MetaStruct>& row, const std::string& field) {
    auto value = boost::dynamic_pointer_cast<MetaBool>(row->GetField(field));
    return value && value->GetValue();
}
inline long long Number(const boost::shared_ptr<MetaStruct>& row, const std::string& field) {
    auto value = boost::dynamic_pointer_cast<MetaInt>(row->GetField(field));
    return value ? value->GetValue() : -1;
}

inline std::vector<boost::shared_ptr<MetaStruct>> Rows(const plugintest::Run& run) {
    std::vector<boost::shared_ptr<MetaStruct>> rows;
    auto list = boost::dynamic_pointer_cast<MetaList>(run.output->GetResult());
    if (!list) return rows;
    for (const auto& element : list->GetElements()) rows.push_back(Struct(element));
    return rows;
}

}  // namespace coredumptest
