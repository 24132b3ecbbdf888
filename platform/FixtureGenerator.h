#pragma once

#include <iosfwd>

namespace QX
{

/**
 * Writes a fixture with one controller, one log named "IPMI SEL Log" with
 * MaxRecords @p maxRecords and @p entries generated entries (record ids
 * 1..entries), for benchmarks and tests of large logs.
 */
void writeGeneratedFixture(std::ostream& out, unsigned entries,
                           unsigned maxRecords);

} // namespace QX
