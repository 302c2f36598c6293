#pragma once

namespace Kernel::Tessera::Vss::Requestor {

// Non-public base of every COM object class: counts the live objects that keep
// the server running. Constructed before, destroyed after the object itself.
class GlobalComponentReference {
public:
    static long LiveObjects();

protected:
    GlobalComponentReference();
    ~GlobalComponentReference();
    GlobalComponentReference(const GlobalComponentReference&) = delete;
    GlobalComponentReference& operator=(const GlobalComponentReference&) = delete;
};

}  // namespace Kernel::Tessera::Vss::Requestor
