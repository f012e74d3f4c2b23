#include "fn/imagefile/bmp_run_lengths.h"

#include <istream>

namespace Fn {

namespace {

/// The picture as it is filled, in the order in which its rows are stored.
class IndexRows {
public:
    IndexRows(std::uint32_t w, std::uint32_t h)
        : w_(w), h_(h), stride_((std::uint64_t{w} + 3) / 4 * 4), indices_(stride_ * h) {}

    void put(unsigned char index) {
        if (x_ < w_ && y_ < h_) indices_[y_ * stride_ + x_] = index;
        ++x_;
    }
    void nextRow() { move(-x_, 1); }
    void move(std::int64_t right, unsigned down) {
        x_ += right;
        y_ += down;
    }
    bool full() const { return y_ >= h_ || (y_ + 1 == h_ && x_ >= w_); }
    std::vector<unsigned char> take() { return std::move(indices_); }

private:
    const std::uint32_t w_, h_;
    const std::uint64_t stride_;
    std::int64_t x_ = 0, y_ = 0;
    std::vector<unsigned char> indices_;
};

/// The bytes of the runs.
class Runs {
public:
    Runs(std::istream& stream, bool nibbles, IndexRows& rows)
        : stream_(stream), nibbles_(nibbles), rows_(rows) {}

    void expand() {
        for (;;) {
            const int length = stream_.get(), value = stream_.get();
            if (!stream_ && rows_.full()) return; // the end mark is missing
            if (length > 0)
                put(length, static_cast<unsigned char>(need(value)));
            else if (!escape(need(value)))
                return;
        }
    }

private:
    static int need(int byte) {
        if (byte < 0) FN_THROW(FNEIOError, "BMP Error: reading BMP pixels");
        return byte;
    }
    int next() { return need(stream_.get()); }

    /// So many pixels of one byte: its value, or both of its halves in turn.
    void put(int length, unsigned char byte) {
        for (int i = 0; i < length; ++i) rows_.put(indexIn(byte, i));
    }

    unsigned char indexIn(unsigned char byte, int position) const {
        if (!nibbles_) return byte;
        return position % 2 == 0 ? byte >> 4 : byte & 0x0F;
    }

    /// @return whether more follows
    bool escape(int code) {
        constexpr int endOfRow = 0, endOfPicture = 1, delta = 2;
        if (code == endOfPicture) return false;
        if (code == endOfRow) {
            rows_.nextRow();
        } else if (code == delta) {
            const int right = next();
            rows_.move(right, static_cast<unsigned>(next()));
        } else {
            putStored(code);
        }
        return true;
    }

    /// Pixels as they are, padded to two bytes.
    void putStored(int pixels) {
        const int perByte = nibbles_ ? 2 : 1, bytes = (pixels + perByte - 1) / perByte;
        for (int left = pixels; left > 0; left -= perByte)
            put(std::min(left, perByte), static_cast<unsigned char>(next()));
        if (bytes % 2 != 0) next();
    }

    std::istream& stream_;
    const bool nibbles_;
    IndexRows& rows_;
};

} // namespace

void expandRunLengths(std::istream& stream, Bitmap& bitmap) {
    const bool nibbles = bitmap.coding() == BitmapCoding::Rle4;
    if (bitmap.info.bitCount != (nibbles ? 4 : 8))
        FN_THROW(FNEBadArg, "BMP Error: biBitCount " + std::to_string(bitmap.info.bitCount) +
                                " not supported with run lengths");
    IndexRows rows(bitmap.w(), bitmap.h());
    Runs(stream, nibbles, rows).expand();
    bitmap.pixels = rows.take();
    bitmap.info.bitCount = 8;
    bitmap.info.compression = static_cast<std::uint32_t>(BitmapCoding::Rgb);
    if (bitmap.info.colorsUsed == 0) bitmap.info.colorsUsed = nibbles ? 16 : 256; // it is no picture in grays
}

} // namespace Fn
