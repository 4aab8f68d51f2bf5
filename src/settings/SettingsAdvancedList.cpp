#include "settings/SettingsAdvancedList.h"

#include "settings/FormatBranch.h"
#include "settings/FormatOption.h"

#include <norlithctl/AdvancedOptionBranchImpl.h>
#include <norlithctl/AdvancedOptionImpl.h>
#include <norlithctl/Util.h>

#include <memory>
#include <string>
#include <vector>

namespace TarselCli {
namespace System {

boost::shared_ptr<SettingsAdvancedList> SettingsAdvancedList::New() {
    return boost::shared_ptr<SettingsAdvancedList>(new SettingsAdvancedList());
}

SettingsAdvancedList::SettingsAdvancedList() {
    SetDescription("List the advanced options available from the Norlith.");
    SetMetaDataField("type", "fetcher");
    SetDefaultOutputFormatter("simple");
    SetDefaultOutputParameter("fields:SettingsAdvancedOption",
                              "Path,Type,Int Value,Default Int Value,Min Value,Max Value,String Value,"
                              "Default String Value,Valid Characters,Description");
}

SettingsAdvancedList::~SettingsAdvancedList() {}

InputSpecPtr SettingsAdvancedList::GetInputSpecInternal() {
    return MakeInputSpec({
        {"tree", "t", CallSpec::ParameterTypeString, false,
         "Limit the list of advanced option to a specific sub tree."},
        {"option", "o", CallSpec::ParameterTypeString, false,
         "Only get the information for a single Norlith advanced option."},
        {"delta", "d", CallSpec::ParameterTypeFlag, false,
         "Only display options whose values differ from their default."},
    });
}

OutputSpecPtr SettingsAdvancedList::GetOutputSpecInternal() {
    return StructListOutputSpec(GetOutputStructure());
}

StructPtr SettingsAdvancedList::GetOutputStructure() {
    return MakeStructTemplate("SettingsAdvancedOption", {{"Path", FieldString},
                                                         {"Type", FieldString},
                                                         {"Int Value", FieldInt},
                                                         {"Default Int Value", FieldInt},
                                                         {"Min Value", FieldInt},
                                                         {"Max Value", FieldInt},
                                                         {"String Value", FieldString},
                                                         {"Default String Value", FieldString},
                                                         {"Valid Characters", FieldString},
                                                         {"Description", FieldString}});
}

void SettingsAdvancedList::ExecuteInternal(const InputPtr& input, const OutputPtr& output) {
    boost::shared_ptr<MetaObj::MetaList> list =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, GetOutputStructure());
    GuardHost(output, [&] {
        if (input->HasValue("option")) {
            const std::string name = input->GetString("option");
            // The option is ours on every path, the error paths included.
            std::unique_ptr<Ravel::Adv::AdvancedOption> option(
                NorlithCtl::Adv::AdvancedOptionImpl::FindOption(name));
            if (!option) {
                output->SetError("unknown option: " + name);
                return;
            }
            bool include = false;
            list->AddStruct(FormatOption(option.get(), false, &include));
            SetResult(output, list);
            return;
        }

        std::unique_ptr<Ravel::Adv::AdvancedOptionBranch> branch(
            new NorlithCtl::Adv::AdvancedOptionBranchImpl());
        const std::string tree = input->GetString("tree");
        const bool delta = input->GetFlag("delta");
        if (input->HasValue("tree")) {
            std::vector<std::string> components;
            NorlithCtl::Util::StringTokenize(tree, components, "/");
            for (const std::string& component : components) {
                // reset deletes the branch walked so far and keeps its child (or none).
                branch.reset(branch->GetBranch(component));
                if (!branch) break;
            }
        }
        if (!branch) {
            output->SetError("Invalid value for --tree No tree with the name " + tree + " found");
            SetResult(output, list);
            return;
        }
        FormatBranch(branch.get(), list, delta);
        branch.reset();
        SetResult(output, list);
    });
}

}  // namespace System
}  // namespace TarselCli
