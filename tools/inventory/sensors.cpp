// Reads all features of all chips that libsensors knows into nodes.
#include <sensors/sensors.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <system_error>

#include "alerts.h"
#include "reading.h"
#include "values.h"

namespace inventory {

namespace {

namespace fs = std::filesystem;

// What libsensors calls a feature, without its number: another version of libsensors may know more of them.
// No sensor type is about currents, energy or frequencies: they are readings of the domain that takes the power. None
// is about humidity or the control of fans: they are readings of the domain that is cooled.
const struct Kind {
    std::string_view word;
    const char* unit;
    const char* unitInWords;
    IC::Node::SensorType sensor;
    bool isFlag;  // it has no reading but a flag
} kinds[] = {
    {"in", "volts", " V", IC::Node::SENSOR_VOLTAGE_SENSOR, false},
    {"fan", "rpm", " RPM", IC::Node::SENSOR_FAN, false},
    {"temp", "celsius", " degrees Celsius", IC::Node::SENSOR_TEMPERATURE_SENSOR, false},
    {"power", "watts", " W", IC::Node::SENSOR_POWER_DOMAIN, false},
    {"energy", "joules", " J", IC::Node::SENSOR_POWER_DOMAIN, false},
    {"curr", "amperes", " A", IC::Node::SENSOR_POWER_DOMAIN, false},
    {"humidity", "percent", " %", IC::Node::SENSOR_COOLING_DOMAIN, false},
    {"cpu", "volts", " V", IC::Node::SENSOR_VOLTAGE_SENSOR, false},  // cpu0_vid
    {"intrusion", "", "", IC::Node::SENSOR_INTRUSION, true},
    {"beep_enable", "", "", IC::Node::SENSOR_ALERT_INDICATION, true},
    {"pwm", "", "", IC::Node::SENSOR_COOLING_DOMAIN, false},
    {"freq", "hertz", " Hz", IC::Node::SENSOR_POWER_DOMAIN, false},
};
constexpr Kind unknownKind {"", "", "", IC::Node::SENSOR_UNKNOWN, false};

const Kind& kindOf(std::string_view feature)
{
    const std::string_view word = feature.substr(0, feature.find_first_of("0123456789"));
    for (const Kind& kind : kinds)
        if (kind.word == word)
            return kind;
    return unknownKind;
}

// Chips of power supplies, by parts of their names in lower case: the drivers of Linux for the bus, for single models,
// for batteries and for mains adapters. The first power that such a chip measures is that of the whole supply.
constexpr std::string_view supplies[] = {
    "acbel", "bat",   "bpa_rs", "bpd_rs", "cffps",           "crps",   "dps",   "fsg", "ipsps",
    "pfe",   "pmbus", "psu",    "sgd009", "ucsi_source_psy", "ym2151", "yh5151"};

bool isSupply(std::string name)
{
    for (char& letter : name)
        letter = letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
    return std::any_of(std::begin(supplies), std::end(supplies), [&name](std::string_view supply) {
        // "bat" is a part of other names.
        return supply == "bat" ? name.compare(0, supply.size(), supply) == 0
                               : name.find(supply) != std::string::npos;
    });
}

// The values of a sensor, by what follows the name of the feature: fan1_min, in0_max_alarm, cpu0_vid.
const struct ValueRow {
    std::string_view ending;
    Key key;
    enum Form : unsigned char { NUMBER, LIMIT, FLAG, CODE } form;
} valueRows[] = {
    {"", KEY_READING, ValueRow::NUMBER},
    {"_input", KEY_READING, ValueRow::NUMBER},
    {"_average", KEY_AVERAGE, ValueRow::NUMBER},
    {"_lowest", KEY_LOWEST, ValueRow::NUMBER},
    {"_highest", KEY_HIGHEST, ValueRow::NUMBER},
    {"_input_lowest", KEY_LOWEST, ValueRow::NUMBER},
    {"_input_highest", KEY_HIGHEST, ValueRow::NUMBER},
    {"_average_lowest", KEY_AVERAGE_LOWEST, ValueRow::NUMBER},
    {"_average_highest", KEY_AVERAGE_HIGHEST, ValueRow::NUMBER},
    {"_average_interval", KEY_AVERAGE_INTERVAL, ValueRow::NUMBER},
    {"_rated_min", KEY_RATED_MINIMUM, ValueRow::NUMBER},
    {"_rated_max", KEY_RATED_MAXIMUM, ValueRow::NUMBER},
    {"_min", KEY_LOWER_LIMIT, ValueRow::LIMIT},
    {"_lcrit", KEY_LOWER_CRITICAL, ValueRow::LIMIT},
    {"_max", KEY_UPPER_LIMIT, ValueRow::LIMIT},
    {"_crit", KEY_UPPER_CRITICAL, ValueRow::LIMIT},
    {"_emergency", KEY_EMERGENCY_LIMIT, ValueRow::LIMIT},
    {"_cap", KEY_CAP, ValueRow::LIMIT},
    {"_min_hyst", KEY_LOWER_LIMIT_HYSTERESIS, ValueRow::NUMBER},
    {"_lcrit_hyst", KEY_LOWER_CRITICAL_HYSTERESIS, ValueRow::NUMBER},
    {"_max_hyst", KEY_UPPER_LIMIT_HYSTERESIS, ValueRow::NUMBER},
    {"_crit_hyst", KEY_UPPER_CRITICAL_HYSTERESIS, ValueRow::NUMBER},
    {"_emergency_hyst", KEY_EMERGENCY_HYSTERESIS, ValueRow::NUMBER},
    {"_cap_hyst", KEY_CAP_HYSTERESIS, ValueRow::NUMBER},
    {"_alarm", KEY_ALARM, ValueRow::FLAG},
    {"_min_alarm", KEY_MIN_ALARM, ValueRow::FLAG},
    {"_lcrit_alarm", KEY_LCRIT_ALARM, ValueRow::FLAG},
    {"_max_alarm", KEY_MAX_ALARM, ValueRow::FLAG},
    {"_crit_alarm", KEY_CRIT_ALARM, ValueRow::FLAG},
    {"_emergency_alarm", KEY_EMERGENCY_ALARM, ValueRow::FLAG},
    {"_cap_alarm", KEY_CAP_ALARM, ValueRow::FLAG},
    {"_fault", KEY_FAULT, ValueRow::FLAG},
    {"_beep", KEY_BEEP, ValueRow::FLAG},
    {"_type", KEY_SENSOR_KIND, ValueRow::CODE},
    {"_offset", KEY_OFFSET, ValueRow::NUMBER},
    {"_div", KEY_FAN_DIVISOR, ValueRow::NUMBER},
    {"_pulses", KEY_FAN_PULSES, ValueRow::NUMBER},
};
constexpr ValueRow beepRow {"", KEY_BEEP, ValueRow::FLAG};

const ValueRow* findRow(const Kind& kind, std::string_view feature, std::string_view value)
{
    const std::string_view ending =
        value.substr(0, feature.size()) == feature ? value.substr(feature.size()) : value;
    if (kind.isFlag && ending.empty())
        return &beepRow;
    for (const ValueRow& row : valueRows)
        if (row.ending == ending)
            return &row;
    return nullptr;
}

class Sensor : public Component {
public:
    Sensor(const Site& site, const Kind& kind, const std::string& chipName, const sensors_chip_name& chip,
           const sensors_feature& feature)
        : Component(site)
    {
        const std::unique_ptr<char, decltype(&std::free)> label(sensors_get_label(&chip, &feature),
                                                                std::free);
        const std::string name = label ? told(label.get()) : "";
        put(KEY_NAME, name.empty() ? std::string(feature.name) : name);
        put(KEY_CHIP, chipName);
        put(KEY_READ_AT, IC::Number(static_cast<long>(ZQ::DateTime::now()), 0));
        if (*kind.unit != '\0')
            put(KEY_UNIT, std::string(kind.unit));
        int next = 0;
        while (const sensors_subfeature* value = sensors_get_all_subfeatures(&chip, &feature, &next))
            read(kind, feature.name, chip, *value);
        if (properties.count(KEY_READING) == 0 && properties.count(KEY_AVERAGE) != 0)
            properties.insert({KEY_READING, properties.at(KEY_AVERAGE)});
        const bool isRead =
            properties.count(kind.isFlag ? (site.sensor == SENSOR_INTRUSION ? KEY_ALARM : KEY_BEEP)
                                         : KEY_READING)
            != 0;
        if (!isRead)
            put(KEY_READING, IC::Number(IC::Number::KIND_NAN));
        judge();
        describe({words(KEY_NAME), kind.isFlag || !isRead ? "" : words(KEY_READING) + kind.unitInWords});
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
    void read(const Kind& kind, std::string_view feature, const sensors_chip_name& chip,
              const sensors_subfeature& value)
    {
        constexpr double codesEnd = 0x1p32;
        double number = 0;
        if ((value.flags & SENSORS_MODE_R) == 0 || sensors_get_value(&chip, value.number, &number) != 0
            || !std::isfinite(number))
            return;
        const ValueRow* row = findRow(kind, feature, value.name);
        if (row == nullptr || (row->form == ValueRow::CODE && !(number >= 0 && number < codesEnd)))
            addOther(std::string(value.name) + '=' + exactText(IC::Number(number)));
        else if (row->form == ValueRow::FLAG)
            put(row->key, IC::Number(number != 0));
        else if (row->form == ValueRow::CODE)
            put(row->key, IC::EnumValue(static_cast<unsigned int>(number)));
        else
            put(row->key, IC::Number(number), row->form != ValueRow::LIMIT);
    }

    void addOther(const std::string& fact)
    {
        IC::StringArray others;
        if (const auto found = properties.find(KEY_OTHER_FACTS); found != properties.end())
            others = found->second;
        others.push_back(fact);
        put(KEY_OTHER_FACTS, others);
    }

    void judge()
    {
        become(STATUS_FINE);  // or the status itself would be a trouble
        if (const Trouble* worst = troubleOf(*this))
            become(worst->status);
    }
};

// libsensors from its start to its end: its chips and features are gone afterwards.
class Library {
public:
    Library() : isOpen_(sensors_init(nullptr) == 0)
    {
        if (isOpen_)
            return;
        // With a mistake in its configuration it reports the mistake and begins nothing. Without, it reads plainly.
        sensors_cleanup();
        const std::unique_ptr<std::FILE, int (*)(std::FILE*)> nothing(std::fopen("/dev/null", "r"),
                                                                      std::fclose);
        isOpen_ = nothing && sensors_init(nothing.get()) == 0;
    }
    ~Library()
    {
        if (isOpen_)
            sensors_cleanup();
    }
    Library(const Library&) = delete;
    Library& operator=(const Library&) = delete;

