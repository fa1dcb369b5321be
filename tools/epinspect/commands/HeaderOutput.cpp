#include "commands/HeaderOutput.h"

#include <etc/ISCSIQuorinStringTool.h>

namespace epinspect {

std::string textOf(const HeaderField& field) {
    LineBuffer text;
    switch (field.form) {
        case HeaderField::Form::number:
            text.decimal(field.number);
            break;
        case HeaderField::Form::hexadecimal:
            text.hexadecimal(field.number);
            break;
        case HeaderField::Form::time:
            text.add(ISCSI::TOOL::GetTimeInString(static_cast<unsigned int>(field.number)));
            break;
        case HeaderField::Form::text:
        case HeaderField::Form::texts:
            for (const std::string& part : field.texts) text.add(text.view().empty() ? "" : " ", part);
            break;
    }
    return std::string(text.view());
}

void writeValue(Json& object, std::string_view name, const HeaderField& field) {
    switch (field.form) {
        case HeaderField::Form::number:
        case HeaderField::Form::time:
            object.number(name, field.number);
            break;
        case HeaderField::Form::hexadecimal:
            object.hexadecimal(name, field.number);
            break;
        case HeaderField::Form::text:
            object.text(name, field.texts[0]);
            break;
        case HeaderField::Form::texts:
            object.texts(name, field.texts);
            break;
    }
}

}  // namespace epinspect
