#include "model_files.h"

#include "cmp/b7/encoder.h"
#include "cmp/b7/preprocessor.h"
#include "cmp/b7/transformation.h"
#include "cmp/mapping_files.h"
#include "cmp/portrait/sphar_transformator.h"
#include "eye/discriminator/cascaded_svm_discriminator.h"
#include "eye/discriminator/svm_fp_discriminator.h"

#include <fstream>

namespace Orbek::Models {
namespace {

using namespace Eye::Implementation;
using Dot = CascadedSvmDiscriminator<DotKernel, CombinedSods16x16>;
using Sods = CascadedSvmDiscriminator<FpKernelDeg2, CombinedSods16x16>;
using GaborSods = CascadedSvmDiscriminator<FpKernelDeg2, TrainedLayout>;
using EyeSods = CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<7, 7, 6>>;
using MouthSods = CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 6, 6>>;
using BridgeSods = CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 8, 6>>;

template <class Disc> void openCascade(const std::string& directory, const std::string& name) {
    Disc(CascadeSettings{name, {}}, directory);
}

void openPolynomial(const std::string& directory, const std::string& name) {
    Eye::SVMFPDiscriminator::create(directory, name, 0);
}

void openHyperbolic(const std::string& directory, const std::string& name) {
    Eye::SVMHyperbolicDiscriminator(directory, name);
}

void openLighting(const std::string& directory, const std::string& name) {
    const std::string path = directory + "/" + name;
    std::ifstream stream(path, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, path + ": cannot be opened for reading");
    try {
        Cmp::Portrait::SpharTransformator{stream};
    } catch (const FNException& e) {
        FN_THROW(FNEBadFormat, path + ": " + e.what());
    }
}

void openB7(const std::string& directory, const std::string& name) {
    Cmp::B7::Transformation::read(directory + "/" + name, Cmp::B7::PreProcessor::computeFeatureVectorSize(),
                                  Cmp::B7::Encoder().components());
}

void openMapping(const std::string& directory, const std::string& name) {
    Cmp::Implementation::readMappingFile(directory + "/" + name, "orbek-models");
}

constexpr ModelFile table[] = {
    {"cara", "is1717da.dat", "CascadedSvmDiscriminator, dot product of pixel signs", openCascade<Dot>},
    {"cara", "is1717dl.dat", "CascadedSvmDiscriminator, dot product of pixel signs", openCascade<Dot>},
    {"cara", "is1717dc.dat", "CascadedSvmDiscriminator, dot product of pixel signs", openCascade<Dot>},
    {"cara", "is1717dr.dat", "CascadedSvmDiscriminator, dot product of pixel signs", openCascade<Dot>},
    {"cara", "is1717fl.dat", "CascadedSvmDiscriminator, polynomial of pixel signs", openCascade<Sods>},
    {"cara", "is1717fc.dat", "CascadedSvmDiscriminator, polynomial of pixel signs", openCascade<Sods>},
    {"cara", "is1717fr.dat", "CascadedSvmDiscriminator, polynomial of pixel signs", openCascade<Sods>},
    {"cara", "gs1717fl.dat", "CascadedSvmDiscriminator, polynomial of Gabor signs", openCascade<GaborSods>},
    {"cara", "gs1717fc.dat", "CascadedSvmDiscriminator, polynomial of Gabor signs", openCascade<GaborSods>},
    {"cara", "gs1717fr.dat", "CascadedSvmDiscriminator, polynomial of Gabor signs", openCascade<GaborSods>},
    {"cara", "gs2323fc.dat", "CascadedSvmDiscriminator, polynomial of Gabor signs", openCascade<GaborSods>},
    {"ojo", "eyedisc.dat", "CascadedSvmDiscriminator, polynomial of Gabor signs", openCascade<EyeSods>},
    {"boca", "mouthdisc.dat", "CascadedSvmDiscriminator, polynomial of Gabor signs", openCascade<MouthSods>},
    {"raiz", "bridgedisc.dat", "CascadedSvmDiscriminator, polynomial of Gabor signs",
     openCascade<BridgeSods>},
    {"cmp", "trans-b7.dat", "Cmp::B7::CmpAlgorithm", openB7},
    {"cmp", "trans-b6.dat", "Cmp::B6::CmpAlgorithm", nullptr},
    {"cmp", "trans-a14.dat", "Cmp::A14::CmpAlgorithm", nullptr},
    {"cmp", "trans-l5x.dat", "Cmp::Pcld::CmpAlgorithm", nullptr},
    {"cmp", "trans-l5z.dat", "Cmp::Pcld::CmpAlgorithm", nullptr},
    {"cmp", "isotdb-l5x.dat", "Cmp::Pcld::CmpAlgorithm", nullptr},
    {"cmp", "isotdb-l5z.dat", "Cmp::Pcld::CmpAlgorithm", nullptr},
    {"cmp", "smap-b7.dat", "Cmp::SMap", openMapping},
    {"cmp", "farmap-b7.dat", "Cmp::RMap", openMapping},
    {"cmp", "frrmap-b7.dat", "Cmp::RMap", openMapping},
    {"cmp", "smap-b7-sn.dat", "Cmp::SMap", openMapping},
    {"cmp", "farmap-b7-sn.dat", "Cmp::RMap", openMapping},
    {"cmp", "frrmap-b7-sn.dat", "Cmp::RMap", openMapping},
    {"cmp", "smap-b6.dat", "Cmp::SMap", nullptr},
    {"cmp", "farmap-b6.dat", "Cmp::RMap", nullptr},
    {"cmp", "frrmap-b6.dat", "Cmp::RMap", nullptr},
    {"cmp", "smap-b6-sn.dat", "Cmp::SMap", nullptr},
    {"cmp", "farmap-b6-sn.dat", "Cmp::RMap", nullptr},
    {"cmp", "frrmap-b6-sn.dat", "Cmp::RMap", nullptr},
    {"cmp", "smap-a14.dat", "Cmp::SMap", nullptr},
    {"cmp", "farmap-a14.dat", "Cmp::RMap", nullptr},
    {"cmp", "frrmap-a14.dat", "Cmp::RMap", nullptr},
    {"cmp", "smap-b5l5.dat", "Cmp::SMap", nullptr},
    {"cmp", "farmap-b5l5.dat", "Cmp::RMap", nullptr},
    {"cmp", "frrmap-b5l5.dat", "Cmp::RMap", nullptr},
    {"cmp", "smap-b6l5.dat", "Cmp::SMap", nullptr},
    {"cmp", "farmap-b6l5.dat", "Cmp::RMap", nullptr},
    {"cmp", "frrmap-b6l5.dat", "Cmp::RMap", nullptr},
    {"cmp", "fusfunc-l1a11.dat", "SVMHyperbolicDiscriminator", openHyperbolic},
    {"portrait", "gldisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "fpdisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "gedisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "cedisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "gadisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "ethwdisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "ethbdisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "ethadisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "cmdisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "ludisc.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "chinest.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "crownest.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "learest.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "rearest.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-primary.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-10.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-20.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-30.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-40.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-50.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-60.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-70.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-80.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-1-above.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-5.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-10.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-15.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-20.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-25.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-30.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-35.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-40.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-45.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-50.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-55.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-60.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-65.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-70.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-75.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-80.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-85.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "age-secondary-2-above.dat", "SVMFPDiscriminator", openPolynomial},
    {"portrait", "sphartr.dat", "SpharTransformator", openLighting},
};

} // namespace

std::span<const ModelFile> modelFiles() {
    return table;
}

} // namespace Orbek::Models
