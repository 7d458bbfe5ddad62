#include "StringConversion.h"

namespace TK {

std::ostream& operator<<(std::ostream& stream, const std::string& text) {
    return std::operator<<(stream, text);
}

} // namespace TK
