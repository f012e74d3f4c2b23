#include "fn/stream_text.h"

#include <istream>

namespace Fn::Stream {

bool contains(std::istream& stream, const std::string& text) {
    using Traits = std::istream::traits_type;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (stream.good() && stream.peek() == Traits::to_int_type(text[i])) {
            stream.get();
            continue;
        }
        if (i != 0) stream.clear(); // peek at the end leaves the stream unfit for going back
        for (; i > 0; --i) stream.unget();
        return false;
    }
    return true;
}

} // namespace Fn::Stream
