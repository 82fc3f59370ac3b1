#pragma once

#include "Check.h"

#include <support/Streams.h>

#include <string>

namespace fuzz {

/// Any bytes to the stream reader. What it refuses gives one message at most and no object; what it takes is dumped, written,
/// read again and compared.
inline void checkStream(std::string const& bytes)
{
    auto const found = support::read(bytes);
    check(found.isRead ? found.errors.empty() : found.errors.size() <= 1 && found.objects.empty());
    if (!found.isRead)
        return;
    std::string const content = support::contentOf(found.objects);
    for (int const level : {0, 9}) {
        auto const again = support::read(support::written(found.objects, level));
        check(again.isRead && support::contentOf(again.objects) == content);
    }
}

} // namespace fuzz
