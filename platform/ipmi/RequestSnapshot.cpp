#include "RequestSnapshot.h"

#include <algorithm>
#include <vector>

namespace QX::Ipmi
{

namespace
{

struct Handed
{
    std::uint64_t owner = 0;
    std::uint64_t epoch = 0;
    std::weak_ptr<const NodeTree> tree;
};

// What each RequestSnapshot last handed to this thread. Short: one entry
// per source the thread reads, and expired entries are dropped.
std::vector<Handed>& handedHere()
{
    thread_local std::vector<Handed> handed;
    return handed;
}

std::uint64_t nextOwner()
{
    static std::atomic<std::uint64_t> owners{0};
    return owners.fetch_add(1, std::memory_order_relaxed) + 1;
}

} // namespace

RequestSnapshot::RequestSnapshot() : owner_(nextOwner()) {}

std::shared_ptr<const NodeTree> RequestSnapshot::held() const
{
    std::vector<Handed>& handed = handedHere();
    std::erase_if(handed, [](const Handed& h) { return h.tree.expired(); });
    const auto mine =
        std::find_if(handed.begin(), handed.end(),
                     [this](const Handed& h) { return h.owner == owner_; });
    if (mine == handed.end() ||
        mine->epoch != epoch_.load(std::memory_order_acquire))
    {
        return nullptr;
    }
    return mine->tree.lock();
}

std::shared_ptr<const NodeTree>
RequestSnapshot::handOut(std::shared_ptr<const NodeTree> tree) const
{
    if (!tree)
    {
        return tree;
    }
    // The holder is owned only by the copies handed out: when the last
    // cursor lets go, the weak reference below expires although the
    // source still keeps the tree.
    const auto holder = std::make_shared<const std::shared_ptr<const NodeTree>>(
        std::move(tree));
    std::shared_ptr<const NodeTree> out(holder, holder->get());
    std::vector<Handed>& handed = handedHere();
    const auto mine =
        std::find_if(handed.begin(), handed.end(),
                     [this](const Handed& h) { return h.owner == owner_; });
    const Handed entry{owner_, epoch_.load(std::memory_order_acquire), out};
    if (mine == handed.end())
    {
        handed.push_back(entry);
    }
    else
    {
        *mine = entry;
    }
    return out;
}

void RequestSnapshot::forget()
{
    epoch_.fetch_add(1, std::memory_order_acq_rel);
}

} // namespace QX::Ipmi
