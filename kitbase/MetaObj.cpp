// Meta objects: scalars, structures and lists that commands return.
#include <kitbase/MetaObj.h>

#include "engine/Format.h"

#include <stdexcept>

namespace Kitbase {
namespace MetaObj {

MetaObject::~MetaObject() {}

bool MetaObject::HasValue() const { return true; }

// ---- scalars ----

boost::shared_ptr<MetaString> MetaString::New() {
    return boost::shared_ptr<MetaString>(new MetaString());
}

boost::shared_ptr<MetaString> MetaString::New(const std::string& text) {
    boost::shared_ptr<MetaString> object(new MetaString());
    object->SetValue(text);
    return object;
}

MetaType MetaString::GetType() const { return MetaTypeString; }
bool MetaString::HasValue() const { return has_value_; }

void MetaString::SetValue(const std::string& text) {
    value_ = text;
    has_value_ = true;
}

boost::shared_ptr<MetaInt> MetaInt::New() { return boost::shared_ptr<MetaInt>(new MetaInt()); }

boost::shared_ptr<MetaInt> MetaInt::New(long long value) {
    boost::shared_ptr<MetaInt> object(new MetaInt());
    object->SetValue(value);
    return object;
}

MetaType MetaInt::GetType() const { return MetaTypeInt; }
bool MetaInt::HasValue() const { return has_value_; }

void MetaInt::SetValue(long long value) {
    value_ = value;
    has_value_ = true;
}

boost::shared_ptr<MetaBool> MetaBool::New() { return boost::shared_ptr<MetaBool>(new MetaBool()); }

boost::shared_ptr<MetaBool> MetaBool::New(bool value) {
    boost::shared_ptr<MetaBool> object(new MetaBool());
    object->SetValue(value);
    return object;
}

MetaType MetaBool::GetType() const { return MetaTypeBool; }
bool MetaBool::HasValue() const { return has_value_; }

void MetaBool::SetValue(bool value) {
    value_ = value;
    has_value_ = true;
}

// ---- structures ----

boost::shared_ptr<MetaStruct> MetaStruct::New(const std::string& structName) {
    return boost::shared_ptr<MetaStruct>(new MetaStruct(structName));
}

MetaType MetaStruct::GetType() const { return MetaTypeStruct; }

void MetaStruct::Put(const std::string& fieldName, const boost::shared_ptr<MetaObject>& value) {
    if (!value) {
        throw std::invalid_argument("MetaStruct " + name_ + ": field '" + fieldName +
                                    "' set to a null object");
    }
    for (std::size_t i = 0; i < fields_.size(); ++i) {
        if (fields_[i].first == fieldName) {
            fields_[i].second = value;
            return;
        }
    }
    fields_.push_back(Field(fieldName, value));
}

void MetaStruct::SetField(const std::string& fieldName, const std::string& value) {
    Put(fieldName, MetaString::New(value));
}

void MetaStruct::SetField(const std::string& fieldName, const char* value) {
    if (!value) {
        Put(fieldName, MetaString::New());
    } else {
        Put(fieldName, MetaString::New(std::string(value)));
    }
}

void MetaStruct::SetField(const std::string& fieldName, int value) {
    Put(fieldName, MetaInt::New(static_cast<long long>(value)));
}

void MetaStruct::SetField(const std::string& fieldName, long value) {
    Put(fieldName, MetaInt::New(static_cast<long long>(value)));
}

void MetaStruct::SetField(const std::string& fieldName, long long value) {
    Put(fieldName, MetaInt::New(value));
}

void MetaStruct::SetField(const std::string& fieldName, bool value) {
    Put(fieldName, MetaBool::New(value));
}

void MetaStruct::SetField(const std::string& fieldName, const std::vector<std::string>& value) {
    boost::shared_ptr<MetaList> list = MetaList::New(MetaTypeString);
    list->Reserve(value.size());
    for (std::size_t i = 0; i < value.size(); ++i) list->AddString(value[i]);
    Put(fieldName, list);
}

void MetaStruct::SetField(const std::string& fieldName,
                          const boost::shared_ptr<MetaString>& value) {
    Put(fieldName, value);
}

void MetaStruct::SetField(const std::string& fieldName, const boost::shared_ptr<MetaInt>& value) {
    Put(fieldName, value);
}

void MetaStruct::SetField(const std::string& fieldName, const boost::shared_ptr<MetaBool>& value) {
    Put(fieldName, value);
}

void MetaStruct::SetField(const std::string& fieldName, const boost::shared_ptr<MetaList>& value) {
    Put(fieldName, value);
}

boost::shared_ptr<MetaObject> MetaStruct::GetField(const std::string& fieldName) const {
    for (std::size_t i = 0; i < fields_.size(); ++i) {
        if (fields_[i].first == fieldName) return fields_[i].second;
    }
    return boost::shared_ptr<MetaObject>();
}

// ---- lists ----

boost::shared_ptr<MetaList> MetaList::New(MetaType elementType) {
    return New(elementType, boost::shared_ptr<MetaStruct>());
}

boost::shared_ptr<MetaList> MetaList::New(MetaType elementType,
                                          const boost::shared_ptr<MetaStruct>& structTemplate) {
    switch (elementType) {
        case MetaTypeBool:
        case MetaTypeInt:
        case MetaTypeString:
            if (structTemplate) {
                throw std::invalid_argument(std::string("MetaList of ") +
                                            Engine::MetaKindName(elementType) +
                                            " given a structure template");
            }
            break;
        case MetaTypeStruct:
            break;  // the template is optional: rows then describe themselves
        default:
            throw std::invalid_argument("MetaList elements must be scalars or structures");
    }
    return boost::shared_ptr<MetaList>(new MetaList(elementType, structTemplate));
}

MetaType MetaList::GetType() const { return MetaTypeList; }

void MetaList::AddValue(const boost::shared_ptr<MetaObject>& value) {
    if (!value) throw std::invalid_argument("MetaList: null element");
    if (value->GetType() != element_type_) {
        throw std::invalid_argument(std::string("MetaList of ") +
                                    Engine::MetaKindName(element_type_) + ": cannot add a " +
                                    Engine::MetaKindName(value->GetType()));
    }
    elements_.push_back(value);
}

void MetaList::AddStruct(const boost::shared_ptr<MetaStruct>& value) { AddValue(value); }

void MetaList::AddString(const std::string& value) {
    if (element_type_ != MetaTypeString) {
        throw std::invalid_argument(std::string("MetaList of ") +
                                    Engine::MetaKindName(element_type_) + ": cannot add a string");
    }
    elements_.push_back(MetaString::New(value));
}

}  // namespace MetaObj
}  // namespace Kitbase
