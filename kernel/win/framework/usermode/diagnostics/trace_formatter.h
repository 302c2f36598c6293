#pragma once

#include <cstdarg>
#include <vector>

namespace Kernel::Shared::Diagnostics {
struct TraceLocation;
}

namespace Kernel::UserMode::Diagnostics {

class TraceRedirector;

// Builds one record: the prefix (timestamp, sink name, tag, location) and then
// the caller's message. The buffers persist from record to record and only grow.
template <typename CharT>
class TraceFormatter {
public:
    explicit TraceFormatter(const TraceRedirector* owner) : owner_(owner) {}
    virtual ~TraceFormatter() = default;

    // Returns the finished line, valid until the next call.
    const CharT* Format(const Shared::Diagnostics::TraceLocation& location, const CharT* format, va_list args);

private:
    std::vector<CharT> prefix_;
    std::vector<CharT> message_;
    const TraceRedirector* owner_;
};

}  // namespace Kernel::UserMode::Diagnostics
