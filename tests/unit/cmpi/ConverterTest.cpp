#include "runtime/cmpi/Converter.h"

#include "runtime/cmpi/CmpiContainers.h"
#include "tests/unit/cmpi/FakeBroker.h"
#include "tests/unit/runtime/Records.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>
#include <utility>

namespace cimple
{
namespace
{

using namespace fake;

struct Converter : testing::Test
{
    Broker broker;

    Ref<T_Typed> keys(const std::vector<Entry>& entries)
    {
        Ref<> instance;
        make_cimple_reference(&T_Typed::static_meta_class, broker.path("T_Typed", entries), *instance.out());
        return Ref<T_Typed>(static_cast<T_Typed*>(instance.release()));
    }

    CMPIInstance* to_cmpi(const Instance* instance, const char** properties = nullptr)
    {
        CMPIObjectPath* path = nullptr;
        CMPIInstance* inst = nullptr;
        EXPECT_EQ(make_cmpi_object_path(broker.handle(), instance, "root/a", path), CMPI_RC_OK);
        EXPECT_EQ(make_cmpi_instance(broker.handle(), instance, "root/a", path, properties, inst), CMPI_RC_OK);
        return inst;
    }

    Ref<> from_cmpi(const Meta_Class& mc, const CMPIInstance* inst)
    {
        Ref<> instance;
        EXPECT_EQ(make_cimple_instance(&mc, named(inst).path, inst, *instance.out()), CMPI_RC_OK);
        return instance;
    }

