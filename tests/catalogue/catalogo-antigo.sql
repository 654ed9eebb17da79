-- A catalogue of an old schema: no language columns, no types, no pins, no page groups,
-- narrow drawing columns. The upgrades bring it to the current schema.
create table BDVERSAO (VERSAO varchar(10));
insert into BDVERSAO (VERSAO) values ('2009.1');
create table BDLANGUAGE (LANG_KEY varchar(6), LANG_DESCR varchar(40), LANG_USE varchar(1));
insert into BDLANGUAGE (LANG_KEY, LANG_DESCR, LANG_USE) values
  ('1', 'Português', '0'), ('2', 'English', '1'), ('3', 'Español', '1');
create table BDZV (ZV_KEY varchar(8), ZV_KEY_NOR varchar(6), ZV_KEY_TAG varchar(6),
  ZV_DWG varchar(20), ZV_WIDTH varchar(8), ZV_EXPLODE varchar(1), ZV_LISTA varchar(1),
  ZV_CONSIST varchar(1), ZV_DWG_2D varchar(20), ZV_DWG_3D varchar(20), ZV_ROTA_AT varchar(1),
  ZV_EQUIPO varchar(6), ZV_DWG_UN varchar(20));
insert into BDZV (ZV_KEY, ZV_KEY_NOR, ZV_DWG, ZV_LISTA) values ('7001', '1', 'FONTE_CC', 'S');
create table BDMENUS (MENU_KEY varchar(8), MENU_NIVEL varchar(8), MENU_DESCR varchar(80));
insert into BDMENUS (MENU_KEY, MENU_NIVEL, MENU_DESCR) values
  ('7001', '17', 'Switch-mode power supply 24 V DC 5 A');
create table BDWENUS (WENU_KEY varchar(8), WENU_NIVEL varchar(8), WENU_DESCR varchar(80));
insert into BDWENUS (WENU_KEY, WENU_NIVEL, WENU_DESCR) values
  ('10008', '101', 'Flexible wire 2.5 mm² black');
create table BDWIRE (WIRE_KEY varchar(8), WIRE_NORMA varchar(6), WIRE_COR varchar(6),
  WIRE_WIDTH varchar(8), WIRE_BLOCO varchar(40), WIRE_LTYPE varchar(40), WIRE_TAG varchar(6),
  WIRE_LISTA varchar(1), WIRE_CSIST varchar(1));
insert into BDWIRE (WIRE_KEY, WIRE_NORMA, WIRE_LISTA) values ('10008', '1', 'S');
create table BDUSER (USER_KEY varchar(8), FABRICANTE varchar(40));
insert into BDUSER (USER_KEY, FABRICANTE) values ('7001', 'Fontex');
create table BDWUSER (WUSER_KEY varchar(8), FABRICANTE varchar(40));
create table BDDIC (DIC_FIELD varchar(40), DIC_PROMPT varchar(80));
insert into BDDIC (DIC_FIELD, DIC_PROMPT) values ('FABRICANTE', 'Manufacturer');
create table BDWDIC (WDIC_FIELD varchar(40), WDIC_PROMP varchar(80));
create table BDVINCL (VL_KEY_A varchar(8), VL_KEY_B varchar(8), VL_QTDE INTEGER);
insert into BDVINCL (VL_KEY_A, VL_KEY_B, VL_QTDE) values ('7001', '1105', 2);
create table BDMATSAP (MATSAP_TIPO varchar(1), MATSAP_ZVKEY varchar(8), MATSAP_MAT varchar(30));
create table BDTAGS (TAG_KEY varchar(6), TAG_DESCR varchar(30), TAG_PREFIX varchar(10),
  TAG_POSFIX varchar(10), TAG_DIGITS varchar(1), TAG_INC varchar(5));
create table BDSEGM (SEG_KEY varchar(6), SEG_DESCR varchar(30), SEG_PREFIX varchar(10),
  SEG_POSFIX varchar(10), SEG_DIGITS varchar(1), SEG_INC varchar(5));
create table BDACCOUNTS (AC_KEY varchar(6), AC_NOME varchar(60), AC_SENHA varchar(20));
create table BDSAPCFG (SAP_KEY varchar(16), SAP_VAL varchar(200));
