#include "fn/imagefile/j2k_stream.h"

#include <algorithm>

namespace Fn::J2k {

namespace {

constexpr auto noMoreBytes = static_cast<OPJ_SIZE_T>(-1);
constexpr OPJ_SIZE_T blockSize = 1 << 16;

Stream createStream(bool input) {
    Stream stream(opj_stream_create(blockSize, input));
    if (!stream) FN_THROW(FNESysError, "write/read j2k: call to jas_stream_create() failed.");
    return stream;
}

} // namespace

void Report::listenTo(opj_codec_t* codec) {
    const auto ignore = [](const char*, void*) {};
    opj_set_info_handler(codec, ignore, nullptr);
    opj_set_warning_handler(codec, ignore, nullptr);
    opj_set_error_handler(
        codec,
        [](const char* message, void* self) {
            constexpr std::size_t longest = 300;
            std::string& kept = static_cast<Report*>(self)->text;
            if (kept.size() < longest)
                kept.append(" ").append(message, std::find(message, message + std::strlen(message), '\n'));
        },
        this);
}

Input::Input(const FNRMem<unsigned char>& bytes) : bytes_(bytes), stream_(createStream(true)) {
    opj_stream_set_user_data(stream_.get(), this, nullptr);
    opj_stream_set_user_data_length(stream_.get(), bytes_.size());
    opj_stream_set_read_function(stream_.get(), [](void* to, OPJ_SIZE_T n, void* self) {
        auto& input = *static_cast<Input*>(self);
        const std::uint64_t left = input.bytes_.size() - input.position_;
        if (left == 0) return noMoreBytes;
        const std::uint64_t step = std::min<std::uint64_t>(n, left);
        std::copy_n(input.bytes_.data() + input.position_, step, static_cast<unsigned char*>(to));
        input.position_ += step;
        return static_cast<OPJ_SIZE_T>(step);
    });
    opj_stream_set_skip_function(stream_.get(), [](OPJ_OFF_T n, void* self) -> OPJ_OFF_T {
        auto& input = *static_cast<Input*>(self);
        if (n < 0) return -1;
        const std::uint64_t step =
            std::min<std::uint64_t>(static_cast<std::uint64_t>(n), input.bytes_.size() - input.position_);
        input.position_ += step;
        return static_cast<OPJ_OFF_T>(step);
    });
    opj_stream_set_seek_function(stream_.get(), [](OPJ_OFF_T to, void* self) -> OPJ_BOOL {
        auto& input = *static_cast<Input*>(self);
        if (to < 0 || static_cast<std::uint64_t>(to) > input.bytes_.size()) return OPJ_FALSE;
        input.position_ = static_cast<std::uint64_t>(to);
        return OPJ_TRUE;
    });
}

Output::Output() : stream_(createStream(false)) {
    opj_stream_set_user_data(stream_.get(), this, nullptr);
    opj_stream_set_write_function(stream_.get(), [](void* from, OPJ_SIZE_T n, void* self) {
        auto& output = *static_cast<Output*>(self);
        try {
            if (output.bytes_.size() < output.position_ + n) output.bytes_.resize(output.position_ + n);
        } catch (...) {
            return noMoreBytes; // no exception passes through the library
        }
        std::copy_n(static_cast<const unsigned char*>(from), n,
                    output.bytes_.begin() + static_cast<std::ptrdiff_t>(output.position_));
        output.position_ += n;
        return n;
    });
    const auto seek = [](OPJ_OFF_T to, void* self) -> OPJ_BOOL {
        if (to < 0) return OPJ_FALSE;
        static_cast<Output*>(self)->position_ = static_cast<std::uint64_t>(to);
        return OPJ_TRUE;
    };
    opj_stream_set_seek_function(stream_.get(), seek);
    opj_stream_set_skip_function(stream_.get(), [](OPJ_OFF_T n, void* self) -> OPJ_OFF_T {
        auto& output = *static_cast<Output*>(self);
        if (n < 0 && static_cast<std::uint64_t>(-n) > output.position_) return -1;
        output.position_ += static_cast<std::uint64_t>(n);
        return n;
    });
}

} // namespace Fn::J2k
