// Tells whose records are like the person of a picture: identify_people <orbek.conf> <picture> <record>...

#include <orbek/fir_builder.h>
#include <orbek/identification.h>
#include <orbek/image_io.h>

#include <fstream>
#include <iostream>
#include <stdexcept>

namespace {

/// Tells the matches.
class Told final : public Orbek::Identification::FeedbackBody {
public:
    void start() override {}
    void processingImage(const Orbek::Image&) override {}
    void eyesFound(const Orbek::Eyes::Location&) override {}
    void eyesNotFound() override { std::cout << "no eyes\n"; }
    void matches(const std::list<Orbek::Match>& matches) override {
        std::cout << matches.size() << (matches.size() == 1 ? " match\n" : " matches\n");
        for (const Orbek::Match& match : matches) std::cout << match.name << ": " << match.score << "\n";
    }
    void end() override {}
};

} // namespace

int main(int argc, char** argv) {
    if (argc < 4) {
        std::cerr << "usage: identify_people <orbek.conf> <picture> <record>...\n";
        return 2;
    }
    try {
        const Orbek::Configuration configuration{std::string(argv[1])};
        const Orbek::FIRBuilder builder(configuration);
        Orbek::Population people(configuration);
        for (int i = 3; i < argc; ++i) {
            std::ifstream file(argv[i], std::ios::binary);
            if (!file) throw std::runtime_error(std::string(argv[i]) + ": cannot be opened");
            people.append(builder.build(file), argv[i]);
        }
        const std::list<Orbek::Sample> samples{Orbek::Sample(Orbek::ImageIO::load(argv[2]))};

        // The ten best of those for whom one in a thousand strangers may be taken.
        const Orbek::Score threshold = Orbek::ScoreMappings(configuration).requestFAR(0.001f);
        const Orbek::Identification::Processor processor(configuration, people);
        processor.process(samples.begin(), samples.end(), threshold,
                          Orbek::Identification::Feedback(new Told), 10);
    } catch (const std::exception& e) {
        std::cerr << "identify_people: " << e.what() << "\n";
        return 1;
    }
}
