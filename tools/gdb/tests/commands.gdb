set print pretty on
set print address off
break stop
run
print shown
print damaged.number.value
print damaged.enumValue.value
print damaged.value.value
print damaged.error.value
print damaged.alert.value
print damaged.fan.value
print damaged.zeros.value
print damaged.exception.value
print damaged.time.value
print *(IC::PropertyValue*)&damaged.noKind
print *(IC::PropertyValue*)&damaged.nullText
print *(IC::PropertyValue*)&damaged.noNumber
print *(IC::PropertyValue*)&damaged.noText
print *(IC::PropertyValue*)&damaged.noBuffer
print *(IC::PropertyValue*)&damaged.noEnumValue
print *(IC::PropertyValue*)&damaged.noNumbers
print *(IC::PropertyValue*)&damaged.noTexts
print *(IC::PropertyValue*)&damaged.damagedText
print *(IC::PropertyValue*)&damaged.damagedBuffer
print *(IC::PropertyValue*)&damaged.damagedNumbers
print *(IC::PropertyValue*)&damaged.damagedTexts
with print elements 1 -- print shown.buffer
with print elements 1 -- print shown.numbers
print version
