#include "orv/angle.h"

#include <locale>
#include <sstream>

namespace orv
{

std::string toString(const Anglef& angle)
{
    std::ostringstream text;
    text.imbue(std::locale::classic());
    text << "Anglef(" << angle.degrees() << " degrees)";
    return text.str();
}

} // namespace orv
