#pragma once

#include <hwloc.h>

#include <stdexcept>
#include <string>

// The export of a synthetic machine, with each type of object that hwloc makes up.
inline std::string synthetic(const std::string& description)
{
    hwloc_topology_t topology = nullptr;
    char* text = nullptr;
    int length = 0;
    if (hwloc_topology_init(&topology) != 0
        || hwloc_topology_set_all_types_filter(topology, HWLOC_TYPE_FILTER_KEEP_ALL) != 0
        || hwloc_topology_set_synthetic(topology, description.c_str()) != 0
        || hwloc_topology_load(topology) != 0
        || hwloc_topology_export_xmlbuffer(topology, &text, &length, 0) != 0)
        throw std::runtime_error("hwloc does not make up " + description);
    std::string xml = text;
    hwloc_free_xmlbuffer(topology, text);
    hwloc_topology_destroy(topology);
    return xml;
}
