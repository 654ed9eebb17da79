-- ZVListas demo catalogue: the tables of a current catalogue (schema version 2022.0).
-- Portable SQL: runs on SQLite (the embedded default) and on PostgreSQL.
-- Keys are short texts of digits; descriptions come in three languages (BDLANGUAGE).

-- Components, their tree and descriptions, per language
create table BDZV (ZV_KEY varchar(8), ZV_KEY_NOR varchar(6), ZV_KEY_TAG varchar(6),
    ZV_DWG varchar(50), ZV_WIDTH varchar(8), ZV_EXPLODE varchar(1), ZV_LISTA varchar(1),
    ZV_CONSIST varchar(1), ZV_DWG_2D varchar(50), ZV_DWG_3D varchar(50), ZV_ROTA_AT varchar(1),
    ZV_EQUIPO varchar(6), ZV_DWG_UN varchar(50));
create table BDMENUS (MENU_KEY varchar(8), MENU_NIVEL varchar(8), MENU_DESCR varchar(255),
    MENU_KEY_LANG varchar(6));
create table BDUSER (USER_KEY varchar(8), FABRICANTE varchar(40), REFERENCIA varchar(40),
    TENSAO varchar(20), CORRENTE varchar(20), LARGURA_MM varchar(10));
create table BDDIC (DIC_FIELD varchar(40), DIC_PROMPT varchar(80), DIC_ORDEM INTEGER);
create table BDTIPOCOMP (COMP_KEY varchar(6), TIPO_KEY varchar(6));
create table BDVINCL (VL_KEY_A varchar(8), VL_KEY_B varchar(8), VL_QTDE INTEGER,
    VL_USAR_REP varchar(1));
create table BDCTOS (CT_KEY varchar(8), CT_KEY_A varchar(8), CT_KEY_B varchar(8),
    CT_LIGACAO varchar(20));
create table BDPINOS (PINO_KEY varchar(6), PINO_CONECTOR varchar(6), PINO_PINO varchar(6),
    PINO_ID varchar(100));
create table BDCONTRAPECAS (CONTRA_KEY varchar(6), CONTRA_CON_A varchar(6),
    CONTRA_CON_B varchar(6));
create table BDBARRAMENTO (BARRA_KEY varchar(6), ZV_KEY varchar(8), ZV_KEY_NOR varchar(6),
    BARRA_COR varchar(6), BARRA_WIDTH varchar(8), BARRA_LINETYPE varchar(50));
create table BDMATSAP (MATSAP_TIPO varchar(1), MATSAP_ZVKEY varchar(8), MATSAP_MAT varchar(30));
create table BDSAPCFG (SAP_KEY varchar(16), SAP_VAL varchar(200), SAP_USER varchar(200));

-- Representations and their blocks
create table BDREP (REP_KEY varchar(8), REP_DESCR varchar(200));
create table BDBLOCOS (BLK_ZV_KEY varchar(8), BLK_NORMA varchar(8), BLK_REP_KEY varchar(8),
    BLK_BLOCO varchar(200));
create table BDNORMAS (NORM_KEY varchar(6), NORM_DESCR varchar(80));

-- Wires
create table BDWIRE (WIRE_KEY varchar(8), WIRE_NORMA varchar(6), WIRE_COR varchar(6),
    WIRE_WIDTH varchar(8), WIRE_BLOCO varchar(40), WIRE_LTYPE varchar(40), WIRE_TAG varchar(6),
    WIRE_LISTA varchar(1), WIRE_CSIST varchar(1), WIRE_SEG varchar(6));
create table BDWENUS (WENU_KEY varchar(8), WENU_NIVEL varchar(8), WENU_DESCR varchar(255),
    WENU_KEY_LANG varchar(6));
create table BDWUSER (WUSER_KEY varchar(8), FABRICANTE varchar(40), REFERENCIA varchar(40),
    SECAO_MM2 varchar(10), COR varchar(20));
create table BDWDIC (WDIC_FIELD varchar(40), WDIC_PROMP varchar(80), WDIC_ORDEM INTEGER);

-- Cables
create table BDCABO2 (CABO_KEY varchar(6), CABO_NORMA varchar(6), CABO_TIPO varchar(6),
    CABO_TAG varchar(6), CABO_COR varchar(6), CABO_WIDTH varchar(6), CABO_BLOCO varchar(40),
    CABO_LTYPE varchar(40), CABO_LISTA varchar(6));
