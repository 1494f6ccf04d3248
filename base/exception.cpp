#include "base/exception.h"

#include "base/encoding.h"

Exception::Exception(const std::string& text) : Exception(text, ErrorCode::None) {}

Exception::Exception(const std::string& text, ErrorCode errorCode)
    : message(text), wideMessage(WidenFromCodePage(text)), code(static_cast<int32_t>(errorCode)) {}
