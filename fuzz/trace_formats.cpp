// The trace formatters with client-controlled texts: directives such as %n
// or %s in a name are printed as they stand, and every line is cut to its
// buffer. Each line is compared with the same line put together by string
// concatenation.
#include "sdk/qxlib/include/Trace.h"

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <fuzzer/FuzzedDataProvider.h>
#include <memory>
#include <string>

namespace
{

/** A text that is sometimes absent, as a null pointer. */
struct MaybeText
{
    bool present;
    std::string text;

    const char* get() const
    {
        return present ? text.c_str() : nullptr;
    }
    std::string printed() const
    {
        return present ? std::string(text.c_str()) : "(null)";
    }
};

MaybeText take(FuzzedDataProvider& input)
{
    const bool present = input.ConsumeIntegralInRange(0, 15) != 0;
    return {present, input.ConsumeRandomLengthString(2000)};
}

void expectLine(const char* line, const std::string& whole)
{
    const std::string cut = whole.substr(0, QX::TRACE_BUFFER_SIZE - 1);
    if (std::strlen(line) != cut.size() || cut != line)
    {
        std::abort();
    }
}

std::string kindLine(int kind, const std::string& first,
                     const std::string& file, int line)
{
    const std::string number = std::to_string(line);
    switch (kind)
    {
        case QX::METHOD_TRACE:
            return "METHOD: " + first + "() was invoked in " + file +
                   " [Line: " + number + "]";
        case QX::MESSAGE_TRACE:
            return "MESSAGE [File: " + file + ", Line: " + number +
                   "]: " + first;
        case QX::EXIT_TRACE:
            return "EXITING: " + first + "() in " + file + " [Line: " + number +
                   "]";
        default:
            return "ENTERING: " + first + "() in " + file +
                   " [Line: " + number + "]";
    }
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    // The lines go to the logger too; keep them out of the system log.
    CVLog::CVLogger::setSink(nullptr);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data,
                                      std::size_t size)
{
    FuzzedDataProvider input(data, size);
    const unsigned line = input.ConsumeIntegral<unsigned>();
    const unsigned number = input.ConsumeIntegral<unsigned>();
    const int kind = input.ConsumeIntegralInRange(-1, 5);
    const MaybeText first = take(input);
    const MaybeText file = take(input);
    const MaybeText value = take(input);
    const int printedLine = static_cast<int>(line);

    expectLine(QX::trace(first.get(), file.get(), line,
                         static_cast<QX::MessageType>(kind)),
               kindLine(kind, first.printed(), file.printed(), printedLine));
    expectLine(QX::trace(first.get(), file.get(), line, value.get()),
               "VARIABLE: '" + first.printed() + "' has Value '" +
                   value.printed() + "' at line " +
                   std::to_string(printedLine) + " in " + file.printed());
    expectLine(QX::trace(first.get(), file.get(), line, number),
               "VARIABLE: '" + first.printed() + "' has Value '" +
                   std::to_string(static_cast<int>(number)) + "' at line " +
                   std::to_string(printedLine) + " in " + file.printed());

    // The same texts through the emission path, as a provider operation
    // passes a client's class name.
    const std::string component = "Corvane.SELProvider";
    QX::logMessage("fuzz", file.get(), printedLine, component,
                   QX::LOG_LEVEL_FAILURE, first.get());
    QX::logVariable("fuzz", file.get(), printedLine, component, "classname",
                    value.get());
    QX::markProviderEntry(component, first.get(), file.get(), line);
    QX::markProviderExit(component, first.get(), file.get(), line);
    return 0;
}
