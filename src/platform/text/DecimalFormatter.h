#pragma once

#include "platform/base/Export.h"

#include <memory>
#include <string>

namespace qvct {

/// Writes numbers as the user's locale does, with a fixed number of decimals and without grouping.
///
/// The locale is the one in effect at creation. Making one takes some microseconds, using it is cheap and
/// safe from every thread.
class QVCT_API DecimalFormatter {
  public:
    /// With that many decimals; halves are rounded to even.
    explicit DecimalFormatter(int fractionDigits);
    /// @{
    /// A moved-from formatter must not be used.
    DecimalFormatter(DecimalFormatter&&) noexcept;
    DecimalFormatter& operator=(DecimalFormatter&&) noexcept;
    /// @}
    ~DecimalFormatter();

    /// "-1,25" in a locale with decimal commas.
    std::string stringFromNumber(double number) const;

  private:
    struct Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct
