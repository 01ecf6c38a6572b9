#include "Fan.h"
#include "VXLog/RecordSink.h"
#include <iostream>

int main()
{
    VXLog::setRecordSink([](const VXLog::Record& record) {
        if (record.kind == VXLog::Record::Kind::log)
            std::cout << record.level << ' ' << record.logger << ": " << record.message << '\n';
    });

    Fan fan;
    fan.setProperty(Fan::SPEED, IC::PropertyValue(IC::Number(4200u)));
    fan.setProperty(Fan::MODEL, IC::PropertyValue("AFB0912"));
}
