#pragma once
// A text that cannot be converted to the value it should hold (bad Base64, a number that is no
// number). The error log names it "EConvertError".

#include "platform/AppException.h"

namespace orvanta {

class ConvertError final : public AppException {
public:
    using AppException::AppException;
    [[nodiscard]] QString className() const override { return QStringLiteral("EConvertError"); }
};

} // namespace orvanta
