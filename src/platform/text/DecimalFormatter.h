#pragma once

#include "platform/base/Export.h"

#include <memory>
#include <string>

namespace qvct {

/// Writes numbers as the user's locale does, with a fixed number of decimals and without grouping.
///
/// The locale is that of the moment of creation. Making one takes some microseconds, using it is cheap and
/// safe from every thread.
class QVCT_API DecimalFormatter {
  public:
    /// With so many decimals, rounded half to even.
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
