// Makes the record of a person from pictures: enrol_people <orbek.conf> <record> <picture>...

#include <orbek/enrollment.h>
#include <orbek/image_io.h>

#include <exception>
#include <fstream>
#include <iostream>

namespace {

/// Writes the record into a file, and tells what happens meanwhile.
class IntoFile final : public Orbek::Enrollment::FeedbackBody {
public:
    explicit IntoFile(const char* file) : file_(file) {}

    void start() override {}
    void processingImage(const Orbek::Image& image) override { std::cout << image->name() << ": "; }
    void eyesFound(const Orbek::Eyes::Location&) override { std::cout << "eyes found\n"; }
    void eyesNotFound() override { std::cout << "no eyes\n"; }
    void success(const Orbek::FIR& fir) override {
        std::ofstream stream(file_, std::ios::binary);
        fir.serialize(stream);
        std::cout << (stream.flush() ? "written to " : "cannot be written to ") << file_ << "\n";
    }
    void failure() override { std::cout << "there are too few usable pictures\n"; }
    void end() override {}

private:
    const char* file_;
};

} // namespace

int main(int argc, char** argv) {
    if (argc < 4) {
        std::cerr << "usage: enrol_people <orbek.conf> <record> <picture>...\n";
        return 2;
    }
    try {
        const Orbek::Enrollment::Processor processor(Orbek::Configuration{std::string(argv[1])});
        std::list<Orbek::Sample> samples;
        for (int i = 3; i < argc; ++i) samples.emplace_back(Orbek::ImageIO::load(argv[i]));
        processor.process(samples.begin(), samples.end(), Orbek::Enrollment::Feedback(new IntoFile(argv[2])));
    } catch (const std::exception& e) {
        std::cerr << "enrol_people: " << e.what() << "\n";
        return 1;
    }
}
