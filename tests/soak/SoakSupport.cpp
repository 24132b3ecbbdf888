#include "SoakSupport.h"

#include "Support.h"

#include <filesystem>
#include <fstream>
#include <thread>

namespace soak
{

std::size_t threadCount()
{
    std::size_t count = 0;
    for ([[maybe_unused]] const auto& task :
         std::filesystem::directory_iterator("/proc/self/task"))
    {
        ++count;
    }
    return count;
}

std::size_t threadBaseline()
{
    std::thread([] {}).join();
    return threadCount();
}

std::size_t awaitThreadCount(std::size_t count)
{
    const auto deadline = std::chrono::steady_clock::now() + patience;
    std::size_t now = threadCount();
    while (now > count && std::chrono::steady_clock::now() < deadline)
    {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
        now = threadCount();
    }
    return now;
}

std::string threadNames()
{
    std::string names;
    for (const auto& task :
         std::filesystem::directory_iterator("/proc/self/task"))
    {
        std::ifstream comm(task.path() / "comm");
        std::string name;
        std::getline(comm, name);
        names += task.path().filename().string() + ":" + name + " ";
    }
    return names;
}

namespace
{

bool isIndicationClass(const std::string& className)
{
    for (const char* known : {entryEvent, clearEvent, fullEvent, restartEvent})
    {
        if (className == known)
        {
            return true;
        }
    }
    return false;
}

std::string textOf(const host::Instance& instance, const char* name)
{
    const host::Value* value = instance.property(name);
    if (value == nullptr || value->null || value->type != CMPI_string)
    {
        return "<missing or not a string>";
    }
    return std::string(value->text());
}

} // namespace

std::string malformation(const host::DeliveredIndication& indication)
{
    const host::Instance& instance = indication.instance;
    const std::string className = instance.path.className.str();
    if (indication.nameSpace != nameSpace)
    {
        return "delivered into " + indication.nameSpace;
    }
    if (!isIndicationClass(className))
    {
        return "class " + className;
    }
    const host::Value* time = instance.property("IndicationTime");
    if (time == nullptr || time->type != CMPI_dateTime ||
        time->text().size() != 25)
    {
        return className + " without a CIM datetime IndicationTime";
    }
    const std::pair<const char*, std::string> fixed[] = {
        {"SystemCreationClassName", "ZANKOR_ComputerSystem"},
        {"SystemName", QX::getSystemName()},
        {"OwningEntity", "ZAN"},
        {"ProviderName", "SELProvider"}};
    for (const auto& [name, expected] : fixed)
    {
        const std::string actual = textOf(instance, name);
        if (actual != expected)
        {
            return className + "." + name + " is " + actual;
        }
    }
    return {};
}

} // namespace soak
