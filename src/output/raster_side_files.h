#pragma once
// Side files of a user-facing raster: KML 2.0 ground overlay, ENVI header.
#include <string>

#include "output/raster_file.h"

// The KML 2.0 ground overlay of `imageHref` over the box of the header's
// corner points. 0; 1 when the header has no usable corners; 5 on a write
// failure.
int WriteKmlOverlay(const tesv_description_section& header, const std::string& kmlName,
                    const std::string& imageHref, const std::string& title);

// The ENVI header "<raster>.hdr" of a raster, with the key names of the
// description file ENVI_descriptions_<type>.des (type from
// RasterInfo.ENVI_HeaderDescriptionType, else "default") in
// TESSIVOR_CEOS_DES_FILES_DIR. An existing "<raster>.hdr" that is not an ENVI
// header (a product record) is left alone (status 1). 0; 9 for a missing
// description file; 10 for a layout ENVI cannot describe; 5 on a write
// failure.
int WriteEnviHeader(const CRasterFile& raster, std::string& error);
