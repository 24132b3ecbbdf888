#include "SelClasses.h"

namespace selclasses
{

host::Schema schema()
{
    host::Schema schema;
    schema.add({"ZAN_MgmtHwLog",
                {{"Name", CMPI_string}, {"CreationClassName", CMPI_string}}});
    schema.add({"ZAN_MgmtHwLogEntry",
                {{"CreationClassName", CMPI_string},
                 {"LogCreationClassName", CMPI_string},
                 {"LogName", CMPI_string},
                 {"RecordID", CMPI_string},
                 {"MessageTimestamp", CMPI_dateTime}}});
    return schema;
}

host::HostOptions hostOptions(std::string libraryPath)
{
    host::HostOptions options;
    options.libraryPath = std::move(libraryPath);
    options.providerName = providerName;
    options.schema = schema();
    return options;
}

host::IndicationFilter filterFor(std::string className)
{
    return host::IndicationFilter::forClass(std::move(className), nameSpace);
}

} // namespace selclasses
