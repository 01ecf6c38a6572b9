#include "IC/ICException.h"
#include "IC/Property.h"
#include <exception>
#include <iostream>

int main()
{
    const IC::PropertyValue text("3600");
    try {
        const unsigned int number = text;
        std::cout << number << '\n';
    } catch (const std::exception& refusal) {  // does not catch it
        std::cout << "std::exception: " << refusal.what() << '\n';
    } catch (const IC::ICException& refusal) {  // does not catch it either
        std::cout << "IC::ICException: " << refusal.what() << '\n';
    } catch (const IC::PropertyValueInvalidKind& refusal) {
        std::cout << "IC::PropertyValueInvalidKind: " << refusal.what() << '\n';
    }
}
