#include "cmp/matches.h"

namespace Cmp {

RawMatch::RawMatch(const Fn::Package& package) {
    const FNPair<float, std::string> both(package);
    score = both.first;
    id = both.second;
}

RawMatch::operator Fn::Package() const {
    return Fn::Package(FNPair<float, std::string>(score, id));
}

Match::Match(const Fn::Package& package) {
    const FNPair<std::string, float> both(package);
    id = both.first;
    score = Score::unclamped(both.second);
}

Match::operator Fn::Package() const {
    return Fn::Package(FNPair<std::string, float>(id, score.value()));
}

} // namespace Cmp
