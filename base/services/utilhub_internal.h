// Helpers shared by the utilhub sources; not part of the public interface.
#pragma once

namespace utilhub_internal {

// The white-space set of the utility layer: space, tab, LF, VT, FF, CR.
inline bool IsWhite(unsigned char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

}  // namespace utilhub_internal
