#pragma once

#include "fn/cptr.h"
#include "fn/thread/mutex.h"

#include <map>
#include <string>

namespace Cmp::Implementation {

/// Trained data that all objects of a class share by path. They are dropped when the last of these objects
/// goes. Each object of the class holds one of this.
template <class Data> class SharedFiles {
public:
    SharedFiles() { add(1); }
    SharedFiles(const SharedFiles&) : SharedFiles() {}
    SharedFiles& operator=(const SharedFiles&) { return *this; }
    ~SharedFiles() { add(-1); }

    /// What `read(path)` returned at the first call for that path.
    template <class Read> FNCountedPtr<const Data> get(const std::string& path, Read read) const {
        const FNMutexLock lock(shared().mutex);
        auto& files = shared().files;
        auto file = files.find(path);
        if (file == files.end())
            file = files.emplace(path, FNCountedPtr<const Data>(new Data(read(path)))).first;
        return file->second;
    }

private:
    struct Shared {
        FNMutex mutex{FNMutex::recursive};
        int objects = 0;
        std::map<std::string, FNCountedPtr<const Data>> files;
    };

    static Shared& shared() {
        static Shared& instance = *new Shared; // for objects that go after the end of main
        return instance;
    }
    static void add(int change) {
        const FNMutexLock lock(shared().mutex);
        shared().objects += change;
        if (shared().objects == 0) shared().files.clear();
    }
};

} // namespace Cmp::Implementation
