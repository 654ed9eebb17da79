-- The data of some other program: no table of a catalogue.
create table clientes (id integer, nome varchar(40));
insert into clientes (id, nome) values (1, 'ACME'), (2, 'Bornax');
