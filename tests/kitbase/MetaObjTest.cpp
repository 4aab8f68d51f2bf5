// Meta objects and call descriptions: values, field order, list kinds, misuse, and what an
// Input answers for each kind of parameter.
#include <kitbase/CallSpec.h>
#include <kitbase/MetaObj.h>

#include <gtest/gtest.h>

#include <limits>
#include <stdexcept>

namespace {

using namespace Kitbase;
using namespace Kitbase::MetaObj;
using namespace Kitbase::CallSpec;

TEST(MetaObj, ScalarsKnowWhetherTheyHoldAValue) {
    EXPECT_FALSE(MetaString::New()->HasValue());
    EXPECT_FALSE(MetaInt::New()->HasValue());
    EXPECT_FALSE(MetaBool::New()->HasValue());
    EXPECT_TRUE(MetaString::New("")->HasValue());
    EXPECT_TRUE(MetaInt::New(0)->HasValue());
    EXPECT_TRUE(MetaBool::New(false)->HasValue());

    boost::shared_ptr<MetaInt> number = MetaInt::New();
    number->SetValue(std::numeric_limits<long long>::min());
    EXPECT_TRUE(number->HasValue());
    EXPECT_EQ(std::numeric_limits<long long>::min(), number->GetValue());
    EXPECT_TRUE(MetaStruct::New("S")->HasValue());
    EXPECT_TRUE(MetaList::New(MetaTypeString)->HasValue());
}

TEST(MetaObj, StructFieldsKeepFirstSetOrderAndReplaceInPlace) {
    boost::shared_ptr<MetaStruct> row = MetaStruct::New("Row");
    row->SetField("B", "text");
    row->SetField("A", 7);
    row->SetField("C", true);
    row->SetField("B", 5LL);  // replaced in place, kind may change
    ASSERT_EQ(3u, row->GetFields().size());
    EXPECT_EQ("B", row->GetFields()[0].first);
    EXPECT_EQ("A", row->GetFields()[1].first);
    EXPECT_EQ("C", row->GetFields()[2].first);
    EXPECT_EQ(MetaTypeInt, row->GetField("B")->GetType());
    EXPECT_FALSE(row->GetField("missing"));
}

TEST(MetaObj, SetFieldOverloadsMakeTheMatchingKind) {
    boost::shared_ptr<MetaStruct> row = MetaStruct::New("Row");
    row->SetField("cstr", "x");
    row->SetField("nullcstr", static_cast<const char*>(nullptr));
    row->SetField("int", 1);
    row->SetField("long", 2L);
    row->SetField("longlong", 3LL);
    row->SetField("bool", false);
    row->SetField("strings", std::vector<std::string>{"a", "b"});
    row->SetField("shared", MetaInt::New());
    EXPECT_EQ(MetaTypeString, row->GetField("cstr")->GetType());
    EXPECT_FALSE(row->GetField("nullcstr")->HasValue());
    EXPECT_EQ(2, boost::static_pointer_cast<MetaInt>(row->GetField("long"))->GetValue());
    EXPECT_EQ(MetaTypeBool, row->GetField("bool")->GetType());
    boost::shared_ptr<MetaList> strings =
        boost::dynamic_pointer_cast<MetaList>(row->GetField("strings"));
    ASSERT_TRUE(strings);
    EXPECT_EQ(MetaTypeString, strings->GetElementType());
    EXPECT_EQ(2u, strings->Size());
    EXPECT_FALSE(row->GetField("shared")->HasValue());
    EXPECT_THROW(row->SetField("null", boost::shared_ptr<MetaString>()), std::invalid_argument);
}

TEST(MetaObj, ListsAcceptOnlyTheirElementKind) {
    boost::shared_ptr<MetaList> strings = MetaList::New(MetaTypeString);
    strings->AddString("a");
    strings->AddValue(MetaString::New("b"));
    EXPECT_THROW(strings->AddValue(MetaInt::New(1)), std::invalid_argument);
    EXPECT_THROW(strings->AddStruct(MetaStruct::New("S")), std::invalid_argument);
    EXPECT_THROW(strings->AddValue(boost::shared_ptr<MetaObject>()), std::invalid_argument);
    EXPECT_EQ(2u, strings->Size());

    boost::shared_ptr<MetaStruct> shape = MetaStruct::New("S");
    boost::shared_ptr<MetaList> rows = MetaList::New(MetaTypeStruct, shape);
    EXPECT_EQ(shape, rows->GetTemplate());
    rows->AddStruct(MetaStruct::New("S"));
    EXPECT_THROW(rows->AddString("x"), std::invalid_argument);
    EXPECT_EQ(1u, rows->Size());

    boost::shared_ptr<MetaList> ints = MetaList::New(MetaTypeInt);
    ints->AddValue(MetaInt::New(3));
    EXPECT_THROW(ints->AddString("3"), std::invalid_argument);
    EXPECT_FALSE(ints->GetTemplate());

    EXPECT_THROW(MetaList::New(MetaTypeList), std::invalid_argument);
    EXPECT_THROW(MetaList::New(MetaTypeString, shape), std::invalid_argument);
}

TEST(CallSpec, MisuseIsRefusedWhenTheSpecIsBuilt) {
    EXPECT_THROW(ParameterSpec::New("", ParameterTypeString), std::invalid_argument);
    EXPECT_THROW(ParameterSpec::New("two words", ParameterTypeString), std::invalid_argument);
    EXPECT_THROW(ParameterSpec::New("-dash", ParameterTypeString), std::invalid_argument);
    EXPECT_THROW(ParameterSpec::New("x", static_cast<ParameterType>(9)), std::invalid_argument);
    boost::shared_ptr<ParameterSpec> p = ParameterSpec::New("name", ParameterTypeString);
    EXPECT_THROW(p->SetShortName("nm"), std::invalid_argument);
    EXPECT_THROW(p->SetShortName(""), std::invalid_argument);
    EXPECT_THROW(p->SetShortName("-"), std::invalid_argument);
    EXPECT_THROW(p->AddConstraint(boost::shared_ptr<ParameterConstraint>()),
                 std::invalid_argument);

    boost::shared_ptr<ParameterConstraint> range = ParameterConstraint::New(ConstraintIntRange);
    EXPECT_THROW(range->SetIntRange(5, 4), std::invalid_argument);
    EXPECT_THROW(range->SetStringRegex("x"), std::invalid_argument);
    range->SetIntRange(4, 4);
    EXPECT_EQ(4, range->GetLow());
    EXPECT_THROW(ParameterConstraint::New(static_cast<ParameterConstraintType>(2)),
                 std::invalid_argument);
    EXPECT_THROW(ParameterConstraint::New(ConstraintStringRegex)->SetIntRange(1, 2),
                 std::invalid_argument);
}

TEST(CallSpec, InputSpecKeepsOrderAndRefusesDuplicateNames) {
    boost::shared_ptr<InputSpec> spec = InputSpec::New();
    boost::shared_ptr<ParameterSpec> name = ParameterSpec::New("name", ParameterTypeString);
    name->SetShortName("n");
    spec->AddParameter(name);
    spec->AddParameter(ParameterSpec::New("count", ParameterTypeInt));
    EXPECT_THROW(spec->AddParameter(ParameterSpec::New("name", ParameterTypeInt)),
                 std::invalid_argument);
    boost::shared_ptr<ParameterSpec> clash = ParameterSpec::New("number", ParameterTypeInt);
    clash->SetShortName("n");
    EXPECT_THROW(spec->AddParameter(clash), std::invalid_argument);
    ASSERT_EQ(2u, spec->GetParameters().size());
    EXPECT_EQ("count", spec->GetParameters()[1]->GetName());
    EXPECT_EQ(name, spec->Find("name"));
    EXPECT_EQ(name, spec->FindShort("n"));
    EXPECT_FALSE(spec->Find("n"));
    EXPECT_FALSE(spec->FindShort(""));
}

TEST(CallSpec, InputAnswersEveryReadForEveryKind) {
    boost::shared_ptr<Input> input = Input::New();
    input->SetString("s", "hello");
    input->SetString("numeric", "-12");
    input->SetString("yes", "YES");
    input->SetInt("i", -9223372036854775807LL - 1);
    input->SetBool("b", true);
    input->SetBool("off", false);
    input->SetFlag("f");

    EXPECT_EQ("hello", input->GetString("s"));
    EXPECT_EQ(0, input->GetInt("s"));
    EXPECT_FALSE(input->GetBool("s"));
    EXPECT_EQ(-12, input->GetInt("numeric"));
    EXPECT_TRUE(input->GetBool("yes"));

    EXPECT_EQ("-9223372036854775808", input->GetString("i"));
    EXPECT_EQ(-9223372036854775807LL - 1, input->GetInt("i"));

    EXPECT_EQ("true", input->GetString("b"));
    EXPECT_EQ("false", input->GetString("off"));
    EXPECT_TRUE(input->GetBool("b"));
    EXPECT_FALSE(input->GetBool("off"));
    EXPECT_TRUE(input->HasValue("off"));

    EXPECT_TRUE(input->GetFlag("f"));
    EXPECT_TRUE(input->HasValue("f"));

    // Not given: empty, 0, false.
    EXPECT_FALSE(input->HasValue("absent"));
    EXPECT_EQ("", input->GetString("absent"));
    EXPECT_EQ(0, input->GetInt("absent"));
    EXPECT_FALSE(input->GetBool("absent"));
    EXPECT_FALSE(input->GetFlag("absent"));
}

TEST(CallSpec, OutputKeepsErrorsInOrderAndOneResult) {
    boost::shared_ptr<Output> output = Output::New();
    EXPECT_FALSE(output->IsComplete());
    output->SetError("first");
    output->SetError("second");
    output->SetResult(MetaInt::New(1));
    boost::shared_ptr<MetaObject> last = MetaInt::New(2);
    output->SetResult(last);
    output->Complete();
    EXPECT_EQ((std::vector<std::string>{"first", "second"}), output->GetErrors());
    EXPECT_EQ(last, output->GetResult());
    EXPECT_TRUE(output->IsComplete());
}

}  // namespace
