#include "Fan.h"
#include "IC/json.h"
#include <iostream>

int main()
try {
    const Fan fan;
    const nlohmann::json document = fan;
    const std::string sent = document.dump();
    std::cout << document["path"] << ' ' << document["properties"]["1"] << '\n';

    nlohmann::json received = nlohmann::json::parse(sent);
    const IC::StoredNode stored(received);
    std::cout << stored.getProperties() << '\n';
    const auto model = received["properties"]["1"].get<IC::PropertyValue>();
    std::cout << model << (model.readOnly() ? ", read-only\n" : "\n");

    received["properties"]["2"]["value"] = "fast";
    const IC::StoredNode refused(received);
    std::cout << refused << '\n';
} catch (const nlohmann::json::exception& refusal) {
    std::cout << refusal.what() << '\n';
}
