#include <nexil/TypeId.h>

#include <cstdlib>
#include <cxxabi.h>
#include <memory>

namespace Nexil::Internal {

String DebugTypeId::getTypeNameForDebugOnly(TypeId const& type)
{
    if (!type)
        return {};
    struct FreeText {
        void operator()(char* text) const noexcept { std::free(text); }
    };
    int status = 0;
    std::unique_ptr<char, FreeText> const name(abi::__cxa_demangle(type.info()->name(), nullptr, nullptr, &status));
    return status == 0 && name ? String(name.get()) : String(type.info()->name());
}

} // namespace Nexil::Internal
