// Tells whether pictures show the person of a record: verify_people <orbek.conf> <record> <picture>...

#include <orbek/fir_builder.h>
#include <orbek/image_io.h>
#include <orbek/verification.h>

#include <fstream>
#include <iostream>
#include <stdexcept>

namespace {

/// Tells of each picture, and the outcome.
class Told final : public Orbek::Verification::FeedbackBody {
public:
    void start() override {}
    void processingImage(const Orbek::Image& image) override { std::cout << image->name() << ": "; }
    void eyesFound(const Orbek::Eyes::Location&) override {}
    void eyesNotFound() override { std::cout << "no eyes\n"; }
    void score(const Orbek::Score& score) override { std::cout << "score " << score << "\n"; }
    void match() override { std::cout << "the same person\n"; }
    void noMatch() override { std::cout << "not the same person\n"; }
    void end() override {}
};

} // namespace

int main(int argc, char** argv) {
    if (argc < 4) {
        std::cerr << "usage: verify_people <orbek.conf> <record> <picture>...\n";
        return 2;
    }
    try {
        const Orbek::Configuration configuration{std::string(argv[1])};
        std::ifstream file(argv[2], std::ios::binary);
        if (!file) throw std::runtime_error(std::string(argv[2]) + ": cannot be opened");
        const Orbek::FIR record = Orbek::FIRBuilder(configuration).build(file);
        std::list<Orbek::Sample> samples;
        for (int i = 3; i < argc; ++i) samples.emplace_back(Orbek::ImageIO::load(argv[i]));

        // One in a thousand strangers may be taken for the person.
        const Orbek::Score threshold = Orbek::ScoreMappings(configuration).requestFAR(0.001f);
        const Orbek::Verification::Processor processor(configuration);
        processor.process(samples.begin(), samples.end(), record, threshold,
                          Orbek::Verification::Feedback(new Told));
    } catch (const std::exception& e) {
        std::cerr << "verify_people: " << e.what() << "\n";
        return 1;
    }
}
