#pragma once

#include "DateTime.h"

#include <cstddef>
#include <string>

namespace QX::SELComposite
{

/** @p count characters "0". */
std::string addZero(unsigned char count);

/**
 * @brief CIM datetime text of @p value: yyyymmddhhmmss.mmmmmm, a sign and
 *        the UTC offset in minutes.
 *
 * The year is not widened to four digits, the milliseconds fill the
 * six-digit fraction as they are (12 ms gives 000012), and a negative
 * offset is padded with its sign counted (-1 hour gives -60).
 */
std::string convertCIMDateTime(DateTime value);

/** The conversion with a scratch buffer of @p scratchSize characters
 *  (terminator excluded); longer field texts are cut to it. */
std::string formatCIMDateTime(const DateTime& value, std::size_t scratchSize);

} // namespace QX::SELComposite
