// Imports the file named on the command line and prints its point count.
#include <iostream>

#include "ZonCldBody.h"
#include "ZonCldImportServices.h"
#include "ZonGeoFactoryProtected.h"

int main(int argc, char** argv)
{
    if (argc != 2) return 2;
    ZonGeoFactoryProtected geometry;
    ZonMathTransformation placement, inverse;
    ZonMathBox box;  // empty: the whole file
    std::vector<ZonString> messages;
    auto body = ZonCldImportServices::BuildCldBodyFromFile(geometry, ZonUnicodeString(argv[1]), placement, inverse, box, messages);
    std::cout << body->GetNumberOfPoints() << "\n";
    return 0;
}
