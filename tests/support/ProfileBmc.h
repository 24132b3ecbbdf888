#pragma once

// A simulated BMC behind the BMC command seam whose SEL behaves as real
// BMCs' do, one switch per behaviour, any of them together: frozen or
// lying Get SEL Info fields, a ring buffer, ids with gaps or reused,
// broken next-record chains, an erase that runs in the background,
// refused reservations, slow answers. Thread-safe: a test changes the SEL
// while the source's poller reads it.

#include "LocalBmc.h"
#include "ipmi/BmcCommands.h"
#include "ipmi/IpmiError.h"
#include "ipmi/RecordDescriber.h"

#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace QX::test
{

/** What Get SEL Info says about the free space. */
enum class FreeSpaceAnswer
{
    True,       // what is left, FFFFh from 64 KiB on
    AlwaysFFFF, // FFFFh however full the SEL is
    AlwaysZero, // 0 however empty the SEL is
};

struct BmcProfile
{
    /** Records the SEL holds; a full SEL refuses new ones and sets the
     *  overflow flag, unless it is a ring buffer. */
    std::size_t capacity = 512;
    /** A full SEL overwrites its oldest record; the count stays. */
    bool ringBuffer = false;
    /** The ring buffer logs an "SEL full" record when it first fills. */
    bool rolloverRecord = false;
    /** Get SEL Info's last-addition and last-erase times stay at their
     *  boot-time values. */
    bool frozenTimestamps = false;
    /** Last-erase time always FFFFFFFFh. */
    bool eraseTimeUnset = false;
    /** Last-addition time is the newest record's own time. */
    bool additionIsNewestTime = false;
    FreeSpaceAnswer freeSpace = FreeSpaceAnswer::True;
    /** The overflow flag is never set. */
    bool overflowNeverSet = false;
    /** The first record id, the step between two ids, and the id after
     *  which they start again at 1. */
    std::uint16_t firstId = 1;
    std::uint16_t idStep = 1;
    std::uint16_t lastId = 0xFFFE;
    /** A deleted record's id is given to the next record. */
    bool reuseDeletedIds = false;
    /** Get SEL Info's count exceeds the records by this many: the chain
     *  ends (FFFFh) before the count. */
    std::uint16_t countExcess = 0;
    /** Makes the first clear run in the background this long: 81h to
     *  reads and reservations meanwhile, "in progress" to status. */
    std::chrono::milliseconds eraseTakes{0};
    /** The clear cancels the reservation it was given. */
    bool eraseCancelsReservation = false;
    /** A "Log Area Reset/Cleared" record (id 1) follows every clear. */
    bool clearedRecordAfterErase = false;
    /** Reserve SEL answers this completion code (C1h, D4h). */
    std::optional<std::uint8_t> reserveRefusal;
    /** Every exchange takes this long; every slowEvery-th one slowTakes. */
    std::chrono::milliseconds delay{0};
    unsigned slowEvery = 0;
    std::chrono::milliseconds slowTakes{0};
};

class ProfileBmc : public LocalBmc
{
  public:
    explicit ProfileBmc(BmcProfile profile);

    // What a test does to the SEL (as the BMC or another program would).

    /** Adds a record of @p body (bytes 7-15 kept), the BMC setting id and
     *  time as it does; @p time overrides the clock. Returns the id. */
    std::uint16_t add(const Ipmi::SelRecordBytes& body,
                      std::optional<std::uint32_t> time = std::nullopt);
    /** Adds @p bytes exactly as given (OEM or invalid types). */
    void addRaw(const Ipmi::SelRecordBytes& bytes);
    /** Deletes the record with id @p id. */
    void remove(std::uint16_t id);
    /** The BMC restarts and gives ids from 1 again; the SEL stays. */
    void restartIds();
    /** Clears the SEL as another program would. */
    void clearByOther();
    /** The SEL as it truly is, in SEL order. */
    std::vector<Ipmi::SelRecordBytes> truth();

    // Chain faults, each armed for one answer.

    /** The next Get SEL Entry that would name a next record names 0000h. */
    void armZeroNextId();
    /** The next Get SEL Entry that would name a next record names itself. */
    void armSelfNextId();
    /** The next Get SEL Entry for @p id (not 0000h, FFFFh) answers CBh. */
    void armMissing(std::uint16_t id);

    /** Exchanges so far, by kind. */
    unsigned entryCalls();
    unsigned selInfoCalls();

    Ipmi::SelInfo getSelInfo() override;
    std::uint16_t reserveSel() override;
    Ipmi::SelEntry getSelEntry(std::uint16_t reservationId,
                               std::uint16_t recordId) override;
    void initiateSelErase(std::uint16_t reservationId) override;
    bool selEraseCompleted(std::uint16_t reservationId) override;
    std::optional<std::uint8_t> getSystemRestartCause() override;
    std::uint64_t requestCount() const override;

  private:
    using Lock = std::unique_lock<std::mutex>;

    Lock exchange();
    void settle();
    void startErase();
    void finishErase();
    void store(Ipmi::SelRecordBytes record);
    std::uint16_t takeId();
    bool erasing() const;
    void checkReservation(std::uint16_t reservationId, const char* call) const;

    BmcProfile profile_;
    std::mutex mutex_;
    std::vector<Ipmi::SelRecordBytes> sel_;
    std::vector<std::uint16_t> freedIds_;
    std::uint16_t nextId_ = 1;
    std::uint32_t clock_ = 0x65e58300;
    // Last addition and erase times and the overflow flag.
    Ipmi::SelInfo logged_{.mostRecentAddition = 0x65000000,
                          .mostRecentErase = 0x64000000,
                          .reserveSupported = true};
    bool wrapped_ = false;
    std::uint16_t reservation_ = 0;
    std::optional<std::chrono::steady_clock::time_point> erasingUntil_;
    bool erasedOnce_ = false;
    bool zeroNext_ = false;
    bool selfNext_ = false;
    std::optional<std::uint16_t> missing_;
    unsigned entryCalls_ = 0;
    unsigned selInfoCalls_ = 0;
    std::atomic<std::uint64_t> requests_{0};
};

/** A ProfileBmc seen through the command seam by one source, while the
 *  BMC itself outlives that source, as a BMC outlives the processes that
 *  read it. Every call goes to the shared BMC. */
class SharedProfileBmc : public Ipmi::BmcCommands
{
  public:
    explicit SharedProfileBmc(std::shared_ptr<ProfileBmc> bmc) :
        bmc_(std::move(bmc))
    {
    }

    Ipmi::SelInfo getSelInfo() override
    {
        return bmc_->getSelInfo();
    }
    std::uint16_t reserveSel() override
    {
        return bmc_->reserveSel();
    }
    Ipmi::SelEntry getSelEntry(std::uint16_t reservationId,
                               std::uint16_t recordId) override
    {
        return bmc_->getSelEntry(reservationId, recordId);
    }
    void initiateSelErase(std::uint16_t reservationId) override
    {
        bmc_->initiateSelErase(reservationId);
    }
    bool selEraseCompleted(std::uint16_t reservationId) override
    {
        return bmc_->selEraseCompleted(reservationId);
    }
    std::optional<std::uint8_t> getSystemRestartCause() override
    {
        return bmc_->getSystemRestartCause();
    }
    std::uint64_t sessionGeneration() const override
    {
        return bmc_->sessionGeneration();
    }
    std::chrono::steady_clock::time_point lastActivity() const override
    {
        return bmc_->lastActivity();
    }
    std::uint64_t requestCount() const override
    {
        return bmc_->requestCount();
    }

  private:
    std::shared_ptr<ProfileBmc> bmc_;
};

/** A temperature event body whose bytes differ with @p n. */
Ipmi::SelRecordBytes eventBody(unsigned n);
/** An "Event Logging Disabled" record body with offset @p offset
 *  (02h cleared, 04h full, 05h almost full). */
Ipmi::SelRecordBytes loggingDisabledBody(std::uint8_t offset);

/** Describes a record by its id; the SDR can be made to fail (C3h), and
 *  records of type @p unreadableType cannot be described. */
class ProfileDescriber : public Ipmi::RecordDescriber
{
  public:
    std::atomic<bool> sdrTimesOut{false};
    std::uint8_t unreadableType = 0x55;
    /** What textsKey() gives; empty: texts are never reused. */
    std::string key;
    /** Records described so far. */
    std::atomic<unsigned> described{0};

    bool refreshSensorNames() override;
    std::string describe(const Ipmi::SelRecordBytes& record) override;
    std::string textsKey() const override
    {
        return key;
    }
};

} // namespace QX::test
