// A container that lays out its child at the size of a page, whatever its own size, and shows it scaled.
#include "desktop/window/webkit/ScaledBin.h"

#include "desktop/window/shared/PageGeometry.h"

struct TelixScaledBin {
    GtkBin parent;
    GdkWindow* offscreen;
};

struct TelixScaledBinClass {
    GtkBinClass parent;
};

G_DEFINE_TYPE(TelixScaledBin, telix_scaled_bin, GTK_TYPE_BIN)

namespace desktop {

namespace {

TelixScaledBin* self(void* widget) {
    return reinterpret_cast<TelixScaledBin*>(widget);
}

// The scale from the child to the container.
double scaleX(GtkWidget* widget) {
    return static_cast<double>(gtk_widget_get_allocated_width(widget)) / kPageWidth;
}

double scaleY(GtkWidget* widget) {
    return static_cast<double>(gtk_widget_get_allocated_height(widget)) / kPageHeight;
}

GdkWindow* onPickChild(GdkWindow*, double, double, gpointer widget) {
    GtkWidget* child = gtk_bin_get_child(GTK_BIN(widget));
    return child && gtk_widget_get_visible(child) ? self(widget)->offscreen : nullptr;
}

void onToEmbedder(GdkWindow*, double x, double y, double* embedderX, double* embedderY, gpointer widget) {
    *embedderX = x * scaleX(GTK_WIDGET(widget));
    *embedderY = y * scaleY(GTK_WIDGET(widget));
}

void onFromEmbedder(GdkWindow*, double embedderX, double embedderY, double* x, double* y, gpointer widget) {
    *x = embedderX / scaleX(GTK_WIDGET(widget));
    *y = embedderY / scaleY(GTK_WIDGET(widget));
}

// A window of the container that is transparent where nothing is drawn.
GdkWindow* newWindow(GtkWidget* widget, GdkWindow* parent, GdkWindowType type, const GtkAllocation& area) {
    GdkWindowAttr attributes{};
    attributes.x = area.x;
    attributes.y = area.y;
    attributes.width = area.width;
    attributes.height = area.height;
    attributes.window_type = type;
    attributes.wclass = GDK_INPUT_OUTPUT;
    attributes.event_mask = gtk_widget_get_events(widget) | GDK_EXPOSURE_MASK | GDK_POINTER_MOTION_MASK |
                            GDK_BUTTON_PRESS_MASK | GDK_BUTTON_RELEASE_MASK | GDK_SCROLL_MASK |
                            GDK_SMOOTH_SCROLL_MASK | GDK_ENTER_NOTIFY_MASK | GDK_LEAVE_NOTIFY_MASK;
    GdkVisual* transparent = gdk_screen_get_rgba_visual(gtk_widget_get_screen(widget));
    const bool isOffscreen = type == GDK_WINDOW_OFFSCREEN;
    attributes.visual = isOffscreen && transparent ? transparent : gtk_widget_get_visual(widget);
    GdkWindow* window = gdk_window_new(parent, &attributes, GDK_WA_X | GDK_WA_Y | GDK_WA_VISUAL);
    gdk_window_set_user_data(window, widget);
    const GdkRGBA nothing{0, 0, 0, 0};
    G_GNUC_BEGIN_IGNORE_DEPRECATIONS
    gdk_window_set_background_rgba(window, &nothing);
    G_GNUC_END_IGNORE_DEPRECATIONS
    return window;
}

void realize(GtkWidget* widget) {
    gtk_widget_set_realized(widget, TRUE);
    GtkAllocation area;
    gtk_widget_get_allocation(widget, &area);
    GdkWindow* window = newWindow(widget, gtk_widget_get_parent_window(widget), GDK_WINDOW_CHILD, area);
    gtk_widget_set_window(widget, window);
    g_signal_connect(window, "pick-embedded-child", G_CALLBACK(onPickChild), widget);

    GdkWindow* root = gdk_screen_get_root_window(gtk_widget_get_screen(widget));
    GdkWindow* offscreen = newWindow(widget, root, GDK_WINDOW_OFFSCREEN, {0, 0, kPageWidth, kPageHeight});
    self(widget)->offscreen = offscreen;
    if (GtkWidget* child = gtk_bin_get_child(GTK_BIN(widget))) {
        gtk_widget_set_parent_window(child, offscreen);
    }
    gdk_offscreen_window_set_embedder(offscreen, window);
    g_signal_connect(offscreen, "to-embedder", G_CALLBACK(onToEmbedder), widget);
    g_signal_connect(offscreen, "from-embedder", G_CALLBACK(onFromEmbedder), widget);
    gdk_window_show(offscreen);
}

void unrealize(GtkWidget* widget) {
    GdkWindow* offscreen = self(widget)->offscreen;
    self(widget)->offscreen = nullptr;
    // Unrealizes the child, whose window is in the offscreen window.
    GTK_WIDGET_CLASS(telix_scaled_bin_parent_class)->unrealize(widget);
    gdk_window_set_user_data(offscreen, nullptr);
    gdk_window_destroy(offscreen);
}

void getPreferredSize(GtkWidget*, int* minimum, int* natural) {
    *minimum = 0;
    *natural = 0;
}

void sizeAllocate(GtkWidget* widget, GtkAllocation* area) {
    gtk_widget_set_allocation(widget, area);
    if (gtk_widget_get_realized(widget)) {
        gdk_window_move_resize(gtk_widget_get_window(widget), area->x, area->y, area->width, area->height);
        gdk_window_geometry_changed(self(widget)->offscreen);
    }
    GtkWidget* child = gtk_bin_get_child(GTK_BIN(widget));
    if (child && gtk_widget_get_visible(child)) {
        GtkAllocation page{0, 0, kPageWidth, kPageHeight};
        gtk_widget_size_allocate(child, &page);
    }
}

void addChild(GtkContainer* container, GtkWidget* child) {
    if (self(container)->offscreen) {
        gtk_widget_set_parent_window(child, self(container)->offscreen);
    }
    GTK_CONTAINER_CLASS(telix_scaled_bin_parent_class)->add(container, child);
}

gboolean draw(GtkWidget* widget, cairo_t* context) {
    GdkWindow* offscreen = self(widget)->offscreen;
    const bool isOwn = gtk_cairo_should_draw_window(context, gtk_widget_get_window(widget));
    if (isOwn) {
        cairo_save(context);
        cairo_scale(context, scaleX(widget), scaleY(widget));
        cairo_set_source_surface(context, gdk_offscreen_window_get_surface(offscreen), 0, 0);
        // Without it the edges would mix with what lies outside.
        cairo_pattern_set_extend(cairo_get_source(context), CAIRO_EXTEND_PAD);
        cairo_rectangle(context, 0, 0, kPageWidth, kPageHeight);
        cairo_fill(context);
        cairo_restore(context);
    }
    // A drawing of all windows has drawn the child already.
    if (!isOwn && gtk_cairo_should_draw_window(context, offscreen)) {
        if (GtkWidget* child = gtk_bin_get_child(GTK_BIN(widget))) {
            gtk_container_propagate_draw(GTK_CONTAINER(widget), child, context);
        }
    }
    return FALSE;
}

// The child has drawn something.
gboolean onDamage(GtkWidget* widget, GdkEventExpose* event) {
    const double x = scaleX(widget);
    const double y = scaleY(widget);
    const GdkRectangle& area = event->area;
    // One pixel more on each side for the smoothing.
    const int left = static_cast<int>(area.x * x) - 1;
    const int top = static_cast<int>(area.y * y) - 1;
    const GdkRectangle shown{left, top, static_cast<int>((area.x + area.width) * x) + 2 - left,
                             static_cast<int>((area.y + area.height) * y) + 2 - top};
    gdk_window_invalidate_rect(gtk_widget_get_window(widget), &shown, FALSE);
    return TRUE;
}

} // namespace

GtkWidget* newScaledBin() {
    return GTK_WIDGET(g_object_new(telix_scaled_bin_get_type(), nullptr));
}

} // namespace desktop

static void telix_scaled_bin_init(TelixScaledBin* bin) {
    gtk_widget_set_has_window(GTK_WIDGET(bin), TRUE);
}

static void telix_scaled_bin_class_init(TelixScaledBinClass* type) {
    auto* widget = reinterpret_cast<GtkWidgetClass*>(type);
    widget->realize = desktop::realize;
    widget->unrealize = desktop::unrealize;
    widget->get_preferred_width = desktop::getPreferredSize;
    widget->get_preferred_height = desktop::getPreferredSize;
    widget->size_allocate = desktop::sizeAllocate;
    widget->draw = desktop::draw;
    reinterpret_cast<GtkContainerClass*>(type)->add = desktop::addChild;
    // GDK emits it for the embedder of an offscreen window; the class has no slot of this type for it.
    g_signal_override_class_closure(g_signal_lookup("damage-event", GTK_TYPE_WIDGET),
                                    telix_scaled_bin_get_type(),
                                    g_cclosure_new(G_CALLBACK(desktop::onDamage), nullptr, nullptr));
}
