#include "ProfileBmc.h"

#include "ipmi/SelRecord.h"

#include <algorithm>
#include <thread>

namespace QX::test
{

namespace
{

constexpr std::uint32_t eraseTimeUnset = 0xFFFFFFFF;

Ipmi::IpmiError completion(const char* call, std::uint8_t code,
                           const char* what)
{
    return Ipmi::IpmiError(call, Ipmi::ErrorCategory::CompletionCode, what,
                           code);
}

std::uint16_t idOf(const Ipmi::SelRecordBytes& record)
{
    return Ipmi::SelRecord::parse(record).recordId;
}

std::uint32_t timeOf(const Ipmi::SelRecordBytes& record)
{
    return Ipmi::SelRecord::parse(record).timestamp;
}

// @p body with the id and time the BMC gives it.
Ipmi::SelRecordBytes stamped(const Ipmi::SelRecordBytes& body, std::uint16_t id,
                             std::uint32_t time)
{
    Ipmi::SelRecord record = Ipmi::SelRecord::parse(body);
    record.recordId = id;
    record.timestamp = time;
    if (record.recordType == 0)
    {
        record.recordType = Ipmi::SelRecord::systemEventType;
    }
    return record.bytes();
}

} // namespace

Ipmi::SelRecordBytes eventBody(unsigned n)
{
    // Temperature, upper non-critical going high, reading and threshold
    // varying with n.
    return Ipmi::SelRecord::systemEvent(
               0, 0, 0x01, static_cast<std::uint8_t>(0x30 + (n >> 8 & 0x0F)),
               0x01,
               {0x57, static_cast<std::uint8_t>(n),
                static_cast<std::uint8_t>(n >> 4)})
        .bytes();
}

Ipmi::SelRecordBytes loggingDisabledBody(std::uint8_t offset)
{
    return Ipmi::SelRecord::systemEvent(0, 0, 0x10, 0x01, 0x6f,
                                        {offset, 0xff, 0xff})
        .bytes();
}

ProfileBmc::ProfileBmc(BmcProfile profile) :
    profile_(profile), nextId_(profile.firstId)
{
}

ProfileBmc::Lock ProfileBmc::exchange()
{
    const std::uint64_t count =
        requests_.fetch_add(1, std::memory_order_relaxed) + 1;
    auto pause = profile_.delay;
    if (profile_.slowEvery != 0 && count % profile_.slowEvery == 0)
    {
        pause = profile_.slowTakes;
    }
    if (pause.count() > 0)
    {
        std::this_thread::sleep_for(pause);
    }
    Lock lock(mutex_);
    settle();
    return lock;
}

bool ProfileBmc::erasing() const
{
    return erasingUntil_.has_value();
}

void ProfileBmc::settle()
{
    if (erasingUntil_ && std::chrono::steady_clock::now() >= *erasingUntil_)
    {
        erasingUntil_.reset();
        finishErase();
    }
}

void ProfileBmc::startErase()
{
    if (profile_.eraseCancelsReservation)
    {
        ++reservation_;
    }
    if (profile_.eraseTakes.count() > 0 && !erasedOnce_)
    {
        erasingUntil_ = std::chrono::steady_clock::now() + profile_.eraseTakes;
    }
    else
    {
        finishErase();
    }
    erasedOnce_ = true;
}

void ProfileBmc::finishErase()
{
    sel_.clear();
    freedIds_.clear();
    logged_.overflow = false;
    wrapped_ = false;
    ++logged_.mostRecentErase;
    if (profile_.clearedRecordAfterErase)
    {
        nextId_ = 1;
        const std::uint16_t id = takeId();
        store(stamped(loggingDisabledBody(0x02), id, ++clock_));
    }
}

std::uint16_t ProfileBmc::takeId()
{
    if (profile_.reuseDeletedIds && !freedIds_.empty())
    {
        const std::uint16_t id = freedIds_.back();
        freedIds_.pop_back();
        return id;
    }
    const std::uint16_t id = nextId_;
    const unsigned after = static_cast<unsigned>(nextId_) + profile_.idStep;
    nextId_ = after > profile_.lastId ? static_cast<std::uint16_t>(1)
                                      : static_cast<std::uint16_t>(after);
    return id;
}

void ProfileBmc::store(Ipmi::SelRecordBytes record)
{
    if (sel_.size() >= profile_.capacity)
    {
        if (!profile_.ringBuffer)
        {
            logged_.overflow = !profile_.overflowNeverSet;
            return;
        }
        sel_.erase(sel_.begin());
    }
    sel_.push_back(record);
    ++logged_.mostRecentAddition;
    if (profile_.ringBuffer && profile_.rolloverRecord && !wrapped_ &&
        sel_.size() >= profile_.capacity)
    {
        wrapped_ = true;
        const std::uint16_t id = takeId();
        sel_.erase(sel_.begin());
        sel_.push_back(stamped(loggingDisabledBody(0x04), id, clock_));
    }
}

std::uint16_t ProfileBmc::add(const Ipmi::SelRecordBytes& body,
                              std::optional<std::uint32_t> time)
{
    const Lock lock(mutex_);
    settle();
    const std::uint16_t id = takeId();
    store(stamped(body, id, time ? *time : ++clock_));
    return id;
}

void ProfileBmc::addRaw(const Ipmi::SelRecordBytes& bytes)
{
    const Lock lock(mutex_);
    settle();
    store(bytes);
}

void ProfileBmc::remove(std::uint16_t id)
{
    const Lock lock(mutex_);
    settle();
    const auto found = std::find_if(sel_.begin(), sel_.end(),
                                    [id](const Ipmi::SelRecordBytes& r)
                                    { return idOf(r) == id; });
    if (found != sel_.end())
    {
        sel_.erase(found);
        freedIds_.push_back(id);
    }
}

void ProfileBmc::restartIds()
{
    const Lock lock(mutex_);
    nextId_ = 1;
}

void ProfileBmc::clearByOther()
{
    const Lock lock(mutex_);
    settle();
    startErase();
}

std::vector<Ipmi::SelRecordBytes> ProfileBmc::truth()
{
    const Lock lock(mutex_);
    settle();
    return sel_;
}

void ProfileBmc::armZeroNextId()
{
    const Lock lock(mutex_);
    zeroNext_ = true;
}

void ProfileBmc::armSelfNextId()
{
    const Lock lock(mutex_);
    selfNext_ = true;
}

void ProfileBmc::armMissing(std::uint16_t id)
{
    const Lock lock(mutex_);
    missing_ = id;
}

unsigned ProfileBmc::entryCalls()
{
    const Lock lock(mutex_);
    return entryCalls_;
}

unsigned ProfileBmc::selInfoCalls()
{
    const Lock lock(mutex_);
    return selInfoCalls_;
}

Ipmi::SelInfo ProfileBmc::getSelInfo()
{
    const Lock lock = exchange();
    ++selInfoCalls_;
    // The times and the overflow flag as the BMC keeps them; the rest as
    // the profile answers.
    Ipmi::SelInfo info = logged_;
    info.entries =
        static_cast<std::uint16_t>(sel_.size() + profile_.countExcess);
    const std::size_t left =
        sel_.size() >= profile_.capacity ? 0 : profile_.capacity - sel_.size();
    switch (profile_.freeSpace)
    {
        case FreeSpaceAnswer::True:
            info.freeSpace = static_cast<std::uint16_t>(
                std::min<std::size_t>(left * 16, 0xFFFF));
            break;
        case FreeSpaceAnswer::AlwaysFFFF:
            info.freeSpace = 0xFFFF;
            break;
        case FreeSpaceAnswer::AlwaysZero:
            info.freeSpace = 0;
            break;
    }
    constexpr std::uint32_t bootAddition = 0x64f00000;
    constexpr std::uint32_t bootErase = 0x64e00000;
    if (profile_.frozenTimestamps)
    {
        info.mostRecentAddition = bootAddition;
        info.mostRecentErase = bootErase;
    }
    if (profile_.additionIsNewestTime)
    {
        info.mostRecentAddition =
            sel_.empty() ? bootAddition : timeOf(sel_.back());
    }
    if (profile_.eraseTimeUnset)
    {
        info.mostRecentErase = eraseTimeUnset;
    }
    return info;
}

std::uint16_t ProfileBmc::reserveSel()
{
    const Lock lock = exchange();
    if (erasing())
    {
        throw completion("ipmi_cmd_reserve_sel",
                         Ipmi::completionEraseInProgress, "erase in progress");
    }
    if (profile_.reserveRefusal)
    {
        throw completion("ipmi_cmd_reserve_sel", *profile_.reserveRefusal,
                         "refused");
    }
    reservation_ = static_cast<std::uint16_t>(reservation_ + 1);
    if (reservation_ == 0)
    {
        reservation_ = 1;
    }
    return reservation_;
}

void ProfileBmc::checkReservation(std::uint16_t reservationId,
                                  const char* call) const
{
    // Reservation 0 reads whole records without one.
    if (reservationId != 0 && reservationId != reservation_)
    {
        throw completion(call, Ipmi::completionReservationCancelled,
                         "reservation cancelled");
    }
}

Ipmi::SelEntry ProfileBmc::getSelEntry(std::uint16_t reservationId,
                                       std::uint16_t recordId)
{
    const Lock lock = exchange();
    ++entryCalls_;
    if (erasing())
    {
        throw completion("ipmi_cmd_get_sel_entry",
                         Ipmi::completionEraseInProgress, "erase in progress");
    }
    checkReservation(reservationId, "ipmi_cmd_get_sel_entry");
    auto found = sel_.end();
    if (recordId == Ipmi::firstRecordId)
    {
        found = sel_.begin();
    }
    else if (recordId == Ipmi::lastRecordId)
    {
        found = sel_.empty() ? sel_.end() : sel_.end() - 1;
    }
    else if (missing_ != recordId)
    {
        found = std::find_if(sel_.begin(), sel_.end(),
                             [recordId](const Ipmi::SelRecordBytes& r)
                             { return idOf(r) == recordId; });
    }
    else
    {
        missing_.reset();
    }
    if (found == sel_.end())
    {
        throw completion("ipmi_cmd_get_sel_entry",
                         Ipmi::completionRecordNotPresent,
                         "record not present");
    }
    Ipmi::SelEntry entry;
    entry.data = *found;
    const auto next = found + 1;
    entry.nextRecordId = next == sel_.end() ? Ipmi::lastRecordId : idOf(*next);
    if (entry.nextRecordId != Ipmi::lastRecordId)
    {
        if (zeroNext_)
        {
            zeroNext_ = false;
            entry.nextRecordId = Ipmi::firstRecordId;
        }
        else if (selfNext_)
        {
            selfNext_ = false;
            entry.nextRecordId = idOf(*found);
        }
    }
    return entry;
}

void ProfileBmc::initiateSelErase(std::uint16_t reservationId)
{
    const Lock lock = exchange();
    if (erasing())
    {
        throw completion("ipmi_cmd_clear_sel", Ipmi::completionEraseInProgress,
                         "erase in progress");
    }
    checkReservation(reservationId, "ipmi_cmd_clear_sel");
    startErase();
}

bool ProfileBmc::selEraseCompleted(std::uint16_t reservationId)
{
    const Lock lock = exchange();
    checkReservation(reservationId, "ipmi_cmd_clear_sel");
    return !erasing();
}

std::optional<std::uint8_t> ProfileBmc::getSystemRestartCause()
{
    const Lock lock = exchange();
    return std::nullopt;
}

std::uint64_t ProfileBmc::requestCount() const
{
    return requests_.load(std::memory_order_relaxed);
}

bool ProfileDescriber::refreshSensorNames()
{
    if (sdrTimesOut)
    {
        throw Ipmi::IpmiError("ipmi_sdr_cache_create",
                              Ipmi::ErrorCategory::CompletionCode, "timeout",
                              Ipmi::completionTimedOut);
    }
    return false;
}

std::string ProfileDescriber::describe(const Ipmi::SelRecordBytes& record)
{
    ++described;
    if (record[2] == unreadableType)
    {
        throw std::runtime_error("cannot interpret this record");
    }
    return "event " + std::to_string(idOf(record));
}

} // namespace QX::test
