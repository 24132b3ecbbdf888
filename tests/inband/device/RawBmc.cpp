#include "RawBmc.h"

#include "ipmi/IpmiError.h"

#include <algorithm>

namespace inbandsim
{

namespace
{

using namespace QX::Ipmi; // the completion codes

void put16(std::vector<std::uint8_t>& out, unsigned value)
{
    out.push_back(static_cast<std::uint8_t>(value));
    out.push_back(static_cast<std::uint8_t>(value >> 8));
}

void put32(std::vector<std::uint8_t>& out, std::uint32_t value)
{
    put16(out, value & 0xFFFF);
    put16(out, value >> 16);
}

unsigned get16(const std::vector<std::uint8_t>& data, std::size_t at)
{
    return data[at] | static_cast<unsigned>(data[at + 1]) << 8;
}

std::vector<std::uint8_t> deviceId()
{
    // Device 20h revision 1, firmware 1.02, IPMI 2.0; SEL, SDR repository
    // and chassis device; manufacturer and product ids of an unnamed
    // server.
    return {completionOk, 0x20, 0x01, 0x01, 0x02, 0x02, 0x8D,
            0x00,         0x00, 0x00, 0x01, 0x00, 0x00, 0x00};
}

std::vector<std::uint8_t> sdrRepositoryInfo()
{
    // SDR version 51h, no records, free space 0, no timestamps, support:
    // non-modal update, reserve supported.
    std::vector<std::uint8_t> out{completionOk, 0x51};
    put16(out, 0);
    put16(out, 0);
    put32(out, 0);
    put32(out, 0);
    out.push_back(0x22);
    return out;
}

} // namespace

std::vector<std::uint8_t> RawBmc::answer(std::uint8_t netFn,
                                         std::uint8_t command,
                                         const std::vector<std::uint8_t>& data)
{
    if (netFn == netFnApp && command == 0x01)
    {
        return deviceId();
    }
    if (netFn == netFnChassis && command == 0x07)
    {
        if (!restartCause)
        {
            return {completionInvalidCommand};
        }
        return {completionOk, *restartCause, 0x00};
    }
    if (netFn != netFnStorage)
    {
        return {completionInvalidCommand};
    }
    switch (command)
    {
        case 0x20: // Get SDR Repository Info
            return sdrRepositoryInfo();
        case 0x22: // Reserve SDR Repository
            return {completionOk, 0x01, 0x00};
        case 0x23: // Get SDR: the repository is empty
            return {completionRecordNotPresent};
        case 0x40:
            return selInfo();
        case 0x42:
        {
            ++reservation_;
            if (reservation_ == 0)
            {
                reservation_ = 1;
            }
            std::vector<std::uint8_t> out{completionOk};
            put16(out, reservation_);
            return out;
        }
        case 0x43:
            return selEntry(data);
        case 0x44:
            return addEntry(data);
        case 0x47:
            return clear(data);
        case 0x48: // Get SEL Time
        {
            std::vector<std::uint8_t> out{completionOk};
            put32(out, clock_);
            return out;
        }
        default:
            return {completionInvalidCommand};
    }
}

std::vector<std::uint8_t> RawBmc::selInfo() const
{
    std::vector<std::uint8_t> out{completionOk, 0x51};
    put16(out, static_cast<unsigned>(sel_.size()));
    const std::size_t freeRecords =
        capacity > sel_.size() ? capacity - sel_.size() : 0;
    put16(out, static_cast<unsigned>(
                   std::min<std::size_t>(freeRecords * 16, 0xFFFF)));
    put32(out, lastAddition_);
    put32(out, lastErase_);
    out.push_back(0x02); // Reserve SEL supported
    return out;
}

bool RawBmc::reserved(const std::vector<std::uint8_t>& data) const
{
    const unsigned id = get16(data, 0);
    return id == 0 || id == reservation_;
}

std::vector<std::uint8_t>
RawBmc::selEntry(const std::vector<std::uint8_t>& data)
{
    if (data.size() != 6)
    {
        return {completionRequestLengthInvalid};
    }
    if (!reserved(data))
    {
        return {completionReservationCancelled};
    }
    const unsigned wanted = get16(data, 2);
    const unsigned offset = data[4];
    const unsigned length = data[5] == 0xFF ? 16 : data[5];
    if (offset + length > 16)
    {
        return {completionInvalidDataField};
    }
    std::size_t at = sel_.size();
    if (wanted == 0x0000 && !sel_.empty())
    {
        at = 0;
    }
    else if (wanted == 0xFFFF && !sel_.empty())
    {
        at = sel_.size() - 1;
    }
    else
    {
        for (std::size_t i = 0; i < sel_.size(); ++i)
        {
            if ((sel_[i][0] | sel_[i][1] << 8) == static_cast<int>(wanted))
            {
                at = i;
            }
        }
    }
    if (at == sel_.size())
    {
        return {completionRecordNotPresent};
    }
    std::vector<std::uint8_t> out{completionOk};
    put16(out,
          at + 1 < sel_.size()
              ? static_cast<unsigned>(sel_[at + 1][0] | sel_[at + 1][1] << 8)
              : 0xFFFF);
    out.insert(out.end(), sel_[at].begin() + offset,
               sel_[at].begin() + offset + length);
    return out;
}

std::uint16_t RawBmc::add(Record record)
{
    const std::uint16_t id = nextId_;
    nextId_ = static_cast<std::uint16_t>(nextId_ == 0xFFFE ? 1 : nextId_ + 1);
    record[0] = static_cast<std::uint8_t>(id);
    record[1] = static_cast<std::uint8_t>(id >> 8);
    sel_.push_back(record);
    lastAddition_ = ++clock_;
    return id;
}

std::vector<std::uint8_t>
RawBmc::addEntry(const std::vector<std::uint8_t>& data)
{
    if (data.size() != 16)
    {
        return {completionRequestLengthInvalid};
    }
    if (sel_.size() >= capacity)
    {
        return {0x80}; // out of space
    }
    Record record{};
    std::copy(data.begin(), data.end(), record.begin());
    std::vector<std::uint8_t> out{completionOk};
    put16(out, add(record));
    return out;
}

std::vector<std::uint8_t> RawBmc::clear(const std::vector<std::uint8_t>& data)
{
    if (data.size() != 6)
    {
        return {completionRequestLengthInvalid};
    }
    if (get16(data, 0) != reservation_ || reservation_ == 0)
    {
        return {completionReservationCancelled};
    }
    if (data[2] != 'C' || data[3] != 'L' || data[4] != 'R')
    {
        return {completionInvalidDataField};
    }
    if (data[5] == 0xAA)
    {
        sel_.clear();
        lastErase_ = ++clock_;
    }
    else if (data[5] != 0x00)
    {
        return {completionInvalidDataField};
    }
    return {completionOk, 0x01}; // erasure completed
}

} // namespace inbandsim
