#include "DrawingSkeleton.h"

namespace zvdb {

// The smallest drawing that CAD programs open: the standard tables, model and paper space
// with their layouts, and the dictionaries that R2000 and later require.
std::string DrawingSkeleton::text() {
    static const char* const kTags[] = {
        "0\nSECTION\n2\nHEADER\n9\n$ACADVER\n1\nAC1027\n9\n$ACADMAINTVER\n70\n105\n9\n$"
        "DWGCODEPAGE\n3\nANSI_1252\n",
        "9\n$INSBASE\n10\n0.0\n20\n0.0\n30\n0.0\n9\n$EXTMIN\n10\n0.0\n20\n0.0\n30\n0.0\n",
        "9\n$EXTMAX\n10\n0.0\n20\n0.0\n30\n0.0\n9\n$LTSCALE\n40\n1.0\n9\n$TEXTSIZE\n40\n2.5\n",
        "9\n$CLAYER\n8\n0\n9\n$CELTYPE\n6\nByLayer\n9\n$CECOLOR\n62\n256\n9\n$"
        "TEXTSTYLE\n7\nStandard\n",
        "9\n$DIMSTYLE\n2\nStandard\n9\n$INSUNITS\n70\n6\n9\n$MEASUREMENT\n70\n1\n9\n$"
        "HANDSEED\n5\n30\n",
        "0\nENDSEC\n0\nSECTION\n2\nCLASSES\n0\nCLASS\n1\nACDBDICTIONARYWDFLT\n2\nAcDbDictionaryWith"
        "Default\n3\nObjectDBX Classes\n90\n0\n",
        "91\n0\n280\n0\n281\n0\n0\nCLASS\n1\nACDBPLACEHOLDER\n2\nAcDbPlaceHolder\n3\nObjectDBX "
        "Classes\n90\n0\n",
        "91\n0\n280\n0\n281\n0\n0\nCLASS\n1\nLAYOUT\n2\nAcDbLayout\n3\nObjectDBX Classes\n90\n0\n",
        "91\n0\n280\n0\n281\n0\n0\nENDSEC\n0\nSECTION\n2\nTABLES\n0\nTABLE\n2\nVPORT\n",
        "5\n8\n330\n0\n100\nAcDbSymbolTable\n70\n1\n0\nVPORT\n5\n29\n330\n8\n100\nAcDbSymbolTableRe"
        "cord\n",
        "100\nAcDbViewportTableRecord\n2\n*Active\n70\n0\n10\n0.0\n20\n0.0\n11\n1.0\n21\n1."
        "0\n12\n0.0\n",
        "22\n0.0\n13\n0.0\n23\n0.0\n14\n10.0\n24\n10.0\n15\n10.0\n25\n10.0\n16\n0.0\n",
        "26\n0.0\n36\n1.0\n17\n0.0\n27\n0.0\n37\n0.0\n40\n100.0\n41\n1.5\n42\n50.0\n",
        "43\n0.0\n44\n0.0\n50\n0.0\n51\n0.0\n71\n0\n72\n1000\n73\n1\n74\n3\n",
        "75\n0\n76\n0\n77\n0\n78\n0\n281\n0\n65\n1\n110\n0.0\n120\n0.0\n",
        "130\n0.0\n111\n1.0\n121\n0.0\n131\n0.0\n112\n0.0\n122\n1.0\n132\n0.0\n79\n0\n",
        "146\n0.0\n0\nENDTAB\n0\nTABLE\n2\nLTYPE\n5\n5\n330\n0\n100\nAcDbSymbolTable\n70\n3\n",
        "0\nLTYPE\n5\n14\n330\n5\n100\nAcDbSymbolTableRecord\n100\nAcDbLinetypeTableRecord\n2\nByBl"
        "ock\n70\n0\n3\n\n",
        "72\n65\n73\n0\n40\n0."
        "0\n0\nLTYPE\n5\n15\n330\n5\n100\nAcDbSymbolTableRecord\n100\nAcDbLinetypeTableRecord\n",
        "2\nByLayer\n70\n0\n3\n\n72\n65\n73\n0\n40\n0.0\n0\nLTYPE\n5\n16\n",
        "330\n5\n100\nAcDbSymbolTableRecord\n100\nAcDbLinetypeTableRecord\n2\nContinuous\n70\n0\n3"
        "\nSolid line\n72\n65\n73\n0\n",
        "40\n0.0\n0\nENDTAB\n0\nTABLE\n2\nLAYER\n5\n2\n330\n0\n100\nAcDbSymbolTable\n70\n1\n",
        "0\nLAYER\n5\n10\n330\n2\n100\nAcDbSymbolTableRecord\n100\nAcDbLayerTableRecord\n2\n0\n70\n"
        "0\n62\n7\n",
        "6\nContinuous\n370\n-3\n390\nF\n0\nENDTAB\n0\nTABLE\n2\nSTYLE\n5\n3\n330\n0\n",
        "100\nAcDbSymbolTable\n70\n1\n0\nSTYLE\n5\n11\n330\n3\n100\nAcDbSymbolTableRecord\n100\nAcD"
        "bTextStyleTableRecord\n2\nStandard\n",
        "70\n0\n40\n0.0\n41\n1.0\n50\n0.0\n71\n0\n42\n2.5\n3\ntxt\n4\n\n",
        "0\nENDTAB\n0\nTABLE\n2\nVIEW\n5\n6\n330\n0\n100\nAcDbSymbolTable\n70\n0\n0\nENDTAB\n",
        "0\nTABLE\n2\nUCS\n5\n7\n330\n0\n100\nAcDbSymbolTable\n70\n0\n0\nENDTAB\n0\nTABLE\n",
        "2\nAPPID\n5\n9\n330\n0\n100\nAcDbSymbolTable\n70\n1\n0\nAPPID\n5\n12\n330\n9\n",
        "100\nAcDbSymbolTableRecord\n100\nAcDbRegAppTableRecord\n2\nACAD\n70\n0\n0\nENDTAB\n0\nTABL"
        "E\n2\nDIMSTYLE\n5\nA\n",
        "330\n0\n100\nAcDbSymbolTable\n70\n1\n100\nAcDbDimStyleTable\n71\n0\n0\nDIMSTYLE\n105\n27\n"
        "330\nA\n",
        "100\nAcDbSymbolTableRecord\n100\nAcDbDimStyleTableRecord\n2\nStandard\n70\n0\n0\nENDTAB\n0"
        "\nTABLE\n2\nBLOCK_RECORD\n5\n1\n",
        "330\n0\n100\nAcDbSymbolTable\n70\n2\n0\nBLOCK_"
        "RECORD\n5\n1F\n330\n1\n100\nAcDbSymbolTableRecord\n100\nAcDbBlockTableRecord\n",
        "2\n*Model_Space\n70\n0\n340\n22\n280\n1\n281\n0\n0\nBLOCK_RECORD\n5\n1B\n330\n1\n",
        "100\nAcDbSymbolTableRecord\n100\nAcDbBlockTableRecord\n2\n*Paper_"
        "Space\n70\n0\n340\n1E\n280\n1\n281\n0\n0\nENDTAB\n",
        "0\nENDSEC\n0\nSECTION\n2\nBLOCKS\n0\nBLOCK\n5\n20\n330\n1F\n100\nAcDbEntity\n8\n0\n",
        "100\nAcDbBlockBegin\n2\n*Model_Space\n70\n0\n10\n0.0\n20\n0.0\n30\n0.0\n3\n*Model_"
        "Space\n1\n\n",
        "0\nENDBLK\n5\n21\n330\n1F\n100\nAcDbEntity\n8\n0\n100\nAcDbBlockEnd\n0\nBLOCK\n5\n1C\n",
        "330\n1B\n100\nAcDbEntity\n67\n1\n8\n0\n100\nAcDbBlockBegin\n2\n*Paper_Space\n70\n0\n10\n0."
        "0\n",
        "20\n0.0\n30\n0.0\n3\n*Paper_Space\n1\n\n0\nENDBLK\n5\n1D\n330\n1B\n100\nAcDbEntity\n",
        "67\n1\n8\n0\n100\nAcDbBlockEnd\n0\nENDSEC\n0\nSECTION\n2\nENTITIES\n0\nENDSEC\n0\nSECTION"
        "\n",
        "2\nOBJECTS\n0\nDICTIONARY\n5\nC\n330\n0\n100\nAcDbDictionary\n281\n1\n3\nACAD_"
        "GROUP\n350\nD\n",
        "3\nACAD_LAYOUT\n350\n1A\n3\nACAD_MLINESTYLE\n350\n17\n3\nACAD_"
        "PLOTSETTINGS\n350\n19\n3\nACAD_PLOTSTYLENAME\n350\nE\n",
        "0\nDICTIONARY\n5\nD\n330\nC\n100\nAcDbDictionary\n281\n1\n0\nDICTIONARY\n5\n1A\n330\nC\n",
        "100\nAcDbDictionary\n281\n1\n3\nLayout1\n350\n1E\n3\nModel\n350\n22\n0\nDICTIONARY\n5\n17"
        "\n",
        "330\nC\n100\nAcDbDictionary\n281\n1\n3\nStandard\n350\n18\n0\nDICTIONARY\n5\n19\n330\nC\n",
        "100\nAcDbDictionary\n281\n1\n0\nACDBDICTIONARYWDFLT\n5\nE\n330\nC\n100\nAcDbDictionary\n28"
        "1\n1\n3\nNormal\n",
        "350\nF\n100\nAcDbDictionaryWithDefault\n340\nF\n0\nACDBPLACEHOLDER\n5\nF\n102\n{ACAD_"
        "REACTORS\n330\nE\n102\n}\n",
        "330\nE\n0\nMLINESTYLE\n5\n18\n102\n{ACAD_REACTORS\n330\n17\n102\n}"
        "\n330\n17\n100\nAcDbMlineStyle\n",
        "2\nStandard\n70\n0\n3\n\n62\n256\n51\n90.0\n52\n90.0\n71\n2\n49\n0.5\n",
        "62\n256\n6\nBYLAYER\n49\n-0.5\n62\n256\n6\nBYLAYER\n0\nLAYOUT\n5\n1E\n102\n{ACAD_"
        "REACTORS\n",
        "330\n1A\n102\n}\n330\n1A\n100\nAcDbPlotSettings\n1\n\n2\nnone_device\n4\n\n6\n\n",
        "40\n0.0\n41\n0.0\n42\n0.0\n43\n0.0\n44\n0.0\n45\n0.0\n46\n0.0\n47\n0.0\n",
        "48\n0.0\n49\n0.0\n140\n0.0\n141\n0.0\n142\n1.0\n143\n1.0\n70\n688\n72\n0\n",
        "73\n0\n74\n5\n7\n\n75\n16\n76\n0\n77\n2\n78\n300\n147\n1.0\n",
        "148\n0.0\n149\n0.0\n100\nAcDbLayout\n1\nLayout1\n70\n0\n71\n1\n10\n0.0\n20\n0.0\n",
        "11\n420.0\n21\n297.0\n12\n0.0\n22\n0.0\n32\n0.0\n14\n0.0\n24\n0.0\n34\n0.0\n",
        "15\n0.0\n25\n0.0\n35\n0.0\n146\n0.0\n13\n0.0\n23\n0.0\n33\n0.0\n16\n1.0\n",
        "26\n0.0\n36\n0.0\n17\n0.0\n27\n1.0\n37\n0.0\n76\n0\n330\n1B\n0\nLAYOUT\n",
        "5\n22\n102\n{ACAD_REACTORS\n330\n1A\n102\n}\n330\n1A\n100\nAcDbPlotSettings\n1\n\n2\nnone_"
        "device\n",
        "4\n\n6\n\n40\n0.0\n41\n0.0\n42\n0.0\n43\n0.0\n44\n0.0\n45\n0.0\n",
        "46\n0.0\n47\n0.0\n48\n0.0\n49\n0.0\n140\n0.0\n141\n0.0\n142\n1.0\n143\n1.0\n",
        "70\n1712\n72\n0\n73\n0\n74\n5\n7\n\n75\n16\n76\n0\n77\n2\n",
        "78\n300\n147\n1.0\n148\n0.0\n149\n0.0\n100\nAcDbLayout\n1\nModel\n70\n1\n71\n0\n",
        "10\n0.0\n20\n0.0\n11\n420.0\n21\n297.0\n12\n0.0\n22\n0.0\n32\n0.0\n14\n0.0\n",
        "24\n0.0\n34\n0.0\n15\n0.0\n25\n0.0\n35\n0.0\n146\n0.0\n13\n0.0\n23\n0.0\n",
        "33\n0.0\n16\n1.0\n26\n0.0\n36\n0.0\n17\n0.0\n27\n1.0\n37\n0.0\n76\n0\n",
        "330\n1F\n0\nENDSEC\n0\nEOF\n",
    };
    std::string dxf;
    for (const char* part : kTags)
        dxf += part;
    return dxf;
}

}  // namespace zvdb