create table BDCENU (CENU_KEY varchar(6), CENU_NIVEL varchar(6), CENU_DESCR varchar(80),
    CENU_KEY_LANG varchar(6));
create table BDCUSER (CUSER_KEY varchar(6), FABRICANTE varchar(40), REFERENCIA varchar(40),
    VIAS varchar(4), SECAO_MM2 varchar(10), CORES varchar(120), BLINDADO varchar(1));
create table BDCDIC (CDIC_KEY varchar(6), CDIC_FIELD varchar(80), CDIC_PROMPT varchar(80),
    CDIC_WIDTH varchar(80), CDIC_ORDEM INTEGER);

-- Numbering rules
create table BDTAGS (TAG_KEY varchar(6), TAG_DESCR varchar(30), TAG_PREFIX varchar(10),
    TAG_POSFIX varchar(10), TAG_DIGITS varchar(1), TAG_INC varchar(5), TAG_ORDER INTEGER);
create table BDSEGM (SEG_KEY varchar(6), SEG_DESCR varchar(30), SEG_PREFIX varchar(10),
    SEG_POSFIX varchar(10), SEG_DIGITS varchar(1), SEG_INC varchar(5), SEG_ORDER INTEGER);
create table BDEQUIP (EQU_KEY varchar(6), EQU_DESCR varchar(30), EQU_PREFIX varchar(10),
    EQU_POSFIX varchar(10), EQU_DIGITS varchar(1), EQU_INC varchar(5), EQU_ORDER INTEGER);
create table BDNUMBORN (BOR_KEY varchar(6), BOR_DESCR varchar(29), BOR_PREFIX varchar(40),
    BOR_POSFIX varchar(40), BOR_DIGITS varchar(1), BOR_INC varchar(5), BOR_ORDER INTEGER);

-- Page groups and page models
create table BDGROUP (ERASED SMALLINT, GROUP_KEY INTEGER, LANG INTEGER, NAME varchar(200),
    SHORT_NAME varchar(200), NUM_ORDER INTEGER, AUTO_NUM SMALLINT, HIDDEN SMALLINT, PAGE INTEGER,
    PAGECOVER INTEGER, PAGEINDEX INTEGER, TOTAL_TARGET INTEGER, NUM_INIT INTEGER);
create table BDPAGE (ERASED SMALLINT, PAGE_KEY INTEGER, PAGE_TYPE INTEGER, NAME varchar(200),
    DESC_ATT varchar(200), REF_SEQ SMALLINT, COL_LABEL varchar(200), COL_INT varchar(200),
    ROW_LABEL varchar(200), ROW_INT varchar(200));
create table BDPAGEBLOCKS (PAGE_KEY INTEGER, BLOCK INTEGER, PATH varchar(200));
create table BDMODFOLHA (MOD_KEY varchar(6), MOD_TIPO_KEY varchar(6), MOD_DESCR varchar(80),
    MOD_BLOCO varchar(80), MOD_ATRIB varchar(80), MOD_SHEET varchar(20));

-- Administration
create table BDLANGUAGE (LANG_KEY varchar(6), LANG_DESCR varchar(40), LANG_USE varchar(1));
create table BDCFG (CFGKEY varchar(8), CFGVAL varchar(200));
create table BDVERSAO (VERSAO varchar(10));
create table BDACCOUNTS (AC_KEY varchar(6), AC_NOME varchar(60), AC_SENHA varchar(255));
create table BDECLASS (ECLASS_KEY INTEGER PRIMARY KEY, ELECTRICAL_COMP_KEY varchar(50),
    ECLASS_COMP_KEY varchar(50), ECLASS_COMP_TYPE INTEGER, ECLASS_MANUFACTURER varchar(200));
create table BDECLASSDESCRIPTIONS (ECLASS_DESCRIPTION_KEY INTEGER PRIMARY KEY,
    ECLASS_KEY INTEGER, ECLASS_LANG varchar(10), ECLASS_DESCRIPTION varchar(200));
create table BDCONNECTIONS (CONNECTION_KEY INTEGER PRIMARY KEY, ELECTRICAL_KEY varchar(50),
    CONNECTION_INDEX INTEGER, CONNECTION_VALUE varchar(50));
