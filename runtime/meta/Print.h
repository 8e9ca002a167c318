// Diagnostic text of meta records and instances, four spaces a level. For people only: nothing reads it back.
#pragma once

#include "runtime/meta/Instance.h"
#include "runtime/values/Buffer.h"

#include <cstdio>

namespace cimple
{

/// Append the text of a record to a buffer. Null pointers are not accepted.
void print(Buffer& out, const Meta_Feature* mf, unsigned level = 0);
void print(Buffer& out, const Meta_Method* mm, unsigned level = 0);
void print(Buffer& out, const Meta_Class* mc, unsigned level = 0);
void print(Buffer& out, const Instance* instance, unsigned level = 0);

/// The same to a stream.
template <class Record> void print(std::FILE* stream, const Record* record)
{
    Buffer out;
    print(out, record);
    std::fwrite(out.c_str(), 1, out.size(), stream);
}

} // namespace cimple
