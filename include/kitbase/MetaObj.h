// Meta objects: the structured values a command returns.
//
// A result is a tree of meta objects: scalars (MetaString, MetaInt, MetaBool), named structures
// whose fields keep the order in which they were first set (MetaStruct), and lists of strings or
// of structures (MetaList). Every object is created by its static New() and held by
// boost::shared_ptr; a structure or list shares the values put into it.
//
// A scalar created by New() without an argument has no value; formatters render it as empty
// text (json: null). Adding an element of the wrong kind to a list is a programming error and
// throws std::invalid_argument.
#pragma once

#include <kitbase/Export.h>

#include <boost/shared_ptr.hpp>

#include <string>
#include <utility>
#include <vector>

namespace Kitbase {
namespace MetaObj {

// The kind of a meta object. The values of MetaTypeString and MetaTypeStruct are part of the
// plug-in interface.
enum MetaType : int {
    MetaTypeBool = 0,
    MetaTypeInt = 1,
    MetaTypeString = 2,
    MetaTypeStruct = 3,
    MetaTypeList = 4,
};

class KITBASE_API MetaObject {
public:
    virtual ~MetaObject();
    virtual MetaType GetType() const = 0;
    // Whether the object carries a value; structures and lists always do.
    virtual bool HasValue() const;

protected:
    MetaObject() {}

private:
    MetaObject(const MetaObject&);
    MetaObject& operator=(const MetaObject&);
};

class KITBASE_API MetaString : public MetaObject {
public:
    static boost::shared_ptr<MetaString> New();
    static boost::shared_ptr<MetaString> New(const std::string& text);

    MetaType GetType() const;
    bool HasValue() const;
    const std::string& GetValue() const { return value_; }
    void SetValue(const std::string& text);

private:
    MetaString() : has_value_(false) {}
    std::string value_;
    bool has_value_;
};

class KITBASE_API MetaInt : public MetaObject {
public:
    static boost::shared_ptr<MetaInt> New();
    static boost::shared_ptr<MetaInt> New(long long value);

    MetaType GetType() const;
    bool HasValue() const;
    long long GetValue() const { return value_; }
    void SetValue(long long value);

private:
    MetaInt() : value_(0), has_value_(false) {}
    long long value_;
    bool has_value_;
};

class KITBASE_API MetaBool : public MetaObject {
public:
    static boost::shared_ptr<MetaBool> New();
    static boost::shared_ptr<MetaBool> New(bool value);

    MetaType GetType() const;
    bool HasValue() const;
    bool GetValue() const { return value_; }
    void SetValue(bool value);

private:
    MetaBool() : value_(false), has_value_(false) {}
    bool value_;
    bool has_value_;
};

class MetaList;

class KITBASE_API MetaStruct : public MetaObject {
public:
    typedef std::pair<std::string, boost::shared_ptr<MetaObject> > Field;

    static boost::shared_ptr<MetaStruct> New(const std::string& structName);

    MetaType GetType() const;
    const std::string& GetName() const { return name_; }

    // Setting a field that exists replaces its value in place; a new field goes last.
    void SetField(const std::string& fieldName, const std::string& value);
    void SetField(const std::string& fieldName, const char* value);
    void SetField(const std::string& fieldName, int value);
    void SetField(const std::string& fieldName, long value);
    void SetField(const std::string& fieldName, long long value);
    void SetField(const std::string& fieldName, bool value);
    void SetField(const std::string& fieldName, const std::vector<std::string>& value);
    void SetField(const std::string& fieldName, const boost::shared_ptr<MetaString>& value);
    void SetField(const std::string& fieldName, const boost::shared_ptr<MetaInt>& value);
    void SetField(const std::string& fieldName, const boost::shared_ptr<MetaBool>& value);
    void SetField(const std::string& fieldName, const boost::shared_ptr<MetaList>& value);

    const std::vector<Field>& GetFields() const { return fields_; }
    // The field's value, or a null pointer when the structure has no such field.
    boost::shared_ptr<MetaObject> GetField(const std::string& fieldName) const;

private:
    explicit MetaStruct(const std::string& structName) : name_(structName) {}
    void Put(const std::string& fieldName, const boost::shared_ptr<MetaObject>& value);

    std::string name_;
    std::vector<Field> fields_;
};

class KITBASE_API MetaList : public MetaObject {
public:
    // A list of strings (MetaTypeString) or of any scalar kind.
    static boost::shared_ptr<MetaList> New(MetaType elementType);
    // A list of structures shaped like the template (MetaTypeStruct).
    static boost::shared_ptr<MetaList> New(MetaType elementType,
                                           const boost::shared_ptr<MetaStruct>& structTemplate);

    MetaType GetType() const;

    virtual void AddValue(const boost::shared_ptr<MetaObject>& value);
    virtual void AddStruct(const boost::shared_ptr<MetaStruct>& value);
    virtual void AddString(const std::string& value);

    MetaType GetElementType() const { return element_type_; }
    // The structure template of a list of structures; null for other lists.
    const boost::shared_ptr<MetaStruct>& GetTemplate() const { return template_; }
    const std::vector<boost::shared_ptr<MetaObject> >& GetElements() const { return elements_; }
    std::size_t Size() const { return elements_.size(); }
    void Reserve(std::size_t count) { elements_.reserve(count); }

private:
    MetaList(MetaType elementType, const boost::shared_ptr<MetaStruct>& structTemplate)
        : element_type_(elementType), template_(structTemplate) {}

    MetaType element_type_;
    boost::shared_ptr<MetaStruct> template_;
    std::vector<boost::shared_ptr<MetaObject> > elements_;
};

}  // namespace MetaObj
}  // namespace Kitbase
