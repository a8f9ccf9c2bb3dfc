// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/PageFiles.h"

#include <utility>

namespace kvloamd {

std::string_view contentType(std::string_view fileName) {
    static constexpr std::pair<std::string_view, std::string_view> kTypes[] = {
        {".html", "text/html; charset=utf-8"},
        {".css", "text/css; charset=utf-8"},
        {".js", "text/javascript; charset=utf-8"},
        {".json", "application/json"},
        {".svg", "image/svg+xml"},
        {".png", "image/png"},
        {".txt", "text/plain; charset=utf-8"},
    };
    for (auto const& [end, type] : kTypes)
        if (fileName.ends_with(end)) return type;
    return "application/octet-stream";
}

} // namespace kvloamd
