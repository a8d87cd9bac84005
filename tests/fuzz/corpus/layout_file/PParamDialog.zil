gSpace = 6;
label_column = 170;
PParamDialog(view_id: 'Project/Dialog/ParamDialog',
             window_title: '$$$/private/Archway/ParamDialog/Title=Experimental Parameters',
             margin: 14, spacing: 6, child_horizontal: align_left) {
  text_font = kFont_UIMedium;
  control_font = kFont_UIMedium;
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/IterationNumberText=Iterations:');
    CEditNumber(view_id: 'Project/ParamDialog/IterationNumber', number_value: 8, number_minimum: 1, number_maximum: 10, decimal_digits: 0);
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/CacheDSSPermutationLabel=Permutation:');
    CCheckButton(view_id: 'Project/ParamDialog/CacheDSSPermutation', button_label: '$$$/private/Archway/ParamDialog/CacheDSSPermutatioinText=Cache DSS Permutation');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/MatrixSolveText=Matrix Solve:');
    CCheckButton(view_id: 'Project/ParamDialog/UseDebugSolve', button_label: '$$$/private/Archway/ParamDialog/UseDebugSolveText=Use Debug Solve');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/MeshResolutionText=Mesh Resolution:');
    CEditNumber(view_id: 'Project/ParamDialog/MeshResolution', number_value: 6, number_minimum: 1, number_maximum: 9, decimal_digits: 0);
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/BorderExpandText=Border Expansion:');
    CEditNumber(view_id: 'Project/ParamDialog/BorderExpand', number_value: 5, number_minimum: 1, number_maximum: 20, decimal_digits: 0, decimal_number: false, major_increment: 10);
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/MeshShowEdgeOnlyText=Mesh Show Edge Only:');
    CStaticText(text: '$$$/private/Archway/ParamDialog/SetInPreferencesText=(Set in Preferences)');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/MeshTriangleText=Mesh Cells:');
    CCheckButton(view_id: 'Project/ParamDialog/MeshUseTriangle', button_label: '$$$/private/Archway/ParamDialog/MeshUseTriangleText=Use Triangles');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/MeshRotateText=Mesh Rotate:');
    CCheckButton(view_id: 'Project/ParamDialog/AutoRotate', button_label: '$$$/private/Archway/ParamDialog/AutoRotateText=Auto');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/DParamialog/RegularizerProjectionModelText=Regularizer Model:');
    CRadioPopup(view_id: 'Project/ParamDialog/RegularizerProjectionModelPopup', width: 150, radio_items: '$$$/private/Archway/ParamDialog/Regularizer/Stereographic=Stereographic|$$$/private/Archway/ParamDialog/Regularizer/Mercator=Mercator|$$$/private/Archway/ParamDialog/Regularizer/Panini=Panini|$$$/private/Archway/ParamDialog/Regularizer/Equirectangular=Equirectangular|$$$/private/Archway/ParamDialog/Regularizer/Auto=Auto');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/SolverText=Solver:');
    CCheckButton(view_id: 'Project/ParamDialog/GaussNewtonSolver', button_label: '$$$/private/Archway/ParamDialog/GaussNewtonSolverText=Gauss-Newton');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '');
    CCheckButton(view_id: 'Project/ParamDialog/PardisoSolver', button_label: '$$$/private/Archway/ParamDialog/PardisoSolverText=Pardiso');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/RenderingText=Rendering:');
    CCheckButton(view_id: 'Project/ParamDialog/TextureRendering', button_label: '$$$/private/Archway/ParamDialog/TextureRenderingText=Texture Rendering');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/RegularWeightText=Regular Weight:');
    CEditNumber(view_id: 'Project/ParamDialog/RegularWeight', number_value: 1, number_minimum: 0, number_maximum: 1, decimal_digits: 7, decimal_number: true, width: 110);
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '');
    CCheckButton(view_id: 'Project/ParamDialog/RegWeightApplyTo', button_label: '$$$/private/Archway/ParamDialog/RegWeightApplyToText=Border/Invalid only');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/LineWeightText=Line Weight:');
    CEditNumber(view_id: 'Project/ParamDialog/LineWeight', number_value: 10, number_minimum: 0, number_maximum: 100, decimal_digits: 3, decimal_number: true);
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/CentralRegularWeightText=Central Regular Weight:');
    CCheckButton(view_id: 'Project/ParamDialog/HighCenterWeight', button_label: '$$$/private/Archway/ParamDialog/HighCenterWeightText=Use Heavier Weight');
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/ConformalWeightText=Conformal Weight:');
    CEditNumber(view_id: 'Project/ParamDialog/ConformalWeight', number_value: 1, number_minimum: 0, number_maximum: 5, decimal_digits: 3, decimal_number: true);
  }
  CFrameInsert(placement: place_row, spacing: 8, child_vertical: align_center) {
    CStaticText(label_width: label_column, text: '$$$/private/Archway/ParamDialog/SmoothnessWeightText=Smoothness Weight:');
    CEditNumber(view_id: 'Project/ParamDialog/SmoothnessWeight', number_value: 3, number_minimum: 0, number_maximum: 5, decimal_digits: 3, decimal_number: true);
  }
  CFrameInsert(placement: place_row, spacing: 10, horizontal: align_right, margin_top: 8,
               view_binding: kBind_FixedBottomRight) {
    CPushButton(view_id: 'Project/ParamDialog/CancelButton', width: 90, cancel_button: true,
                button_label: '$$$/private/Archway/ParamDialog/CancelButton=Cancel');
    CPushButton(view_id: 'Project/ParamDialog/OkButton', width: 90, default_button: true,
                button_label: '$$$/private/Archway/ParamDialog/OkButton=OK');
  }
}
