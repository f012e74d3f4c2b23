#include "fn/cptr.h"

namespace Fn::CptrImpl {

Ref::Ref(std::int32_t firstCount) : count_(firstCount) {
    pthread_mutexattr_t attributes;
    if (pthread_mutexattr_init(&attributes) != 0)
        FN_THROW(FNESysError, "Failed to initialize attribute of mutex");
    const int status = pthread_mutex_init(&mutex_, &attributes);
    pthread_mutexattr_destroy(&attributes);
    if (status != 0) FN_THROW(FNESysError, "Failed to create mutex");
}

} // namespace Fn::CptrImpl