    std::vector<const sensors_chip_name*> chips() const
    {
        std::vector<const sensors_chip_name*> found;
        int next = 0;
        while (const sensors_chip_name* chip = isOpen_ ? sensors_get_detected_chips(nullptr, &next) : nullptr)
            found.push_back(chip);
        return found;
    }

private:
    bool isOpen_;
};

// As sensors(1) prints it.
std::string nameOf(const sensors_chip_name& chip)
{
    char text[200] = "";
    sensors_snprintf_chip_name(text, sizeof text, &chip);
    return text;
}

// The name of the device that the chip belongs to. It stays when other chips come and go, unlike the number in hwmon3.
std::string deviceOf(const sensors_chip_name& chip)
{
    std::error_code error;
    const fs::path device = fs::read_symlink(fs::path(chip.path) / "device", error);
    return error ? fs::path(chip.path).filename().string() : device.filename().string();
}

}  // namespace

void readSensors(Inventory& inventory)
{
    const Library library;
    const auto chips = library.chips();
    std::map<std::string, unsigned int> names;
    for (const sensors_chip_name* chip : chips)
        ++names[nameOf(*chip)];
    for (const sensors_chip_name* chip : chips) {
        std::string name = nameOf(*chip);
        if (names[name] > 1)  // libsensors takes some chips for the only ones of their name
            name += '-' + deviceOf(*chip);
        bool isSupplyNext = isSupply(chip->prefix);
        int next = 0;
        while (const sensors_feature* feature = sensors_get_features(chip, &next)) {
            const Kind& kind = kindOf(feature->name);
            IC::Node::SensorType type = kind.sensor;
            if (isSupplyNext && kind.word == "power") {
                type = IC::Node::SENSOR_POWER_SUPPLY;
                isSupplyNext = false;
            }
            const Site site = inventory.site(inventory.machine, type, name + ':' + feature->name);
            inventory.nodes.push_back(std::make_unique<Sensor>(site, kind, name, *chip, *feature));
        }
    }
}

}  // namespace inventory
