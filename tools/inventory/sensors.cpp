// Reads fans, temperatures, voltages and power with libsensors into nodes.
#include <sensors/sensors.h>

#include <cstdlib>

#include "reading.h"

namespace inventory {

namespace {

const struct Kind {
    sensors_feature_type feature;
    IC::Node::SensorType sensor;
    const char* unit;
} kinds[] = {
    {SENSORS_FEATURE_FAN, IC::Node::SENSOR_FAN, "turns a minute"},
    {SENSORS_FEATURE_TEMP, IC::Node::SENSOR_TEMPERATURE_SENSOR, "degrees Celsius"},
    {SENSORS_FEATURE_IN, IC::Node::SENSOR_VOLTAGE_SENSOR, "volts"},
    {SENSORS_FEATURE_POWER, IC::Node::SENSOR_POWER_SUPPLY, "watts"},
};

// The values of a sensor, by the ends of their names, such as fan1_min and in0_max_alarm.
const struct ValueRow {
    std::string_view ending;
    Key key;
} valueRows[] = {
    {"_input", KEY_READING},        {"_average", KEY_READING}, {"_min", KEY_LOWER_LIMIT},
    {"_lcrit", KEY_LOWER_CRITICAL}, {"_max", KEY_UPPER_LIMIT}, {"_cap", KEY_UPPER_LIMIT},
    {"_crit", KEY_UPPER_CRITICAL},  {"alarm", KEY_ALARM},      {"fault", KEY_FAULT},
};

const ValueRow* findRow(std::string_view name)
{
    for (const ValueRow& row : valueRows)
        if (name.size() > row.ending.size() && name.substr(name.size() - row.ending.size()) == row.ending)
            return &row;
    return nullptr;
}

class Sensor : public Component {
public:
    Sensor(const Site& site, const char* unit, const sensors_chip_name& chip, const sensors_feature& feature)
        : Component(site)
    {
        const std::unique_ptr<char, decltype(&std::free)> label(sensors_get_label(&chip, &feature),
                                                                std::free);
        put(KEY_NAME, std::string(label ? label.get() : feature.name));
        put(KEY_CHIP, std::string(chip.prefix));
        put(KEY_READ_AT, IC::Number(static_cast<long>(ZQ::DateTime::now()), 0));
        put(KEY_UNIT, std::string(unit));
        put(KEY_READING, IC::Number(IC::Number::KIND_NAN));  // until it is read
        int next = 0;
        while (const sensors_subfeature* value = sensors_get_all_subfeatures(&chip, &feature, &next))
            read(chip, *value);
        judge();
        describe({words(KEY_NAME), words(KEY_READING) + ' ' + unit});
    }

    // A new limit changes the status at once.
    IC::Error setProperty(const unsigned int& key, const IC::PropertyValue& value) override
    {
        IC::Error outcome = Component::setProperty(key, value);
        const Lock lock(mutex);
        judge();
        return outcome;
    }

private:
    void read(const sensors_chip_name& chip, const sensors_subfeature& value)
    {
        const ValueRow* row = findRow(value.name);
        double number = 0;
        if (row == nullptr || sensors_get_value(&chip, value.number, &number) != 0)
            return;
        if (row->key == KEY_READING)
            put(row->key, IC::Number(number));
        else if (row->key == KEY_ALARM || row->key == KEY_FAULT)  // one of several alarms is enough
            put(row->key, IC::Number(number != 0 || words(row->key) == "true"));
        else if (number != 0 || row->key == KEY_LOWER_LIMIT || row->key == KEY_LOWER_CRITICAL)
            put(row->key, IC::Number(number), false);  // an upper limit of 0 means that none is set
    }

    // False unless both are real numbers: the limit may be missing or have been replaced by a value of another kind.
    bool beyond(Key limit, bool above) const
    {
        const auto bound = properties.find(limit);
        const auto& reading = properties.at(KEY_READING);
        const auto isReal = [](const IC::PropertyValue& value) {
            return value.getKind() == IC::PropertyValue::KIND_NUMBER
                && IC::Number(value).getKind() == IC::Number::KIND_REAL;
        };
        return bound != properties.end() && isReal(bound->second) && isReal(reading)
            && (above ? reading > bound->second : reading < bound->second);
    }

    void judge()
    {
        const bool isUnread = IC::Number(properties.at(KEY_READING)).getKind() == IC::Number::KIND_NAN;
        const bool isOutside = beyond(KEY_LOWER_LIMIT, false) || beyond(KEY_LOWER_CRITICAL, false)
            || beyond(KEY_UPPER_LIMIT, true) || beyond(KEY_UPPER_CRITICAL, true);
        become(isUnread || words(KEY_FAULT) == "true" ? STATUS_FAULT
                   : isOutside                        ? STATUS_OUTSIDE_LIMITS
                   : words(KEY_ALARM) == "true"       ? STATUS_ALARM
                                                      : STATUS_FINE);
    }
};

}  // namespace

void readSensors(Inventory& inventory)
{
    if (sensors_init(nullptr) != 0)
        return;  // a machine without sensors
    int nextChip = 0;
    while (const sensors_chip_name* chip = sensors_get_detected_chips(nullptr, &nextChip)) {
        char chipName[200] = "";
        sensors_snprintf_chip_name(chipName, sizeof chipName, chip);
        int nextFeature = 0;
        while (const sensors_feature* feature = sensors_get_features(chip, &nextFeature))
            for (const Kind& kind : kinds)
                if (kind.feature == feature->type) {
                    const Site site = inventory.site(inventory.machine, kind.sensor,
                                                     std::string(chipName) + ':' + feature->name);
                    inventory.nodes.push_back(std::make_unique<Sensor>(site, kind.unit, *chip, *feature));
                }
    }
    sensors_cleanup();
}

}  // namespace inventory