    CMPIData string(const char* text) { return string_of(broker.string(text)); }
};

Ref<T_Disk> make_disk()
{
    Ref<T_Disk> disk(make_named<T_Disk>("host", "d0"));
    set_name_space(disk.get(), "root/a", true);
    disk->Caption.set("a \"disk\"");
    disk->Online.set(true);
    disk->Size.set(std::uint64_t{1} << 63);
    disk->Ratio.set(-0.5);
    disk->Since.set(Datetime::interval(3 * Datetime::day + 1));
    disk->Vendor.set_null();
    disk->Status.set({2, 0xFFFF});
    disk->Notes.set({"x", ""});
    disk->Twin = make_named<T_Disk>("host", "twin");
    set_name_space(disk->Twin, "root/other", true);
    disk->Parts.set({make_named<T_Base>("host", "p0"), make_named<T_OtherDisk>("host", "p1")});
    for (Instance* part : disk->Parts.value)
        set_name_space(part, "root/a", true);
    return disk;
}

// --- whole instances ------------------------------------------------------------------------------------------

TEST_F(Converter, brings_an_instance_of_all_kinds_back_unchanged)
{
    const Ref<T_Disk> disk = make_disk();
    CMPIInstance* inst = to_cmpi(disk.get());
    EXPECT_EQ(named(inst).find("Vendor"), nullptr) << "a null property is absent";
    EXPECT_EQ(named(inst).find("Twin")->type, CMPI_instance) << "embedded";
    EXPECT_EQ(named(inst).find("Parts")->type, CMPI_refA) << "references";

    const Ref<> back = from_cmpi(T_Disk::static_meta_class, inst);
    const auto* copy = static_cast<const T_Disk*>(back.get());
    EXPECT_TRUE(copy->Vendor.is_null());
    EXPECT_TRUE(key_eq(disk.get(), copy));
    EXPECT_EQ(copy->Size.value, disk->Size.value);
    EXPECT_EQ(copy->Ratio.value, disk->Ratio.value);
    EXPECT_EQ(copy->Since.value, disk->Since.value);
    EXPECT_EQ(copy->Status.value, disk->Status.value);
    EXPECT_EQ(copy->Notes.value, disk->Notes.value);
    ASSERT_TRUE(copy->Twin);
    EXPECT_TRUE(key_eq(copy->Twin, disk->Twin));
    ASSERT_EQ(copy->Parts.value.size(), 2u);
    EXPECT_STREQ(copy->Parts.value[1]->__meta_class->name, "T_OtherDisk");
}

TEST_F(Converter, keeps_the_namespace_of_a_referenced_instance)
{
    const Ref<T_Link> link(make_link<T_Link>(make_named<T_Base>("h", "a"), make_named<T_Base>("h", "b")));
    set_name_space(link->Antecedent, "root/far", true);
    CMPIObjectPath* path = nullptr;
    ASSERT_EQ(make_cmpi_object_path(broker.handle(), link.get(), "root/a", path), CMPI_RC_OK);
    EXPECT_EQ(named(named(path).find("Antecedent")->value.ref).name_space, "root/far");
    EXPECT_EQ(named(named(path).find("Dependent")->value.ref).name_space, "root/a");
}

TEST_F(Converter, gives_the_filter_the_names_of_the_keys)
{
    const char* wanted[] = {"Caption", nullptr};
    const CMPIInstance* inst = to_cmpi(make_disk().get(), wanted);
    EXPECT_EQ(named(inst).filter, std::vector<std::string>{"Caption"});
    EXPECT_EQ(named(inst).filter_keys, (std::vector<std::string>{"System", "Name"}));
    EXPECT_EQ(broker.faults, std::vector<std::string>());
}

TEST_F(Converter, drops_only_what_does_not_fit)
{
    CMPIArray* with_null = broker.array(CMPI_string, {string("x"), null_of(CMPI_string)});
    CMPIArray* of_other_type = broker.array(CMPI_uint16, {uint64_of(1)});
    CMPIObjectPath* stranger = broker.path("T_Stranger", {{"System", string("s")}});
    const CMPIInstance* inst = broker.instance(
        broker.path("T_Disk"), {
                                   {"Unknown", string("?")},
                                   {"Size", string("12")}, // instances are not converted from text
                                   {"Notes", data_of(CMPI_stringA, CMPIValue{.array = with_null})},
                                   {"Status", data_of(CMPI_uint16A, CMPIValue{.array = of_other_type})},
                                   {"Twin", data_of(CMPI_ref, CMPIValue{.ref = stranger})},
                                   {"Vendor", data_of(CMPI_string, CMPIValue{.string = nullptr})},
                                   {"ONLINE", data_of(CMPI_boolean, CMPIValue{.boolean = 2})},
                                   {"Since", data_of(CMPI_dateTime, CMPIValue{.dateTime = broker.datetime("soon")})},
                                   {"Name", string("d0")},
                               });
    const Ref<> instance = from_cmpi(T_Disk::static_meta_class, inst);
    const auto& disk = static_cast<const T_Disk&>(*instance);
    EXPECT_TRUE(disk.Size.is_null());
    EXPECT_TRUE(disk.Notes.is_null());
    EXPECT_TRUE(disk.Status.is_null());
    EXPECT_EQ(disk.Twin, nullptr);
    EXPECT_TRUE(disk.Vendor.is_null());
    EXPECT_TRUE(disk.Since.is_null());
    EXPECT_TRUE(disk.Online.value) << "names in any case, and any byte but 0 is true";
    EXPECT_FALSE(disk.Name.is_null());
    EXPECT_EQ(disk.__name_space, "root/a");
}

TEST_F(Converter, survives_references_nested_without_end)
{
    CMPIObjectPath* path = broker.path("T_Base", {{"Name", string("end")}});
    for (int i = 0; i < 10'000; ++i)
        path = broker.path("T_Link", {{"Antecedent", data_of(CMPI_ref, CMPIValue{.ref = path})}});
    Ref<> link;
    EXPECT_EQ(make_cimple_reference(&T_Link::static_meta_class, path, *link.out()), CMPI_RC_OK);
    EXPECT_EQ(static_cast<T_Link*>(link.get())->Antecedent, nullptr);
}

// --- keys -------------------------------------------------------------------------------------------------------

/// One broker makes null of an empty text, with or without the type.
TEST_F(Converter, reads_a_null_string_key_as_empty)
{
    for (const CMPIData& null : {null_of(CMPI_string), string_of(nullptr), null_of(CMPI_null)})
    {
        const Ref<T_Typed> typed = keys({{"Text", null}, {"U8", null_of(CMPI_uint64)}});
        EXPECT_FALSE(typed->Text.is_null());
        EXPECT_TRUE(typed->Text.value.empty());
        EXPECT_TRUE(typed->U8.is_null()) << "not so a number";

        CMPIObjectPath* owner = broker.path("T_Base", {{"System", string("h")}, {"Name", null}});
        const Ref<T_Typed> owned = keys({{"Owner", data_of(CMPI_ref, CMPIValue{.ref = owner})}});
        ASSERT_TRUE(owned->Owner);
        EXPECT_FALSE(owned->Owner->Name.is_null()) << "inside of a reference";
        EXPECT_TRUE(owned->Text.is_null()) << "a key that is not there stays null";
    }
    const CMPIInstance* inst = broker.instance(broker.path("T_Base"), {{"Name", null_of(CMPI_string)}});
    EXPECT_TRUE(static_cast<const T_Base&>(*from_cmpi(T_Base::static_meta_class, inst)).Name.is_null())
        << "nor a property";
}

TEST_F(Converter, narrows_integer_keys_that_fit)
{
    const Ref<T_Typed> typed = keys({{"U8", sint64_of(255)},
                                     {"S64", uint64_of(7)},
                                     {"U64", sint64_of(9)},
                                     {"Flag", uint64_of(1)},
                                     {"Text", uint64_of(5)}});
    EXPECT_EQ(typed->U8.value, 255);
    EXPECT_EQ(typed->S64.value, 7);
    EXPECT_EQ(typed->U64.value, 9u);
    EXPECT_TRUE(typed->Flag.value);
    EXPECT_FALSE(typed->U8.is_null() || typed->S64.is_null() || typed->U64.is_null() || typed->Flag.is_null());
    EXPECT_TRUE(typed->Text.is_null());

    const Ref<T_Typed> wrong = keys({{"U8", sint64_of(-1)}, {"U64", sint64_of(-1)}, {"Flag", uint64_of(2)}});
    EXPECT_TRUE(wrong->U8.is_null() && wrong->U64.is_null() && wrong->Flag.is_null());
}

TEST_F(Converter, sets_a_narrow_key_exactly_when_the_value_is_in_range)
{
    rc::check(
        [&](std::int64_t raw, bool small)
        {
            const std::int64_t number = small ? raw % 300 : raw;
            const Ref<T_Typed> typed = keys({{"U8", sint64_of(number)}, {"U64", sint64_of(number)}});
            RC_ASSERT(typed->U8.is_null() == !std::in_range<std::uint8_t>(number));
            RC_ASSERT(typed->U8.is_null() || typed->U8.value == number);
            RC_ASSERT(typed->U64.is_null() == (number < 0));
        });
}

// --- methods ------------------------------------------------------------------------------------------------------

/// A parameter record with what T_Disk_Reset lacks.
class Call : public Instance
{
public:
    Property<std::uint16_t> Count;
    Property<float> Level;
    Property<bool> On;
    Property<Array<Instance*>> Parts;
    Property<String> Answer;
    Property<std::uint32_t> return_value;

    static const Meta_Method method;
};

#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Winvalid-offsetof"
constexpr Meta_Property parameter(std::uint32_t flags, const char* name, Type type, std::size_t offset)
{
    return {{0, flags | META_PROPERTY, name, nullptr, 0}, type, 0, static_cast<std::uint32_t>(offset), nullptr};
}
constexpr Meta_Property call_count = parameter(META_IN, "Count", UINT16, offsetof(Call, Count));
constexpr Meta_Property call_level = parameter(META_IN, "Level", REAL32, offsetof(Call, Level));
constexpr Meta_Property call_on = parameter(META_IN, "On", BOOLEAN, offsetof(Call, On));
constexpr Meta_Reference call_parts = {{0, META_IN | META_REFERENCE | META_EMBEDDED_INSTANCE, "Parts", nullptr, 0},
                                       -1,
                                       &T_Base::static_meta_class,
                                       offsetof(Call, Parts)};
constexpr Meta_Property call_answer = parameter(META_OUT, "Answer", STRING, offsetof(Call, Answer));
constexpr Meta_Property call_return = parameter(META_OUT, "return_value", UINT32, offsetof(Call, return_value));
#pragma GCC diagnostic pop
constexpr const Meta_Feature* call_features[] = {&call_count, &call_level,  &call_on,
                                                 &call_parts, &call_answer, &call_return};
const Meta_Method Call::method = {{{0, META_METHOD, "Call", nullptr, 0}, call_features, 6, sizeof(Call)}, UINT32};

struct Method : Converter
{
    Ref<Call> read(const std::vector<Entry>& in)
    {
        Ref<> record;
        make_cimple_method(&T_Disk::static_meta_class, &Call::method, broker.path("T_Disk"), broker.args(in),
                           *record.out());
        return Ref<Call>(static_cast<Call*>(record.release()));
    }
};

TEST_F(Method, reads_arguments_that_arrive_as_text)
{
    const Ref<Call> call = read({{"Count", string("0x1F")}, {"On", string("true")}, {"Level", string("1.5")}});
    EXPECT_EQ(call->Count.value, 31);
    EXPECT_FALSE(call->Count.is_null());
    EXPECT_TRUE(call->On.value);
    EXPECT_TRUE(call->Level.is_null()) << "reals are not read from text";
    EXPECT_EQ(call->__name_space, "root/a");

    const Ref<Call> wrong = read({{"Count", string("65536")}, {"On", string("")}});
    EXPECT_TRUE(wrong->Count.is_null());
    EXPECT_TRUE(wrong->On.is_null());
}

TEST_F(Method, ignores_out_arguments_and_takes_any_null_for_an_instance_array)
{
    const Ref<Call> call = read({{"Answer", string("x")}, {"Parts", null_of(CMPI_string)}});
    EXPECT_TRUE(call->Answer.is_null());
    EXPECT_EQ(call->Parts.null, 1);
    EXPECT_EQ(call->Parts.value.size(), 0u);
    EXPECT_EQ(read({})->Parts.null, 1) << "an array that was not sent";
}

TEST_F(Method, returns_out_arguments_and_the_return_value_apart)
{
    const Ref<> record(create(&Call::method));
    auto& call = static_cast<Call&>(*record);
    nullify(&call, true, true, 1);
    call.Count.set(1);
    call.Answer.set("yes");
    call.return_value.set(4096);
    CMPIArgs* out = broker.args();
    CMPIData data = {};
    ASSERT_EQ(make_cmpi_method(broker.handle(), &call, "root/a", out, data), CMPI_RC_OK);
    ASSERT_EQ(named(out).entries.size(), 1u);
    EXPECT_EQ(text(named(out).find("Answer")->value.string), "yes");
    EXPECT_EQ(data.value.uint32, 4096u);

    call.return_value.set_null();
    ASSERT_EQ(make_cmpi_method(broker.handle(), &call, "root/a", out, data), CMPI_RC_OK);
    EXPECT_EQ(data.type, CMPI_uint32);
    EXPECT_EQ(value_pointer(data), nullptr);
}

// --- values -------------------------------------------------------------------------------------------------------

TEST(Value, refuses_another_tag_without_touching_the_target)
{
    Value value;
    EXPECT_EQ(value.type(), Value::NONE);
    EXPECT_FALSE(value.null());
    const std::uint16_t number = 77;
    value.set_scalar(Value::CHAR16, &number);
    std::uint16_t out = 1;
    EXPECT_EQ(value.get(out), -1) << "char16 is not uint16";
    EXPECT_EQ(out, 1);
    EXPECT_EQ(value.get(out, Value::CHAR16), 0);
    EXPECT_EQ(out, 77);
    EXPECT_STREQ(Value::type_name(Value::NONE), "none");
    for (std::uint32_t type = 0; type < num_types; ++type)
    {
        std::string name = type_name(type);
        for (char& c : name)
            c = static_cast<char>(std::toupper(c));
        EXPECT_EQ(Value::type_name(static_cast<Value::Type>(type)), name);
        EXPECT_EQ(Value::type_name(static_cast<Value::Type>(type | Value::array_bit)), name + "_ARRAY");
    }
    EXPECT_STREQ(Value::type_name(Value::INSTANCE), "INSTANCE");
    EXPECT_STREQ(Value::type_name(Value::INSTANCE_ARRAY), "INSTANCE_ARRAY");
}

TEST_F(Converter, codes_of_types_come_back)
{
    for (std::int32_t tag = Value::BOOLEAN; tag <= Value::INSTANCE; ++tag)
    {
        for (std::int32_t array : {0, Value::array_bit})
        {
            const auto type = static_cast<Value::Type>(tag | array);
            EXPECT_EQ(value_type_of(cmpi_type_of(type, 0)), type);
            EXPECT_EQ(value_type_of(cmpi_type_of(type, META_EMBEDDED_OBJECT)), type);
        }
    }
    for (CMPIType other : {CMPI_null, CMPI_chars, CMPI_filter, CMPI_ptr, CMPIType{0xFFFF}})
        EXPECT_EQ(value_type_of(other), Value::NONE) << other;
}

} // namespace
} // namespace cimple
