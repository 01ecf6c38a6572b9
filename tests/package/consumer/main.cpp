#include <dlfcn.h>

#include <iostream>
#include <stdexcept>

#include "IC/Alert.h"
#include "IC/EnumValue.h"
#include "IC/Error.h"
#include "IC/ICException.h"
#include "IC/Node.h"
#include "IC/Number.h"
#include "IC/Property.h"

namespace {

// The argument is the plug-in; without one only the program itself is tried.
int callPlugin(const char* path)
{
    void* const plugin = dlopen(path, RTLD_NOW);
    if (plugin == nullptr) {
        std::cout << dlerror() << '\n';
        return 1;
    }
    const auto function = reinterpret_cast<int (*)()>(dlsym(plugin, "caughtAndThrown"));
    try {
        std::cout << function() << '\n';
    } catch (const IC::PropertyValueInvalidKind& refusal) {
        std::cout << "from the plug-in: " << refusal.what() << '\n';
    }
    return dlclose(plugin);
}

}  // namespace

int main(int argc, char** argv)
{
    std::cout << IC::pst[0] << ", " << IC::pst[74] << '\n';
    std::cout << IC::Node(20) << '\n';
    std::cout << IC::Number(1234567890L, 0) << '\n';
    try {
        const IC::Node node(74);
    } catch (const IC::NodeInvalidSensor& refusal) {
        std::cout << refusal.what() << '\n';
    }
    try {
        const bool flag = IC::PropertyValue("text");
        std::cout << flag << '\n';
    } catch (const IC::PropertyValueInvalidKind& refusal) {
        std::cout << refusal.what() << '\n';
    }
    try {
        const IC::Error error("text", 17);
    } catch (const std::invalid_argument& refusal) {
        std::cout << refusal.what() << '\n';
    }
    return argc > 1 ? callPlugin(argv[1]) : 0;
}
