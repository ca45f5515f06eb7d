// SPDX-License-Identifier: MIT
#pragma once

#include <gtk/gtk.h>

namespace Varnel::GTK3 {

/// Lets the texts of a dialog break within words, which names of files are, however long: the
/// dialog would be wider than the screen. No hyphen stands there that is not in the name.
inline void breakLongWords(GtkMessageDialog* dialog) {
  const auto breakWords = [](GtkWidget* label, gpointer) {
    gtk_label_set_line_wrap_mode(GTK_LABEL(label), PANGO_WRAP_WORD_CHAR);
    PangoAttrList* present = gtk_label_get_attributes(GTK_LABEL(label));
    PangoAttrList* attributes = present ? pango_attr_list_copy(present) : pango_attr_list_new();
    pango_attr_list_insert(attributes, pango_attr_insert_hyphens_new(FALSE));
    gtk_label_set_attributes(GTK_LABEL(label), attributes);
    pango_attr_list_unref(attributes);
  };
  gtk_container_foreach(GTK_CONTAINER(gtk_message_dialog_get_message_area(dialog)), breakWords,
                        nullptr);
}

}  // namespace Varnel::GTK3
