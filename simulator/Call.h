// One call of an exported function: what stands between the C signature and the simulated host.
//
// A call is counted and may be held or failed by faults; otherwise it asks the host and hands the result to the
// caller within the caller's room, unless a fault makes the output short or hostile. Each kind of output has one
// function here. They return the status for the caller: that of a fault, of the host, or argumentError for a null
// pointer.
#pragma once

#include "simulator/Attributes.h"
#include "simulator/HostileOutput.h"
#include "simulator/Simulation.h"

#include <algorithm>
#include <cstring>

namespace tvrsim
{

class Call
{
public:
    using Subject = std::function<std::string()>;

    /// `function` is the exported name; `subject` tells what the call concerns. May block.
    Call(Simulation& simulation, const char* function, const Subject& subject = {})
        : _simulation(simulation), _effects(simulation.enter(function, subject))
    {}
    ~Call() { _simulation.leave(_effects); }
    Call(const Call&) = delete;
    Call& operator=(const Call&) = delete;

    SimulatedHost& host() { return _simulation.host; }

    /// A fault wants the call to fail.
    bool fails() const { return _effects.status.has_value(); }
    bool isHostile(Hostile kind) const { return _effects.hostile == kind; }

    /// For a function without output. `action` returns the status.
    template <class Action> std::int32_t status(Action action)
    {
        return fails() ? *_effects.status : static_cast<std::int32_t>(action());
    }

    /// For a record or a number. `read` fills one and returns the status. With status `also` it is handed out too.
    template <class Record, class Read> std::int32_t record(Record* out, Read read, std::int32_t also = RM_OK)
    {
        return output(out,
                      [&]
                      {
                          Record record{};
                          const auto status = static_cast<std::int32_t>(read(record));
                          if (status != RM_OK && status != also)
                              return status;
                          if (_effects.hostile)
                              deform(record, *_effects.hostile);
                          std::memcpy(out, &record, kept(sizeof record));
                          return status;
                      });
    }

    /// For a text in a buffer of `room` bytes, cut if need be. `read` gives the text and returns the status.
    template <class Read> std::int32_t text(char* out, std::size_t room, Read read)
    {
        return output(out,
                      [&]
                      {
                          std::string text;
                          const auto status = static_cast<std::int32_t>(read(text));
                          if (room == 0)
                              return status;
                          if (isHostile(Hostile::unterminatedText))
                              std::memset(out, 'X', room);
                          else
                              out[text.copy(out, kept(room - 1))] = '\0';
                          return status;
                      });
    }

    /// For a list: `count` is the room in entries, and then the number available. `read` gives all entries. `tooSmall`
    /// is the status where there are more than there is room for.
    template <class List, class Read>
    std::int32_t list(List* out, std::uint32_t List::*count, Read read, std::int32_t tooSmall = RM_ERROR_MORE_DATA)
    {
        using Entry = std::remove_reference_t<decltype(out->entry[0])>;
        return output(out,
                      [&]
                      {
                          std::vector<Entry> entries;
                          const auto status = static_cast<std::int32_t>(read(entries));
                          if (status != RM_OK)
                              return status;
                          const std::size_t room = out->*count;
                          const std::size_t fitting = std::min(room, entries.size());
                          if (_effects.hostile)
                              for (Entry& entry : entries)
                                  deform(entry, *_effects.hostile);
                          if (fitting > 0)
                              std::memcpy(out->entry, entries.data(), kept(fitting * sizeof(Entry)));
                          const bool huge = isHostile(Hostile::hugeCount);
                          out->*count = huge ? 0xFFFF'FFFF : static_cast<std::uint32_t>(entries.size());
                          return entries.size() > room && !huge ? tooSmall : status;
                      });
    }

    /// For an attribute buffer of `*size` bytes, which gets the number in use, or needed.
    template <class Read> std::int32_t attributes(void* out, std::uint32_t* size, Read read)
    {
        return output(size ? out : nullptr,
                      [&]
                      {
                          AttributeList list;
                          const auto status = static_cast<std::int32_t>(read(list));
                          return status == RM_OK ? deliverAttributes(list, out, *size) : status;
                      });
    }

    /// For a SCSI command. `run` gives the reply and returns the status.
    template <class Run>
    std::int32_t scsi(void* response, std::uint32_t responseSize, void* sense, std::uint32_t senseSize, Run run)
    {
        return output(responseSize > 0 ? response : this,
                      [&]
                      {
                          ScsiReply reply;
                          const auto status = static_cast<std::int32_t>(run(reply));
                          deliverScsi(std::move(reply), response, responseSize, sense, senseSize);
                          return status;
                      });
    }

private:
    static constexpr std::int32_t argumentError = HBA_STATUS_ERROR_ARG;

    template <class Produce> std::int32_t output(const void* out, Produce produce)
    {
        if (fails())
            return *_effects.status;
        return out ? produce() : argumentError;
    }

    /// Bytes of an output that faults let through.
    std::size_t kept(std::size_t length) const { return std::min(length, _effects.truncate.value_or(length)); }

    std::int32_t deliverAttributes(const AttributeList& list, void* out, std::uint32_t& size) const;
    void deliverScsi(ScsiReply reply, void* response, std::size_t responseSize, void* sense,
                     std::size_t senseSize) const;

    Simulation& _simulation;
    const Effects _effects;
};

} // namespace tvrsim
