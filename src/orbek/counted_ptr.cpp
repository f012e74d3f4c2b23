#include "orbek/counted_ptr.h"

#include "fn/cptr.h"

namespace Orbek {

using Fn::CptrImpl::Ref;

void* newRefcount(int firstCount) {
    return new Ref(firstCount);
}
void incRefcount(void* count) {
    static_cast<Ref*>(count)->increment();
}
bool decAndTestRefcount(void* count) {
    return static_cast<Ref*>(count)->decrement() == 0;
}
void deleteRefcount(void* count) {
    delete static_cast<Ref*>(count);
}

} // namespace Orbek
