// SPDX-License-Identifier: Apache-2.0
#include "Plot.h"

#ifdef HAVE_RSVG

#include <cairo.h>
#include <librsvg/rsvg.h>

#include <memory>

std::string writePng(const std::string& svg, const std::string& file) {
    const std::unique_ptr<RsvgHandle, void (*)(gpointer)> handle(
            rsvg_handle_new_from_data(reinterpret_cast<const guint8*>(svg.data()), svg.size(),
                                      nullptr),
            g_object_unref);
    double width = 0;
    double height = 0;
    if (handle == nullptr ||
        !rsvg_handle_get_intrinsic_size_in_pixels(handle.get(), &width, &height)) {
        return "the drawing cannot be rendered";
    }
    cairo_surface_t* surface = cairo_image_surface_create(
            CAIRO_FORMAT_RGB24, static_cast<int>(width), static_cast<int>(height));
    cairo_t* context = cairo_create(surface);
    const RsvgRectangle page{0, 0, width, height};
    const bool rendered = rsvg_handle_render_document(handle.get(), context, &page, nullptr) != 0;
    const cairo_status_t status =
            rendered ? cairo_surface_write_to_png(surface, file.c_str()) : CAIRO_STATUS_NO_MEMORY;
    cairo_destroy(context);
    cairo_surface_destroy(surface);
    return status == CAIRO_STATUS_SUCCESS ? "" : cairo_status_to_string(status);
}

#else

std::string writePng(const std::string& /* svg */, const std::string& /* file */) {
    return "this program was built without librsvg, so it writes no PNG; make it an SVG";
}

#endif
