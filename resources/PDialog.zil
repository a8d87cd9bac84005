gSpace = 8;
tool_size = 30;
option_width = 300;
slider_label = 90;
slider_field = 84;
PDialog(view_id: 'Project/Dialog', window_title: '$$$/Archway/Dialog/Title=Archway (^0 @ ^1%)',
        placement: place_row, margin: 10, spacing: 10, child_vertical: align_fill) {
  text_font = kFont_UIMedium;
  label_font = kFont_UIMedium;
  bold_label_font = kFont_UIMediumBold;
  control_font = kFont_UIMedium;
  push_button_font = kFont_UIMedium;
  CFramePane(view_id: 'Project/Dialog/Toolbar', margin: 4, spacing: 12,
             view_binding: kBind_FixedTopLeft, vertical: align_top) {
    gSpace = 2;
    CToolGrid(view_id: 'Project/Dialog/ToolGrid1', cell_count_x: 1, cell_count_y: 3) {
      CToolButton(view_id: 'Project/Tool/ManageConstraint', width: tool_size, height: tool_size,
                  view_tip: '$$$/Archway/Tool/Tip/ManageConstraint=Constraint Tool (C)');
      CToolButton(view_id: 'Project/Tool/PlaneTool', width: tool_size, height: tool_size,
                  view_tip: '$$$/Archway/Tool/Tip/PlaneTool=Polygon Tool (Y)');
      CToolButton(view_id: 'Project/Tool/MoveImage', width: tool_size, height: tool_size,
                  view_tip: '$$$/Archway/Tool/Tip/MoveImage=Move Tool (M)');
    }
    CToolGrid(view_id: 'Project/Dialog/ToolGrid2', cell_count_x: 1, cell_count_y: 2) {
      CToolButton(view_id: 'Project/Tool/Hand', width: tool_size, height: tool_size,
                  view_tip: '$$$/Archway/Tool/Tip/Hand=Hand Tool (H)');
      CToolButton(view_id: 'Project/Tool/Zoom', width: tool_size, height: tool_size,
                  view_tip: '$$$/Archway/Tool/Tip/Zoom=Zoom Tool (Z)');
    }
  }
  CFrameInsert(view_binding: kBind_Sizeable, child_horizontal: align_fill,
               child_vertical: align_top) {
    CStaticText(view_id: 'Project/Dialog/Tooltip', height: 20, text_trim: kTrim_End,
                text: '$$$/Archway/Dialog/DefaultTooltip=Place mouse over control for help',
                view_binding: kBind_SizeTop);
    PPreviewScroller(view_id: 'Project/Dialog/PreviewScroller', vertical: align_fill,
                     scroller_attributes: kScroller_XBar + kScroller_YBar + kScroller_WellFrame,
                     scroller_gap_left: kZoomCombo_DefaultWidth, view_binding: kBind_Sizeable,
                     margin: 1, spacing: 1, child_horizontal: align_fill) {
      PPreviewPane(view_id: 'Project/Dialog/PreviewPane', width: 560, height: 420,
                   vertical: align_fill, zoom_min: '0.001', zoom_max: '16.000',
                   fit_in_view_cushion: 3, view_binding: kBind_Sizeable);
      CZoomProgressCombo(view_id: 'Project/Dialog/ZoomCombo', horizontal: align_left,
                         vertical: align_bottom,
                         width: kZoomCombo_DefaultWidth, height: 18,
                         frame_interior: kInterior_ScrollerGapLeft,
                         view_binding: kBind_FixedBottomLeft);
    }
    CFrameInsert(placement: place_row, spacing: 16, view_binding: kBind_SizeBottom) {
      CStaticText(view_id: 'Project/Dialog/CameraEXIFInfo', width: 300, text_trim: kTrim_Middle,
                  text: '$$$/Archway/Dialog/CameraEXIFInfo=Camera Model: ^0 (^1)',
                  view_binding: kBind_FixedBottomLeft);
      CStaticText(view_id: 'Project/Dialog/LensEXIFInfo', width: 300,
                  text: '$$$/Archway/Dialog/LensEXIFInfo=Lens Model: ^0',
                  view_binding: kBind_FixedBottomLeft);
    }
  }
  CFrameInsert(view_binding: kBind_FixedRight + kBind_YSizeable, child_horizontal: align_fill,
               child_vertical: align_top, width: option_width) {
    CPushButton(view_id: 'Project/Dialog/OKButton', width: 160, horizontal: align_center,
                button_label: '$$$/Archway/Dialog/OKButton=OK', default_button: true,
                view_help: '$$$/Archway/Dialog/Help/OKButton=Commit changes and return to Quillmark.',
                view_binding: kBind_FixedTopRight);
    CPushButton(view_id: 'Project/Dialog/CancelButton', width: 160, horizontal: align_center,
                button_label: '$$$/Archway/Dialog/CancelButton=Cancel', cancel_button: true,
                view_help: '$$$/Archway/Dialog/Help/CancelButtonWin=Close the dialog without making any changes, or reset dialog with holding Alt.',
                view_binding: kBind_FixedTopRight);
    CFrameInsert(spacing: 2, child_horizontal: align_left, view_binding: kBind_FixedTopRight) {
      CCheckButton(view_id: 'Project/Dialog/PreviewResultCheck',
                   button_label: '$$$/Archway/Dialog/PreviewResultCheck=&Preview',
                   view_tip: '$$$/Archway/Dialog/Tip/PreviewResultCheck=Show original or corrected image',
                   view_help: '$$$/Archway/Dialog/Help/PreviewResultCheck=Check to preview the result.');
      CCheckButton(view_id: 'Project/Dialog/ShowConstraintsCheck',
                   button_label: '$$$/Archway/Dialog/ShowConstraintsCheck=Sho&w Constraints',
                   view_tip: '$$$/Archway/Dialog/Tip/ShowConstraintsCheck=Show/hide constraints',
                   view_help: '$$$/Archway/Dialog/Help/ShowConstraintsCheck=Check to show constraints.');
      CCheckButton(view_id: 'Project/Dialog/ShowMeshCheck',
                   button_label: '$$$/Archway/Dialog/ShowMeshCheck=Show M&esh',
                   view_tip: '$$$/Archway/Dialog/Tip/ShowMeshCheck=Show/hide mesh',
                   view_help: '$$$/Archway/Dialog/Help/ShowMeshCheck=Check to show the mesh.');
    }
    CFramePane(view_id: 'Project/Dialog/CorrectionOptionPane', margin: 8, spacing: 11,
               child_horizontal: align_fill, view_binding: kBind_FixedTopRight) {
      CFrameInsert(placement: place_row, spacing: 6, child_vertical: align_center) {
        CStaticText(label_width: slider_label, text_align: kAlign_Right,
                    text: '$$$/Archway/Dialog/CorrectionOptionsText=Correc&tion: ');
        CRadioPopup(view_id: 'Project/Dialog/ProjectionModelPopup', width: 100,
                    radio_items: '$$$/Archway/TypeProjectionModel/Fisheye=Fisheye|$$$/Archway/TypeProjectionModel/Perspective=Perspective|$$$/Archway/TypeProjectionModel/Auto=Auto|$$$/Archway/TypeProjectionModel/FullSpherical=Full Spherical',
                    view_tip: '$$$/Archway/Dialog/Tip/ProjectionModelPopup=Select projection model',
                    view_help: '$$$/Archway/Dialog/Help/ProjectionModelPopup=Select projection model.');
        CFlyoutPopup(view_id: 'Project/Dialog/CorrectionFlyout', width: 22, height: 22,
                     view_help: '$$$/Archway/CorrectionFlyoutHelp/Message=Manage preferences or load/save constraints.');
      }
      CEditSlider(view_id: 'Project/Dialog/ImageScaleSlider', label_width: slider_label,
                  text_width: slider_field,
                  button_label: '$$$/Archway/Dialog/ImageScaleText=&Scale',
                  unit_text: '$$$/Archway/Dialog/ImageScaleUnitText=%', number_value: 100,
                  number_minimum: 50, number_maximum: 150, slider_positions: 201,
                  minor_increment: 1, major_increment: 10, text_digits: 6,
                  view_tip: '$$$/Archway/Dialog/Tip/ImageScaleSlider=Specify image scale',
                  view_help: '$$$/Archway/Dialog/Help/ImageScaleSlider=Scale image after correction.');
      CFramePane(view_id: 'Project/Dialog/FocalLengthPane', frame_style: frame_none,
                 child_horizontal: align_fill) {
        CEditSlider(view_id: 'Project/Dialog/FocalLengthSlider', label_width: slider_label,
                    text_width: slider_field,
                    button_label: '$$$/Archway/Dialog/FocalLengthText=&Focal Length',
                    unit_text: '$$$/Archway/Dialog/FocalLengthUnitText=mm', decimal_number: true,
                    decimal_digits: 2, slider_positions: 201, number_value: 10,
                    number_minimum: 1, number_maximum: 100, major_increment: '01.00',
                    minor_increment: '00.10',
                    view_tip: '$$$/Archway/Dialog/Tip/FocalLengthSlider=Specify focal length',
                    view_help: '$$$/Archway/Dialog/Help/FocalLengthSlider=Specify focal length.');
      }
      CFramePane(view_id: 'Project/Dialog/CropFactorPane', frame_style: frame_none,
                 child_horizontal: align_fill) {
        CEditSlider(view_id: 'Project/Dialog/CropFactorSlider', label_width: slider_label,
                    text_width: slider_field,
                    button_label: '$$$/Archway/Dialog/CropFactorText=C&rop Factor',
                    decimal_number: true, decimal_digits: 2, slider_positions: 201,
                    number_value: 1, number_minimum: 0, number_maximum: 10,
                    major_increment: '01.00', minor_increment: '00.10',
                    view_tip: '$$$/Archway/Dialog/Tip/CropFactorSlider=Specify crop factor',
                    view_help: '$$$/Archway/Dialog/Help/CropFactorSlider=Specify crop factor.');
      }
      CCheckButton(view_id: 'Project/Dialog/AsShotCheck', horizontal: align_left,
                   left_offset: slider_label,
                   button_label: '$$$/Archway/Dialog/AsShotCheck=&As Shot',
                   view_tip: '$$$/Archway/Dialog/Tip/AsShotCheck=Apply metadata',
                   view_help: '$$$/Archway/Dialog/Help/AsShotCheck=Apply the focal length and crop factor from metadata.');
    }
    CFramePane(view_id: 'Project/Dialog/LoupePane', frame_title: '$$$/Archway/Dialog/LoupeText=Detail',
               margin: 8, margin_top: 22, vertical: align_top, child_horizontal: align_fill,
               view_binding: kBind_FixedTopRight) {
      PDetailedPreviewPane(view_id: 'Project/Dialog/DetailedPreviewPane', height: 200,
                           view_binding: kBind_FixedTopRight);
    }
    CFramePane(view_id: 'Project/Dialog/SolverInfoPane', placement: place_row, margin: 6,
               spacing: 6, child_vertical: align_center, vertical: align_bottom,
               view_invisible: true, view_binding: kBind_FixedBottomRight) {
      CStaticImage(width: 14, height: 14, icon: 'SolverFailureIcon');
      CStaticText(view_id: 'Project/Dialog/SolverInfoText', width: 160,
                  text: '$$$/Archway/Warning/SolveFailed=Solve failed');
    }
  }
}
