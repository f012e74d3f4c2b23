// Evidence and face streams from packages: what is accepted can be asked for everything, with bounded memory,
// and what is written is read again.

#include "cmp/face_stream.h"
#include "fn/message/dialog.h"

#include <cstdlib>

namespace {

class Silence final : public FNDialog::Body {
    void log(const std::string&) override {}
    void info(const std::string&) override {}
    void warn(const std::string&) override {}
    void error(const std::string&) override {}
    std::string name() const override { return "Silence"; }
};

template <class Use> void tolerate(Use use) {
    try {
        use();
    } catch (const std::exception&) {
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    static const bool silent = (FNDialog::set(FNCountedPtr<FNDialog::Body>(new Silence)), true);
    (void)silent;
    Fn::Package package;
    tolerate([&] { package = Fn::Package(data, size); });
    tolerate([&] { Cmp::getThumbsFromSerializedEvidence(package); });
    tolerate([&] { Cmp::stripThumbsFromSerializedEvidence(package); });
    tolerate([&] {
        const Cmp::Evidence evidence(package);
        for (const auto& [id, times] : evidence.trackedIds()) {
            if (!evidence.hasFaceTrack(id)) continue;
            const Cmp::FaceStream stream(id, evidence);
            const unsigned long frames = stream.numberOfFrames();
            for (unsigned long i = 0; i < frames; ++i) {
                const auto frame = stream[i];
                tolerate([&] { frame.faceInfo(); });
                tolerate([&, &track = id] { frame.getFaceForID(track, Cmp::EvidenceFrame::THUMBNAIL); });
                // Large frames are made as they should be, but take the fuzzer's time.
                tolerate([&] {
                    if (size < 4096) frame.img(i % 2 == 1);
                });
            }
        }
        tolerate([&] { evidence.getReduced(1); });
        const Fn::Package written = evidence.serialize();
        if (Cmp::Evidence(written).numberOfFrames() != evidence.numberOfFrames()) std::abort();
    });
    return 0;
}
