gSpace = 6;
label_column = 150;
swatch_width = 48;
PPreferenceDialog(view_id: 'Project/Dialog/PreferenceDialog',
                  window_title: '$$$/Archway/PreferenceDialog/Title=Preferences', margin: 14,
                  spacing: 10, child_horizontal: align_fill) {
  text_font = kFont_UIMedium;
  control_font = kFont_UIMedium;
  CFramePane(frame_title: '$$$/Archway/PreferenceDialog/ConstraintText=Constraint Colors',
             margin: 10, margin_top: 24, child_horizontal: align_left) {
    CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
      CStaticText(label_width: label_column,
                  text: '$$$/Archway/PreferenceDialog/OrdinaryConstraintColorText=Unfixed Orientation:');
      PColorButton(view_id: 'Project/PreferenceDialog/OrdinaryConstraintColorButton',
                   width: swatch_width, height: 20);
    }
    CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
      CStaticText(label_width: label_column,
                  text: '$$$/Archway/PreferenceDialog/HorizontalConstraintColorText=Horizontal:');
      PColorButton(view_id: 'Project/PreferenceDialog/HorizontalConstraintColorButton',
                   width: swatch_width, height: 20);
    }
    CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
      CStaticText(label_width: label_column,
                  text: '$$$/Archway/PreferenceDialog/VerticalConstraintColorText=Vertical:');
      PColorButton(view_id: 'Project/PreferenceDialog/VerticalConstraintColorButton',
                   width: swatch_width, height: 20);
    }
    CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
      CStaticText(label_width: label_column,
                  text: '$$$/Archway/PreferenceDialog/FixedConstraintColorText=Fixed Orientation:');
      PColorButton(view_id: 'Project/PreferenceDialog/FixedConstraintColorButton',
                   width: swatch_width, height: 20);
    }
    CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
      CStaticText(label_width: label_column,
                  text: '$$$/Archway/PreferenceDialog/InvalidConstraintColorText=Invalid:');
      PColorButton(view_id: 'Project/PreferenceDialog/InvalidConstraintColorButton',
                   width: swatch_width, height: 20);
    }
  }
  CFramePane(frame_title: '$$$/Archway/PreferenceDialog/MeshText=Mesh', margin: 10,
             margin_top: 24, child_horizontal: align_left) {
    CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
      CStaticText(label_width: label_column,
                  text: '$$$/Archway/PreferenceDialog/MeshColorText=Mesh Color:');
      PColorButton(view_id: 'Project/PreferenceDialog/MeshColorButton', width: swatch_width,
                   height: 20);
    }
  }
  CFramePane(frame_title: '$$$/Archway/PreferenceDialog/FloatingLoupeText=Floating Loupe',
             margin: 10, margin_top: 24, spacing: 8, child_horizontal: align_left) {
    CCheckButton(view_id: 'Project/PreferenceDialog/ShowLoupeCheck',
                 button_label: '$$$/Archway/PreferenceDialog/ShowLoupeLabel=Show loupe when dragging');
    CEditSlider(view_id: 'Project/PreferenceDialog/LoupeSizeSlider', label_width: 90,
                text_width: 64, button_label: '$$$/Archway/PreferenceDialog/LoupeSizeText=Loupe Size',
                number_value: 140, number_minimum: 100, number_maximum: 300, text_digits: 5,
                minor_increment: 1, major_increment: 10, decimal_digits: 0);
  }
  CFrameInsert(placement: place_row, spacing: 10, horizontal: align_right,
               view_binding: kBind_FixedBottomRight) {
    CPushButton(view_id: 'Project/PreferenceDialog/CancelButton', width: 90, cancel_button: true,
                button_label: '$$$/Archway/PreferenceDialog/CancelButton=Cancel');
    CPushButton(view_id: 'Project/PreferenceDialog/OkButton', width: 90, default_button: true,
                button_label: '$$$/Archway/PreferenceDialog/OkButton=OK');
  }
}
