// A small hand-written schema with every kind of feature: the subject of the runtime's tests.
//
//   T_Base        Caption, System (key), Name (key)
//   T_Disk        : T_Base with one property of every kind, defaults, an embedded instance, a reference array
//                 and the method Reset
//   T_OtherDisk   : T_Base with an overriding Name (key) of its own
//   T_Link        association of two T_Base; T_SubLink derives from it and has a Note
//   T_Typed       keys of every kind that a model path can hold
//   T_Odd         keys that it cannot hold: real, datetime, array, reference array
//   T_Stranger    the keys of T_Base, but Name is a uint32
#pragma once

#include "runtime/meta/Instance.h"

namespace cimple
{

class T_Base : public Instance
{
public:
    Property<String> Caption;
    Property<String> System;
    Property<String> Name;

    static const Meta_Class static_meta_class;
};

class T_Disk : public T_Base
{
public:
    Property<bool> Online;
    Property<std::uint64_t> Size; // default 512
    Property<double> Ratio;
    Property<Datetime> Since;              // default one day
    Property<String> Vendor;               // default "none"
    Property<Array<std::uint16_t>> Status; // default 2, 3
    Property<Array<String>> Notes;         // default "a", "b"
    T_Base* Twin;
    Property<Array<Instance*>> Parts;

    static const Meta_Class static_meta_class;
};

class T_Disk_Reset : public Instance
{
public:
    Property<bool> Force;
    T_Base* Target;
    Property<std::uint32_t> return_value;

    static const Meta_Method static_meta_method;
};

class T_OtherDisk : public T_Base
{
public:
    static const Meta_Class static_meta_class;
};

class T_Link : public Instance
{
public:
    T_Base* Antecedent;
    T_Base* Dependent;

    static const Meta_Class static_meta_class;
};

class T_SubLink : public T_Link
{
public:
    Property<String> Note; // no key

    static const Meta_Class static_meta_class;
};

class T_Typed : public Instance
{
public:
    Property<bool> Flag;
    Property<std::uint8_t> U8;
    Property<std::int64_t> S64;
    Property<std::uint64_t> U64;
    Property<String> Text;
    T_Base* Owner;
    Property<String> Comment; // no key

    static const Meta_Class static_meta_class;
};

class T_Odd : public Instance
{
public:
    Property<float> Real;
    Property<Datetime> When;
    Property<Array<std::uint16_t>> List;
    Property<Array<Instance*>> Others;

    static const Meta_Class static_meta_class;
};

class T_Stranger : public Instance
{
public:
    Property<String> System;
    Property<std::uint32_t> Name;

    static const Meta_Class static_meta_class;
};

extern const Meta_Repository test_repository;

/// A T_Base or class derived from it with its keys set.
template <class Record> Record* make_named(const char* system, const char* name)
{
    Record* record = create<Record>();
    record->System.set(system);
    record->Name.set(name);
    return record;
}

/// An association that owns its two ends, either of which may be null.
template <class Record> Record* make_link(T_Base* antecedent, T_Base* dependent)
{
    Record* link = create<Record>();
    link->Antecedent = antecedent;
    link->Dependent = dependent;
    return link;
}

} // namespace cimple
