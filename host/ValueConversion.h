// Moving values between CMPI's C representation and host::Value.
#pragma once

#include "Values.h"

#include <cmpift.h>

namespace host::detail
{

struct BrokerState;

// Reads a (value, type) argument the way SFCB and OpenPegasus read those
// of setProperty, addKey, addEntry, addArg, returnData and setElementAt:
// for CMPI_chars the value pointer itself is the char*, for every other
// type the matching CMPIValue member is read; a NULL value means a null
// value. Returns CMPI_RC_OK or the error to report.
CMPIrc readArgument(const CMPIValue* value, CMPIType type, Value& out);

// readArgument for the calls that store a value under a name (addArg,
// addEntry, addKey, setProperty): a null name is an invalid parameter.
CMPIrc readNamedArgument(const char* name, const CMPIValue* value,
                         CMPIType type, Value& out);

// Copies a CMPIData (as returned by getProperty and friends) into a Value.
CMPIrc readData(const CMPIData& data, Value& out);

// A CMPIData for a stored value; strings, datetimes, paths and arrays are
// new objects in the current scope.
CMPIData makeData(BrokerState& broker, const Value& value,
                  CMPIValueState extraState = CMPI_goodValue);

// The answer to a lookup by name (getProperty, getEntry, getArg): the found
// value, or a null marked not found with CMPI_RC_ERR_NO_SUCH_PROPERTY
// (CMPI_RC_ERR_INVALID_PARAMETER when no name was given).
CMPIData lookupData(BrokerState& broker, const Value* found, const char* name,
                    CMPIStatus* rc, CMPIValueState extraState = CMPI_goodValue);

// The answer to a lookup by position (getPropertyAt, getEntryAt,
// getArgAt), handing out the name as a new string when asked for.
CMPIData indexedData(BrokerState& broker, const NamedValues& values,
                     CMPICount index, CMPIString** name, CMPIStatus* rc);

} // namespace host::detail
