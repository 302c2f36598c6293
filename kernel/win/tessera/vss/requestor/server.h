#pragma once

#include <windows.h>

namespace Kernel::Tessera::Vss::Requestor {

// The COM server of the "Embedding" run: apartment and security set-up, class
// objects, and the wait until no object or server lock is left.
class Server {
public:
    Server() = default;
    ~Server();
    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;

    HRESULT Initialize();
    HRESULT Run();

    // LockServer(TRUE/FALSE) of the class objects.
    static void Lock();
    static void Unlock();
    static long Locks();

    static bool IsIdle();
};

}  // namespace Kernel::Tessera::Vss::Requestor
