// Owned<T>: the objects of a vector of pointers that the host-control library handed out (options,
// branches), held until the holder is cleared or destroyed, when each is deleted through its
// virtual destructor, on every path.
#pragma once

#include <cstddef>
#include <vector>

namespace TarselCli {
namespace System {

template <class T>
class Owned {
public:
    explicit Owned(std::vector<T*> objects) : objects_(std::move(objects)) {}
    ~Owned() { Clear(); }
    Owned(const Owned&) = delete;
    Owned& operator=(const Owned&) = delete;

    typename std::vector<T*>::const_iterator begin() const { return objects_.begin(); }
    typename std::vector<T*>::const_iterator end() const { return objects_.end(); }
    std::size_t size() const { return objects_.size(); }

    void Clear() {
        for (T* object : objects_) delete object;
        objects_.clear();
    }

private:
    std::vector<T*> objects_;
};

}  // namespace System
}  // namespace TarselCli
