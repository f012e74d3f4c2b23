// Finds faces and eyes in an image: find_faces <orbek.conf> <image>

#include <orbek/eyes_finder.h>
#include <orbek/face_finder.h>
#include <orbek/image_io.h>

#include <exception>
#include <iostream>

int main(int argc, char** argv) {
    if (argc != 3) {
        std::cerr << "usage: find_faces <orbek.conf> <image>\n";
        return 2;
    }
    try {
        const Orbek::Configuration configuration{std::string(argv[1])};
        const Orbek::Face::Finder faceFinder(configuration); // reads the models
        const Orbek::Eyes::Finder eyesFinder(configuration);
        const Orbek::Image image = Orbek::ImageIO::load(argv[2]);
        const int width = static_cast<int>(image->width()), height = static_cast<int>(image->height());

        // Eye distances from 5 to 40 percent of the image's width, everywhere in the image.
        const auto faces = faceFinder.find(image, 0.05f, 0.4f, 0, 0, width, height);
        std::cout << faces.size() << (faces.size() == 1 ? " face in " : " faces in ") << width << " x "
                  << height << " pixels\n";
        for (const Orbek::Face::Location& face : faces) {
            std::cout << "face at " << face.pos.x << ", " << face.pos.y << ", confidence " << face.confidence
                      << "\n";
            for (const Orbek::Eyes::Location& eyes : eyesFinder.find(image, face))
                std::cout << "    eyes at " << eyes.first.x << ", " << eyes.first.y << " and "
                          << eyes.second.x << ", " << eyes.second.y << "\n";
        }
    } catch (const std::exception& e) {
        std::cerr << "find_faces: " << e.what() << "\n";
        return 1;
    }
}
